// The main window's handle and the frame mode of each thread.
#include <SHM/shm.h>

#include <atomic>

namespace {

constinit std::atomic<void*> main_window{nullptr};  // set by the host's main thread
constinit thread_local int frame_modes = 0;         // open pairs of the calling thread

}  // namespace

void* SHM_GetMainWindow() { return main_window.load(std::memory_order_acquire); }
void SHM_SetMainWindow(void* window) { main_window.store(window, std::memory_order_release); }

void SHM_BeginGdiMinimalisticWindowCreationMode() { ++frame_modes; }
void SHM_EndGdiMinimalisticWindowCreationMode() {
  if (frame_modes > 0) --frame_modes;
}
bool SHM_InGdiMinimalisticWindowCreationMode() { return frame_modes > 0; }
