#include <gtest/gtest.h>
#include <string.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "qkcore/qk_utils.h"

namespace {

// Random keys, many equal, each with a 256-byte name buffer holding
// "<key>_<first place>" and 0x7f bytes after it; a random range is sorted.
TEST(Sort, OrdersTheRangeDescendingAndMovesNamesByContent) {
    std::mt19937 random(7);
    for (int round = 0; round < 50; ++round) {
        const size_t count = 1 + random() % 300;
        std::vector<int32_t> keys(count);
        std::vector<std::vector<char>> buffers(count, std::vector<char>(256, '\x7f'));
        std::vector<std::string> original(count), now(count);
        std::vector<char*> names(count);
        for (size_t i = 0; i < count; ++i) {
            keys[i] = static_cast<int32_t>(random() % 40) - 20;
            original[i] = std::to_string(keys[i]) + "_" + std::to_string(i);
            names[i] = strcpy(buffers[i].data(), original[i].c_str());
        }
        const std::vector<char*> pointers = names;
        const size_t first = random() % count, last = first + random() % (count - first);
        sort(keys.data(), names.data(), int32_t(first), int32_t(last));

        EXPECT_TRUE(std::is_sorted(keys.begin() + first, keys.begin() + last + 1, std::greater<>()));
        EXPECT_EQ(names, pointers);  // names move by content only
        for (size_t i = 0; i < count; ++i) {
            now[i] = buffers[i].data();
            // Each name sits with its own key; outside the range nothing moved;
            // a moved name is written over the whole buffer, zero-filled.
            EXPECT_EQ(now[i].substr(0, now[i].find('_')), std::to_string(keys[i]));
            EXPECT_TRUE((i >= first && i <= last) || now[i] == original[i]) << now[i] << " left the range";
            const long zeros = std::count(buffers[i].begin(), buffers[i].end(), 0);
            EXPECT_TRUE(now[i] == original[i] || zeros == 256 - long(now[i].size())) << now[i];
        }
        std::sort(now.begin(), now.end());
        std::sort(original.begin(), original.end());
        EXPECT_EQ(now, original);  // no name lost or doubled
    }
    // Empty and single ranges touch nothing, not even the names.
    int32_t keys[] = {5, 1, 7};
    sort(keys, nullptr, 1, 1);
    sort(keys, nullptr, 2, 0);
    EXPECT_EQ(std::vector<int32_t>(keys, keys + 3), (std::vector<int32_t>{5, 1, 7}));
}

TEST(Swap, ExchangesKeysAndWholeNameBuffers) {
    int32_t a = 1, b = 2;
    char name_a[256], name_b[256];
    memset(name_a, 'x', sizeof(name_a));
    memset(name_b, 'y', sizeof(name_b));
    strcpy(name_a, "first");
    strcpy(name_b, "second");
    swap(&a, &b, name_a, name_b);
    EXPECT_EQ(a * 10 + b, 21);
    EXPECT_STREQ(name_a, "second");
    EXPECT_STREQ(name_b, "first");
    EXPECT_EQ(name_a[255] | name_b[255], 0);  // the bounded copies zero-fill the rest
    swap(&a, &a, name_a, name_a);             // one element with itself
    EXPECT_STREQ(name_a, "second");
}

}  // namespace
