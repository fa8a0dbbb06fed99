// The process-wide options register: pairs of a key and the address of a
// caller's record, in ascending signed key order.
#ifndef QKCORE_SRC_OPTIONS_REGISTRY_H
#define QKCORE_SRC_OPTIONS_REGISTRY_H

#include <stdint.h>

#include "platform/sorted_vector.h"
#include "qkcore/qk_options.h"

namespace qk::options {

using Register = platform::SortedVector<int32_t, const QKOption_t*>;

// The register, created empty by the first caller from whichever thread.
const Register& option_register();

// A new key from the process-wide counter: 0x13370001 first, then one more
// each time. Safe to call from several threads at once.
int32_t draw_key();

}  // namespace qk::options

#endif  // QKCORE_SRC_OPTIONS_REGISTRY_H
