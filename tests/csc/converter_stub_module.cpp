// A stand-in "libqkcore_csc.so" for the tests: refuses one pair, reports the
// status the test chose, and counts its calls.
#include <string.h>

#include <type_traits>

#include "csc/converter_stub.h"
#include "qkcore/qk_converter.h"

namespace {

struct Context {
    int32_t params[4];  // width, height, source code, destination code
};

int converts = 0;
int releases = 0;

}  // namespace

extern "C" {

void* qk_csc_init(int32_t width, int32_t height, uint32_t srcFormat, uint32_t dstFormat) {
    if (srcFormat == converter_stub::kRefusedSrc && dstFormat == converter_stub::kRefusedDst) return nullptr;
    return new Context{{width, height, static_cast<int32_t>(srcFormat), static_cast<int32_t>(dstFormat)}};
}

int32_t qk_csc_convert(void* context, const QKImage* src, QKImage* dst) {
    ++converts;
    int32_t status;
    memcpy(&status, src->data, sizeof(status));
    memcpy(dst->data, static_cast<Context*>(context)->params, converter_stub::kParamsBytes);
    return status;
}

void qk_csc_release(void* context) {
    ++releases;
    delete static_cast<Context*>(context);  // a missed release shows as a leak
}

int qk_csc_stub_converts() { return converts; }
int qk_csc_stub_releases() { return releases; }

}  // extern "C"

// The library looks the entry points up by name: keep the types honest.
static_assert(std::is_same_v<decltype(&qk_csc_init), QKCscInitFn>);
static_assert(std::is_same_v<decltype(&qk_csc_convert), QKCscConvertFn>);
static_assert(std::is_same_v<decltype(&qk_csc_release), QKCscReleaseFn>);
