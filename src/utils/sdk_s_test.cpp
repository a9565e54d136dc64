#include "utils/sdk_s.h"

#include <gtest/gtest.h>
#include <pthread.h>

#include <thread>

#include "support/sim_root.h"

namespace vornwireless {
namespace sdk_s {
namespace {

using SdkSTest = vorn::test::RootTest;

TEST_F(SdkSTest, PassesResultsThroughAndLogsEachCall) {
    EXPECT_EQ(QLIBCExec_S("/bin/true", nullptr, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(QLIBCExec_S("/bin/false", nullptr, nullptr, nullptr, nullptr), -1);
    const std::string prefix = "thread (" +
                               std::to_string(static_cast<unsigned long>(pthread_self())) +
                               ") func (QLIBCExec) ";
    const auto lines = log_.Matching(" thread (");
    ASSERT_EQ(lines.size(), 4u);
    EXPECT_NE(lines[0].find(prefix + "start"), std::string::npos);
    EXPECT_NE(lines[1].find(prefix + "end"), std::string::npos);
}

TEST_F(SdkSTest, CallsFromTwoThreadsDoNotOverlap) {
    auto sleepBriefly = [] { QLIBCExec_S("/bin/sleep", "0.2", nullptr, nullptr, nullptr); };
    std::thread other(sleepBriefly);
    sleepBriefly();
    other.join();
    const auto lines = log_.Matching(" func (QLIBCExec) ");
    ASSERT_EQ(lines.size(), 4u);
    for (size_t i = 0; i < lines.size(); ++i) {
        const char* stage = i % 2 == 0 ? ") start" : ") end";
        EXPECT_NE(lines[i].find(stage), std::string::npos) << lines[i];
    }
}

}  // namespace
}  // namespace sdk_s
}  // namespace vornwireless
