// Row kernels for x86-64 with AVX2. This file alone is compiled with
// -mavx2, and its kernels run only after supported_row_sets() has seen the
// CPU support it. So nothing here may be an inline function that baseline
// code could share (the linker might keep this file's copy): kernels live in
// an anonymous namespace and reach shared code through out-of-line calls.
#include <immintrin.h>

#include "convert/row.h"

namespace qk {
namespace {

}  // namespace

const RowKernelSet kAvx2Rows = {"avx2", nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr};

}  // namespace qk
