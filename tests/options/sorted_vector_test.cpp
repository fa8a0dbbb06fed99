#include <gtest/gtest.h>
#include <limits.h>

#include <vector>

#include "platform/sorted_vector.h"

namespace {

using Vector = qk::platform::SortedVector<int32_t, const char*>;

std::vector<int32_t> keys(const Vector& vector) {
    std::vector<int32_t> result;
    for (size_t i = 0; i < vector.size(); ++i) result.push_back(vector.itemAt(i).key);
    return result;
}

TEST(SortedVector, KeepsAscendingSignedKeysAndReplacesEqualOnes) {
    Vector vector;
    EXPECT_EQ(vector.indexOf(0), -1);
    for (int32_t key : {5, -3, INT32_MAX, INT32_MIN, 0}) vector.add(key, "first");
    EXPECT_EQ(keys(vector), (std::vector<int32_t>{INT32_MIN, -3, 0, 5, INT32_MAX}));
    EXPECT_EQ(vector.indexOf(INT32_MIN), 0);
    EXPECT_EQ(vector.indexOf(5), 3);
    EXPECT_EQ(vector.indexOf(4), -1);
    EXPECT_EQ(vector.indexOf(6), -1);

    EXPECT_EQ(vector.add(1, "new"), 3u);
    EXPECT_EQ(vector.add(-3, "second"), 1u);
    EXPECT_EQ(vector.size(), 6u);
    EXPECT_STREQ(vector.itemAt(1).value, "second");
    EXPECT_STREQ(vector.itemAt(3).value, "new");
}

}  // namespace
