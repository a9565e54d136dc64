#include "utils/sdk_s.h"

#include <gmock/gmock.h>
#include <pthread.h>

#include <thread>

#include "support/sim_root.h"

namespace vornwireless::sdk_s {
namespace {

using ::testing::HasSubstr;

using SdkSTest = vorn::test::RootTest;

TEST_F(SdkSTest, PassesResultsThroughAndCallsFromTwoThreadsDoNotOverlap) {
    EXPECT_EQ(QLIBCExec_S("/bin/false", nullptr, nullptr, nullptr, nullptr), -1);
    std::thread other(
        [] { EXPECT_EQ(QLIBCExec_S("/bin/sleep", "0.2", nullptr, nullptr, nullptr), 0); });
    QLIBCExec_S("/bin/sleep", "0.2", nullptr, nullptr, nullptr);
    other.join();
    const auto lines = log_.Matching(" func (QLIBCExec) ");
    ASSERT_EQ(lines.size(), 6u);
    EXPECT_THAT(lines[0],
                HasSubstr("thread (" + std::to_string(static_cast<unsigned long>(pthread_self())) +
                          ") func (QLIBCExec) start"));
    for (size_t i = 0; i < lines.size(); ++i) {
        EXPECT_NE(lines[i].find(i % 2 == 0 ? ") start" : ") end"), std::string::npos) << lines[i];
    }
}

}  // namespace
}  // namespace vornwireless::sdk_s
