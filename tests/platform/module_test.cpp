#include <gtest/gtest.h>

#include <utility>

#include "platform/module.h"

namespace {

using qk::platform::Module;

TEST(Module, MissingLibraryGivesAnEmptyModule) {
    Module module = Module::open("libqk_no_such_module.so");
    EXPECT_FALSE(module);
    EXPECT_EQ(module.symbol("anything"), nullptr);
}

TEST(Module, LooksUpFunctionsAndHandsOwnershipOn) {
    Module module = Module::open("libm.so.6");
    ASSERT_TRUE(module);
    auto cosine = module.function<double (*)(double)>("cos");
    ASSERT_NE(cosine, nullptr);
    EXPECT_EQ(cosine(0.0), 1.0);
    EXPECT_EQ(module.symbol("qk_no_such_symbol"), nullptr);

    Module moved = std::move(module);
    EXPECT_FALSE(module);
    EXPECT_TRUE(moved);

    void* handle = moved.release();
    EXPECT_FALSE(moved);
    Module adopted = Module::adopt(handle);
    EXPECT_NE(adopted.symbol("cos"), nullptr);
    adopted.close();
    EXPECT_FALSE(adopted);
}

}  // namespace
