// Counts and the status word that the library keeps for hosts and debuggers; nothing in it reads them.
#include <ZR/world.h>

constinit i32 ZR_G_LiveWorlds = 0;
constinit i32 ZR_G_LiveChunks = 0;
constinit i32 ZR_G_LastWorldStatus = 0;
