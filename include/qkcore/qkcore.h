// Everything qkcore exports.
#ifndef QKCORE_QKCORE_H
#define QKCORE_QKCORE_H

#include "qk_common.h"
#include "qk_converter.h"
#include "qk_image.h"
#include "qk_log.h"
#include "qk_options.h"
#include "qk_utils.h"

#endif  // QKCORE_QKCORE_H
