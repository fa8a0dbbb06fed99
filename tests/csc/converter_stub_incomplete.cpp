// A stand-in "libqkcore_csc.so" that lacks qk_csc_release: the library must
// give up on it before calling anything.
#include <stdlib.h>

#include "qkcore/qk_converter.h"

extern "C" {

void* qk_csc_init(int32_t, int32_t, uint32_t, uint32_t) { abort(); }

int32_t qk_csc_convert(void*, const QKImage*, QKImage*) { abort(); }

}  // extern "C"
