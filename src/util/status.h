// Failure reports: the one level-4 line a failing operation writes where it
// detects the failure, naming the status and the source place.
#ifndef QKCORE_SRC_UTIL_STATUS_H
#define QKCORE_SRC_UTIL_STATUS_H

#include <stdint.h>

#include "qkcore/qk_common.h"

namespace qk {

// Writes "<name> (<value>): <file>:<line>" at level 4, the name as in
// "QK_ERROR_INVALID_SIZE" ("QK_ERROR_UNKNOWN" for values that are not status
// codes), and returns status.
int32_t report_failure(int32_t status, const char* file, int line);

}  // namespace qk

// Reports a failure detected here and yields its status: `return QK_FAIL(x);`
#define QK_FAIL(status) ::qk::report_failure((status), __FILE__, __LINE__)

#endif  // QKCORE_SRC_UTIL_STATUS_H
