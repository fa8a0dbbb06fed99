// Converters: client access to the optional external conversion module, and
// the vendor colour-conversion fast path.
#ifndef QKCORE_QK_CONVERTER_H
#define QKCORE_QK_CONVERTER_H

#include "qk_image.h"

#endif  // QKCORE_QK_CONVERTER_H
