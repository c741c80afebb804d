/* A module file with three routines, for the tests of the scan. */
#include <ZR/module.h>

static i32 entry(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  (void)out, (void)block, (void)out2;
  return command + 40;
}
static const u32 version = 2;
static const ZR_ModuleProperty properties[] = {{0x61626364u, 2, "xy"}, {ZR_ModuleProp_Version, 4, &version}};
static const ZR_ModuleRoutine routines[] = {
    {"first", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 2, properties, entry},
    {"other kind", 0x6f746872u, 0, 0, NULL, entry},
    {NULL, ZR_ModuleKind, 0, 3, NULL, NULL},
};
ZR_API const ZR_ModuleDescriptor ZR_Module = {ZR_ModuleDescriptorVersion, 3, routines};
