// Server locks taken and released from several threads at once balance out.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "Quorlen731XXIds.h"
#include "com/class_factory.h"
#include "com/exports.h"
#include "platform/com/errorinfo.h"

namespace {

TEST(ServerLocks, BalanceAcrossThreads) {
    constexpr int kThreads = 4;
    constexpr int kRounds = 20000;
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([] {
            ComPtr<IClassFactory> f;
            ASSERT_EQ(DllGetClassObject(CLSID_Quorlen731XX, iid_of<IClassFactory>, f.OutVoid()),
                      S_OK);
            for (int i = 0; i < kRounds; ++i) {
                ASSERT_EQ(f->LockServer(true), S_OK);
                ASSERT_EQ(f->LockServer(false), S_OK);
            }
        });
    }
    for (std::thread& t : threads) t.join();
    EXPECT_EQ(qn::server::ServerLockCount(), 0);
    qn::com::TakeThreadError(nullptr);
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
}

}  // namespace
