/* A module file of a later descriptor version, which must be refused unread. */
#include <ZR/module.h>

ZR_API const ZR_ModuleDescriptor ZR_Module = {ZR_ModuleDescriptorVersion + 1, 1, (const ZR_ModuleRoutine*)16};
