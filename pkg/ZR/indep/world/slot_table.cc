// The table of replaceable routines: constant-initialised to null, filled by birth.
#include <ZR/slots.h>

extern "C" {
constinit ZR_SlotFunc ZRp_G_OverFuncs[ZR_SlotCount] = {};
}
