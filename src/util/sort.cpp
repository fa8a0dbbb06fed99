#include <stdint.h>
#include <string.h>

#include "qkcore/qk_utils.h"

namespace {

constexpr size_t kNameBytes = 256;

// Copies up to the terminator and zero-fills the rest of the buffer: every
// name buffer is written over its full 256 bytes.
void copy_name(char* to, const char* from) {
    size_t length = strnlen(from, kNameBytes);
    memmove(to, from, length);
    memset(to + length, 0, kNameBytes - length);
}

}  // namespace

void swap(int32_t* key_a, int32_t* key_b, char* name_a, char* name_b) {
    int32_t key = *key_a;
    *key_a = *key_b;
    *key_b = key;
    if (name_a == name_b) return;  // one buffer: its content is already in place
    char held[kNameBytes];
    copy_name(held, name_a);
    held[kNameBytes - 1] = '\0';
    copy_name(name_a, name_b);
    copy_name(name_b, held);
}

// Quicksort with Hoare partitioning, largest key first. The two parts of a
// partition are disjoint, so the order in which they are sorted does not
// change the result: recursing into the smaller one bounds the stack depth.
void sort(int32_t* keys, char** names, int32_t first, int32_t last) {
    while (first < last) {
        const int32_t pivot = keys[(static_cast<int64_t>(first) + last) / 2];
        int32_t left = first - 1;
        int32_t right = last + 1;
        for (;;) {
            do ++left; while (keys[left] > pivot);
            do --right; while (keys[right] < pivot);
            if (left >= right) break;
            swap(&keys[left], &keys[right], names[left], names[right]);
        }
        // Parts: [first, left - 1] and [right + 1, last].
        if (left - 1 - first < last - (right + 1)) {
            sort(keys, names, first, left - 1);
            first = right + 1;
        } else {
            sort(keys, names, right + 1, last);
            last = left - 1;
        }
    }
}
