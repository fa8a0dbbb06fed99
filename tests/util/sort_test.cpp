#include <gtest/gtest.h>
#include <string.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "qkcore/qk_utils.h"

namespace {

// Keys with 256-byte name buffers, as sort expects them.
struct Table {
    explicit Table(const std::vector<int32_t>& initial) : keys(initial), buffers(initial.size()) {
        for (size_t i = 0; i < keys.size(); ++i) {
            buffers[i].assign(256, '\x7f');  // sort must rewrite all 256 bytes of moved names
            std::string name = "n" + std::to_string(keys[i]) + "_" + std::to_string(i);
            memcpy(buffers[i].data(), name.c_str(), name.size() + 1);
            names.push_back(buffers[i].data());
        }
    }
    std::string name(size_t i) const { return names[i]; }
    std::vector<int32_t> keys;
    std::vector<std::vector<char>> buffers;
    std::vector<char*> names;
};

TEST(Sort, OrdersKeysDescendingAndCarriesNames) {
    Table table({3, 9, 1});
    std::vector<char*> pointers = table.names;
    table.names[0][0] = 'a', table.names[0][1] = 0;
    table.names[1][0] = 'b', table.names[1][1] = 0;
    table.names[2][0] = 'c', table.names[2][1] = 0;
    sort(table.keys.data(), table.names.data(), 0, 2);
    EXPECT_EQ(table.keys, (std::vector<int32_t>{9, 3, 1}));
    EXPECT_EQ(table.name(0), "b");
    EXPECT_EQ(table.name(1), "a");
    EXPECT_EQ(table.name(2), "c");
    EXPECT_EQ(table.names, pointers);  // names move by content only
}

TEST(Sort, EmptyAndSingleRangesChangeNothing) {
    Table table({5, 1, 7});
    sort(table.keys.data(), table.names.data(), 1, 1);
    sort(table.keys.data(), table.names.data(), 2, 0);
    EXPECT_EQ(table.keys, (std::vector<int32_t>{5, 1, 7}));
}

TEST(Sort, SortsOnlyTheGivenRangeAndKeepsEveryPair) {
    std::mt19937 random(7);
    for (int round = 0; round < 50; ++round) {
        std::vector<int32_t> keys(1 + random() % 300);
        for (int32_t& key : keys) key = static_cast<int32_t>(random() % 40) - 20;  // many equal keys
        Table table(keys);
        int32_t first = static_cast<int32_t>(random() % keys.size());
        int32_t last = static_cast<int32_t>(first + random() % (keys.size() - first));
        sort(table.keys.data(), table.names.data(), first, last);

        EXPECT_TRUE(std::is_sorted(table.keys.begin() + first, table.keys.begin() + last + 1, std::greater<>()));
        for (size_t i = 0; i < keys.size(); ++i) {
            // Each name still sits with its own key, and outside the range nothing moved.
            EXPECT_EQ(table.name(i).substr(0, table.name(i).find('_')), "n" + std::to_string(table.keys[i]));
            if (static_cast<int32_t>(i) < first || static_cast<int32_t>(i) > last) {
                EXPECT_EQ(table.name(i), "n" + std::to_string(keys[i]) + "_" + std::to_string(i));
            }
            // Moved names were rewritten over their whole buffer.
            EXPECT_TRUE(table.buffers[i][255] == 0 || table.buffers[i][255] == '\x7f');
        }
    }
}

TEST(Swap, ExchangesKeysAndWholeNameBuffers) {
    int32_t a = 1, b = 2;
    char name_a[256], name_b[256];
    memset(name_a, 'x', sizeof(name_a));
    memset(name_b, 'y', sizeof(name_b));
    strcpy(name_a, "first");
    strcpy(name_b, "second");
    swap(&a, &b, name_a, name_b);
    EXPECT_EQ(a, 2);
    EXPECT_EQ(b, 1);
    EXPECT_STREQ(name_a, "second");
    EXPECT_STREQ(name_b, "first");
    // The bounded copies zero-fill the rest of each buffer.
    EXPECT_EQ(name_a[255], 0);
    EXPECT_EQ(name_b[255], 0);

    swap(&a, &a, name_a, name_a);  // one element with itself
    EXPECT_STREQ(name_a, "second");
}

}  // namespace
