// Threads that race to use the register first. The only case of its own
// executable, so that the register does not exist before the race.
#include <gtest/gtest.h>

#include <atomic>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "options/registry.h"
#include "qkcore/qk_options.h"
#include "support/log_capture.h"

namespace {

TEST(OptionRegisterFirstUse, RacingThreadsShareOneRegisterAndDrawDistinctKeys) {
    constexpr int kThreads = 8, kKeysPerThread = 2000;
    static std::string names[kThreads];
    static QKOption_t options[kThreads];
    qktest::LogCapture log;   // installed before the threads start
    std::mutex registration;  // clients serialise registrations; first use needs no lock
    std::atomic<int> starting{kThreads}, looking_up{kThreads};
    const qk::options::Register* seen[kThreads] = {};
    std::set<int32_t> keys[kThreads];
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        names[t] = "option" + std::to_string(t);
        options[t] = {0, names[t].c_str(), QK_OPTION_INTEGER, 0, 0, nullptr};
        threads.emplace_back([&, t] {
            for (starting.fetch_sub(1); starting.load() > 0;) std::this_thread::yield();
            QKOption_FindById(t + 1);  // a lookup is a first use too
            seen[t] = &qk::options::option_register();
            for (int k = 0; k < kKeysPerThread; ++k) keys[t].insert(qk::options::draw_key());
            // Lookups must not overlap registrations.
            for (looking_up.fetch_sub(1); looking_up.load() > 0;) std::this_thread::yield();
            std::lock_guard<std::mutex> lock(registration);
            QKOption_RegisterNew(&options[t]);
        });
    }
    for (std::thread& thread : threads) thread.join();

    std::set<int32_t> all;
    for (int t = 0; t < kThreads; ++t) {
        EXPECT_EQ(seen[t], seen[0]);
        EXPECT_EQ(QKOption_FindByName(names[t].c_str()), &options[t]);
        all.insert(keys[t].begin(), keys[t].end());
        all.insert(options[t].key);
    }
    // Every key handed out once, none skipped, starting one above the counter.
    const int drawn = kThreads * (kKeysPerThread + 1);
    EXPECT_EQ(all.size(), size_t(drawn));
    EXPECT_EQ(*all.begin(), 0x13370001);
    EXPECT_EQ(*all.rbegin(), 0x13370000 + drawn);
    EXPECT_EQ(qk::options::option_register().size(), size_t(kThreads));
    EXPECT_TRUE(qktest::HasNoErrors(log));
}

}  // namespace
