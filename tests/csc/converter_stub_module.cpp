// A stand-in "libqkcore_csc.so" for the tests: refuses one pair, reports the
// status the test chose, and counts its calls. Built with
// QK_STUB_INCOMPLETE it lacks qk_csc_release, and the library must give up on
// it before calling anything.
#include <string.h>

#include <type_traits>

#include "csc/converter_stub.h"
#include "qkcore/qk_converter.h"

namespace {

int converts = 0;
int releases = 0;

}  // namespace

extern "C" {

// The context holds width, height, source code and destination code.
void* qk_csc_init(int32_t width, int32_t height, uint32_t srcFormat, uint32_t dstFormat) {
    if (srcFormat == converter_stub::kRefusedSrc && dstFormat == converter_stub::kRefusedDst) return nullptr;
    return new int32_t[4]{width, height, static_cast<int32_t>(srcFormat), static_cast<int32_t>(dstFormat)};
}

int32_t qk_csc_convert(void* context, const QKImage* src, QKImage* dst) {
    ++converts;
    int32_t status;
    memcpy(&status, src->data, sizeof(status));
    memcpy(dst->data, context, converter_stub::kParamsBytes);
    return status;
}

#ifndef QK_STUB_INCOMPLETE
void qk_csc_release(void* context) {
    ++releases;
    delete[] static_cast<int32_t*>(context);  // a missed release shows as a leak
}
static_assert(std::is_same_v<decltype(&qk_csc_release), QKCscReleaseFn>);
#endif

int qk_csc_stub_converts() { return converts; }
int qk_csc_stub_releases() { return releases; }

}  // extern "C"

// The library looks the entry points up by name: keep the types honest.
static_assert(std::is_same_v<decltype(&qk_csc_init), QKCscInitFn>);
static_assert(std::is_same_v<decltype(&qk_csc_convert), QKCscConvertFn>);
