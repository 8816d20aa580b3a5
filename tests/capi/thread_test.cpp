// The C API from several threads: sessions of their own in parallel, one
// session shared under the session lock, and a session closed while other
// threads are calling it (each call either completes or finds the session
// invalid; none reaches a half-closed object).
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "capi_fixture.h"

namespace qn::test {
namespace {

constexpr int kThreads = 4;
[[maybe_unused]] const int kStoreAway =
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);

TEST(CApiThreads, SessionsOfTheirOwnKeepTheirValuesAndErrorRecords) {
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([t] {
            const ViSession vi = SimulatedSession("QDS2014A");
            const ViReal64 mine = 1.0 + t * 0.25;
            for (int i = 0; i < 20; ++i) {
                EXPECT_EQ(Qn731XX_SetAttributeViReal64(vi, "Channel1", IVISCOPE_ATTR_VERTICAL_RANGE, mine), 0);
                ViReal64 back = 0;
                EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi, "Channel1", IVISCOPE_ATTR_VERTICAL_RANGE, &back), 0);
                EXPECT_EQ(back, mine);
                char name[32];
                EXPECT_EQ(Qn731XX_GetChannelName(vi, 100 + t, sizeof name, name), IVI_ERROR_INVALID_VALUE);
                EXPECT_NE(RecordedError(vi).find(std::to_string(100 + t)), std::string::npos);
            }
            EXPECT_EQ(Qn731XX_close(vi), VI_SUCCESS);
        });
    }
    for (std::thread& th : threads) th.join();
}

TEST(CApiThreads, ASharedSessionLockedByEachThreadSeesItsOwnWrites) {
    const ViSession vi = SimulatedSession("QDS2014A");
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([vi, t] {
            for (int i = 0; i < 20; ++i) {
                ViBoolean has = VI_FALSE;
                ASSERT_EQ(Qn731XX_LockSession(vi, &has), VI_SUCCESS);
                const ViReal64 mine = t * 100.0 + i;
                EXPECT_EQ(Qn731XX_SetAttributeViReal64(vi, "Channel2", IVISCOPE_ATTR_VERTICAL_OFFSET, mine), 0);
                ViReal64 back = 0;
                EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi, "Channel2", IVISCOPE_ATTR_VERTICAL_OFFSET, &back), 0);
                EXPECT_EQ(back, mine);
                ASSERT_EQ(Qn731XX_UnlockSession(vi, &has), VI_SUCCESS);
            }
        });
    }
    for (std::thread& th : threads) th.join();
    EXPECT_EQ(Qn731XX_close(vi), VI_SUCCESS);
}

TEST(CApiThreads, ASessionClosedDuringCallsEndsThemCleanly) {
    for (int round = 0; round < 5; ++round) {
        const ViSession vi = SimulatedSession("QDS2014A");
        std::atomic<int> calls{0};
        std::vector<std::thread> callers;
        for (int t = 0; t < 2; ++t) {
            callers.emplace_back([vi, &calls] {
                for (;;) {
                    ViReal64 v = 0;
                    const ViStatus s =
                        Qn731XX_GetAttributeViReal64(vi, "Channel1", IVISCOPE_ATTR_VERTICAL_RANGE, &v);
                    ++calls;
                    if (s == QN731XX_ERROR_INVALID_SESSION) return;
                    ASSERT_EQ(s, VI_SUCCESS);
                }
            });
        }
        while (calls.load() < 10) std::this_thread::yield();
        EXPECT_EQ(Qn731XX_close(vi), VI_SUCCESS);
        for (std::thread& th : callers) th.join();
    }
}

}  // namespace
}  // namespace qn::test
