/* A shared object that is no module. */
#include <ZR/zr.h>

ZR_API i32 zr_test_stranger(void) { return 1; }
