// Options: a process-wide registry of named, typed options, value checks and
// readers for "name=value,..." option strings.
#ifndef QKCORE_QK_OPTIONS_H
#define QKCORE_QK_OPTIONS_H

#include "qk_common.h"

#endif  // QKCORE_QK_OPTIONS_H
