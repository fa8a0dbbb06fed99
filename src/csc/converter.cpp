// Converters around the optional module "libqkcore_csc.so". The library only
// loads the module, keeps its context and forwards calls; the conversion
// itself happens inside the module.
#include <atomic>
#include <new>

#include "platform/module.h"
#include "qkcore/qk_converter.h"
#include "util/log.h"
#include "util/status.h"

struct QKConverter {
    qk::platform::Module module;  // one reference per handle: handles are independent
    QKCscInitFn init = nullptr;
    QKCscReleaseFn release = nullptr;
    QKCscConvertFn convert = nullptr;
    void* context = nullptr;      // never null in a handle given to a client
};

namespace {

// Set for good once the module turned out to be missing or incomplete, so
// later calls give up at once. Relaxed: racing first calls may both try the
// module, which is harmless.
std::atomic<bool> module_unavailable{false};

}  // namespace

QKConverter* QKConverter_create(int32_t width, int32_t height, uint32_t src_format, uint32_t dst_format) {
    QK_LOG(QK_LOG_DEBUG, "%s: %dx%d %4.4s --> %4.4s", "QKConverter_create", width, height,
           QK_FOURCC_STR(src_format), QK_FOURCC_STR(dst_format));
    if (module_unavailable.load(std::memory_order_relaxed)) return nullptr;

    QKConverter* converter = new (std::nothrow) QKConverter;
    if (converter == nullptr) return nullptr;

    converter->module = qk::platform::Module::open("libqkcore_csc.so");
    if (!converter->module) {
        QK_LOG(QK_LOG_ERROR, "QKConverter: Could not open the dynamic library for CSC.");
        module_unavailable.store(true, std::memory_order_relaxed);
        delete converter;
        return nullptr;
    }

    converter->init = converter->module.function<QKCscInitFn>("qk_csc_init");
    converter->release = converter->module.function<QKCscReleaseFn>("qk_csc_release");
    converter->convert = converter->module.function<QKCscConvertFn>("qk_csc_convert");
    if (converter->init == nullptr || converter->convert == nullptr || converter->release == nullptr) {
        QK_LOG(QK_LOG_ERROR, "QKConverter: Could not find some symbols for CSC.");
        module_unavailable.store(true, std::memory_order_relaxed);
        delete converter;  // closes the module
        return nullptr;
    }

    QK_LOG(QK_LOG_DEBUG, "QKConverter: Calling qk_csc_init: %dx%d %4.4s --> %4.4s", width, height,
           QK_FOURCC_STR(src_format), QK_FOURCC_STR(dst_format));
    converter->context = converter->init(width, height, src_format, dst_format);
    if (converter->context == nullptr) {
        // Only this conversion is refused: a later call tries the module again.
        QK_LOG(QK_LOG_ERROR, "QKConverter: Could not create this converter.");
        delete converter;
        return nullptr;
    }
    return converter;
}

int32_t QKConverter_convert(QKConverter* converter, const QKImage* src, QKImage* dst) {
    if (converter == nullptr || src == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr) {
        return QK_FAIL(QK_ERROR_NULL_PARAM);
    }
    return converter->convert(converter->context, src, dst);
}

void QKConverter_release(QKConverter* converter) {
    if (converter == nullptr) return;
    converter->release(converter->context);
    delete converter;  // closes the module after the module's own release
}
