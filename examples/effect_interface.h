/* What minimal_host.c and the effects that it loads agree on: an effect is a shared object that exports one
 * function. Everything it calls comes through the arguments; it links with nothing of the library. */
#ifndef EFFECT_INTERFACE_H
#define EFFECT_INTERFACE_H

#include <ZR/suites.h>

/* block: of ZR_GetCallbackBlock, straight alpha. src and dst: 8-bit worlds of one size, of the host, which keeps them.
 * Returns 0, or what stopped it: 517 when the host's progress function said so. */
typedef i32 (*EffectFunc)(ZR_InData* in_data, void* const* block, const ZR_BasicSuite* basic, ZR_LayerDef* src,
                          ZR_LayerDef* dst);
#define EFFECT_SYMBOL "render_effect"

#endif
