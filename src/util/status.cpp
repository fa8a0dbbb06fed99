#include "util/status.h"

#include "util/log.h"

namespace qk {
namespace {

// "QK_ERROR_NULL_PARAM" and so on; "QK_OK" for 0, "QK_ERROR_UNKNOWN" for
// values that are not status codes.
const char* status_name(int32_t status) {
    switch (status) {
        case QK_OK: return "QK_OK";
        case QK_ERROR_NULL_PARAM: return "QK_ERROR_NULL_PARAM";
        case QK_ERROR_INVALID_PARAM: return "QK_ERROR_INVALID_PARAM";
        case QK_ERROR_INVALID_SIZE: return "QK_ERROR_INVALID_SIZE";
        case QK_ERROR_ALLOC_FAILED: return "QK_ERROR_ALLOC_FAILED";
        case QK_ERROR_UNSUPPORTED: return "QK_ERROR_UNSUPPORTED";
        case QK_ERROR_IO_FAILED: return "QK_ERROR_IO_FAILED";
        case QK_ERROR_CODEC_FAILED: return "QK_ERROR_CODEC_FAILED";
        case QK_ERROR_NOT_IMPLEMENTED: return "QK_ERROR_NOT_IMPLEMENTED";
        default: return "QK_ERROR_UNKNOWN";
    }
}

}  // namespace

int32_t report_failure(int32_t status, const char* file, int line) {
    QK_LOG(QK_LOG_ERROR, "%s (%d): %s:%d", status_name(status), status, file, line);
    return status;
}

}  // namespace qk
