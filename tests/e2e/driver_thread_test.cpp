// Threads on the driver: several threads calling one session at once (the
// root and its channel objects share one session lock), several sessions
// at once on their own threads (simulated and against emulators on their
// own ports), and one instrument session shared by threads whose queries
// must not take each other's replies. Error information belongs to the
// thread whose call failed. Run under ThreadSanitizer with `ctest -L thread`.
#include <gtest/gtest.h>

#include <barrier>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "IviScope.h"
#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "io/io_manager.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

constexpr double kRangeDefault = 40.0;           // simulated IIviScopeChannel value
constexpr double kTimePerRecordDefault = 0.001;  // simulated IIviScopeAcquisition value

std::string TakeErrorText() {
    const std::string text = ErrorText();
    return text.empty() ? "<none>" : text;
}

template <class I>
ComPtr<I> As(const ComPtr<Quorlen731XX>& driver) {
    ComPtr<I> p;
    EXPECT_EQ(ComPtr<IIviDriver>(driver.get()).As(p), S_OK);
    return p;
}

HRESULT Init(Quorlen731XX* driver, const std::string& resource, const char* options,
             bool id_query) {
    com::Bstr r(resource), o(options);
    return driver->Initialize(r.get(), id_query ? VARIANT_TRUE : VARIANT_FALSE, VARIANT_FALSE,
                              o.get());
}

// A failing call whose error text names this thread's own argument; then a
// succeeding call, which must leave no error information behind. Returns the
// number of failed expectations (gtest assertions are thread-safe, but a
// count keeps the failure report short).
int CheckOwnErrorInfo(IIviScopeChannels* channels, LONG thread_index) {
    int failures = 0;
    com::Bstr name;
    const LONG bad = -(thread_index + 1);
    if (channels->get_Name(bad, name.Out()) != E_IVI_INVALID_VALUE) ++failures;
    const std::string want = "Invalid value (" + std::to_string(bad) + ") for method get_Name";
    const std::string got = TakeErrorText();
    if (got.find(want) == std::string::npos) {
        ADD_FAILURE() << "thread " << thread_index << " got error text: " << got;
        ++failures;
    }
    LONG count = 0;
    if (channels->get_Count(&count) != S_OK) ++failures;
    if (com::TakeThreadError(nullptr)) ++failures;
    return failures;
}

class DriverThreads : public ::testing::Test {
  protected:
    void SetUp() override { ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1); }
};

TEST_F(DriverThreads, OneSimulatedSessionManyThreads) {
    auto driver = com::MakeComObject<Quorlen731XX>();
    ASSERT_EQ(Init(driver.get(), "", "Simulate=true,DriverSetup=Model=QDS4034A", false), S_OK);
    auto channels = As<IIviScopeChannels>(driver);
    auto acq = As<IIviScopeAcquisition>(driver);
    LONG count = 0;
    ASSERT_EQ(channels->get_Count(&count), S_OK);
    ASSERT_GE(count, 2);
    const int workers = std::min<int>(count, 4);
    constexpr int kRounds = 150;

    // Phase 1: no invalidation; every thread reads back exactly what it
    // wrote to its own channel. Phase 2: another thread invalidates and
    // resets meanwhile, so a read gives the value written or the default.
    std::barrier phase(workers + 1);
    std::vector<int> failures(workers + 1, 0);
    auto worker = [&](int t) {
        int& bad = failures[t];
        IIviScopeChannel* raw = nullptr;
        com::Bstr name("Channel" + std::to_string(t + 1));
        if (channels->get_Item(name.get(), &raw) != S_OK) {
            ++bad;
            phase.arrive_and_drop();
            return;
        }
        ComPtr<IIviScopeChannel> ch;
        ch.Attach(raw);
        const double mine = (t + 2) * 1e-3;
        for (int pass = 0; pass < 2; ++pass) {
            for (int r = 0; r < kRounds; ++r) {
                const double level = t * 1000 + r + 0.25;
                double got = -1;
                if (ch->put_Range(level) != S_OK || ch->get_Range(&got) != S_OK) ++bad;
                if (got != level && !(pass == 1 && got == kRangeDefault)) ++bad;
                double tpr = -1;
                if (acq->put_TimePerRecord(mine) != S_OK || acq->get_TimePerRecord(&tpr) != S_OK)
                    ++bad;
                // Some thread's value, or the default after a reset.
                const int k = static_cast<int>(tpr * 1e3 + 0.5) - 2;
                if (!(tpr == kTimePerRecordDefault ||
                      (k >= 0 && k < workers && tpr == (k + 2) * 1e-3)))
                    ++bad;
                com::Bstr own;
                if (channels->get_Name(t + 1, own.Out()) != S_OK ||
                    own.utf8() != "Channel" + std::to_string(t + 1))
                    ++bad;
                if (r % 10 == 0) bad += CheckOwnErrorInfo(channels.get(), t);
            }
            phase.arrive_and_wait();
        }
    };
    std::vector<std::thread> threads;
    for (int t = 0; t < workers; ++t) threads.emplace_back(worker, t);
    phase.arrive_and_wait();  // phase 1 done
    auto util = As<IIviDriverUtility>(driver);
    auto op = As<IIviDriverOperation>(driver);
    for (int r = 0; r < kRounds; ++r) {
        if ((r % 2 ? util->Reset() : op->InvalidateAllAttributes()) != S_OK) ++failures[workers];
        if (com::TakeThreadError(nullptr)) ++failures[workers];
    }
    phase.arrive_and_wait();  // phase 2 done
    for (auto& th : threads) th.join();
    for (int t = 0; t <= workers; ++t) EXPECT_EQ(failures[t], 0) << "thread " << t;

    // After a reset every simulated value is back to its default.
    ASSERT_EQ(util->Reset(), S_OK);
    for (int t = 0; t < workers; ++t) {
        IIviScopeChannel* raw = nullptr;
        com::Bstr name("Channel" + std::to_string(t + 1));
        ASSERT_EQ(channels->get_Item(name.get(), &raw), S_OK);
        double got = -1;
        EXPECT_EQ(raw->get_Range(&got), S_OK);
        EXPECT_EQ(got, kRangeDefault);
        EXPECT_EQ(static_cast<Quorlen731XXChannel*>(raw)->CallContexts().Depth(), 0u);
        raw->Release();
    }
    double tpr = -1;
    EXPECT_EQ(acq->get_TimePerRecord(&tpr), S_OK);
    EXPECT_EQ(tpr, kTimePerRecordDefault);
    EXPECT_EQ(driver->CallContexts().Depth(), 0u);
    EXPECT_EQ(driver->Close(), S_OK);
}

// Error information belongs to the thread whose call failed: another
// thread finds none of it, and the failing thread still has it afterwards.
TEST_F(DriverThreads, ErrorInformationStaysWithTheFailingThread) {
    auto driver = com::MakeComObject<Quorlen731XX>();
    ASSERT_EQ(Init(driver.get(), "", "Simulate=true,DriverSetup=Model=QDS4034A", false), S_OK);
    com::Bstr name;
    ASSERT_EQ(As<IIviScopeChannels>(driver)->get_Name(-5, name.Out()), E_IVI_INVALID_VALUE);
    std::string seen = "not run";
    std::thread([&] { seen = ErrorText(); }).join();
    EXPECT_EQ(seen, "");
    EXPECT_NE(ErrorText().find("Invalid value (-5) for method get_Name"), std::string::npos);
}

// One session per thread: simulated ones and ones against an emulator of
// their own, each opened, used and closed several times.
TEST_F(DriverThreads, ManySessionsAtOnce) {
    const std::vector<std::string> emulated = {"QDS4032A", "QMS3104A"};
    std::vector<std::unique_ptr<emu::Emulator>> emus;
    std::vector<std::string> resources;
    for (const auto& model : emulated) {
        emus.push_back(std::make_unique<emu::Emulator>(model));
        resources.push_back(SocketResource(emus.back()->Start()));
    }
    struct Plan {
        std::string resource, options, model;
        bool instrument;
    };
    const std::vector<Plan> plans = {
        {"", "Simulate=true,DriverSetup=Model=QDS2012A", "QDS2012A", false},
        {"", "Simulate=true,DriverSetup=Model=QMS3104A", "QMS3104A", false},
        {resources[0], "QueryInstrStatus=true", emulated[0], true},
        {resources[1], "QueryInstrStatus=false", emulated[1], true},
    };
    constexpr int kCycles = 3;
    constexpr int kQueries = 20;
    std::vector<std::string> errors(plans.size());
    auto run = [&](std::size_t t) {
        const Plan& p = plans[t];
        std::string& err = errors[t];
        auto note = [&](int cycle, const std::string& what) {
            if (err.empty()) err = "cycle " + std::to_string(cycle) + ": " + what;
        };
        for (int c = 0; c < kCycles; ++c) {
            auto driver = com::MakeComObject<Quorlen731XX>();
            if (Init(driver.get(), p.resource, p.options.c_str(), p.instrument) != S_OK) {
                note(c, "Initialize: " + TakeErrorText());
                return;
            }
            com::Bstr model;
            driver->get_InstrumentModel(model.Out());
            if (model.utf8() != p.model) note(c, "model " + model.utf8());
            auto acq = As<IQuorlen731XXAcquisition>(driver);
            auto channels = As<IIviScopeChannels>(driver);
            for (int q = 0; q < kQueries; ++q) {
                const double value = (t + 1) * 1e-3 + (c * kQueries + q) * 1e-6;
                double got = -1;
                if (acq->put_TimePerRecord(value) != S_OK || acq->get_TimePerRecord(&got) != S_OK)
                    note(c, "TimePerRecord: " + TakeErrorText());
                else if (std::abs(got - value) > 1e-12 * value)  // the reply has 15 digits
                    note(c, "TimePerRecord read back " + std::to_string(got));
                if (p.instrument) {
                    std::string reply;
                    if (Io(*driver.get()).InstrQuery("*IDN?", &reply, 256) != S_OK ||
                        reply.find(p.model) == std::string::npos)
                        note(c, "*IDN? reply " + reply);
                }
                if (q % 5 == 0 && CheckOwnErrorInfo(channels.get(), static_cast<LONG>(t)) != 0)
                    note(c, "error information of another call");
            }
            if (driver->Close() != S_OK) note(c, "Close: " + TakeErrorText());
            VARIANT_BOOL initialized = VARIANT_TRUE;
            driver->get_Initialized(&initialized);
            if (initialized != VARIANT_FALSE) note(c, "still initialized");
        }
    };
    std::vector<std::thread> threads;
    for (std::size_t t = 0; t < plans.size(); ++t) threads.emplace_back(run, t);
    for (auto& th : threads) th.join();
    for (std::size_t t = 0; t < plans.size(); ++t)
        EXPECT_EQ(errors[t], "") << "session " << t << " (" << plans[t].model << ")";
    // Every emulator saw all of its own session's settings and no other's.
    for (std::size_t i = 0; i < emus.size(); ++i) {
        const std::size_t t = plans.size() - emus.size() + i;
        int writes = 0;
        for (const auto& m : emus[i]->ReceivedMessages()) {
            if (m.rfind(":TIM:RANG ", 0) != 0) continue;
            ++writes;
            const double v = std::stod(m.substr(10));
            EXPECT_EQ(static_cast<std::size_t>(v * 1e3 + 1e-9), t + 1) << m;
        }
        EXPECT_EQ(writes, kCycles * kQueries) << emus[i]->model();
    }
}

// One instrument session shared by several threads: each member call holds
// the session lock for its whole exchange, so no thread reads a reply meant
// for another.
TEST_F(DriverThreads, SharedInstrumentSessionKeepsRepliesApart) {
    emu::Emulator emu("QDS4032A");
    const std::string resource = SocketResource(emu.Start());
    auto driver = com::MakeComObject<Quorlen731XX>();
    ASSERT_EQ(Init(driver.get(), resource, "QueryInstrStatus=true", true), S_OK) << TakeErrorText();
    auto acq = As<IQuorlen731XXAcquisition>(driver);
    auto util = As<IIviDriverUtility>(driver);
    constexpr double kRange = 0.025;
    ASSERT_EQ(acq->put_TimePerRecord(kRange), S_OK);

    constexpr int kThreads = 3;
    constexpr int kCalls = 30;
    std::vector<int> failures(kThreads, 0);
    auto run = [&](int t) {
        for (int i = 0; i < kCalls; ++i) {
            if (t == 0) {
                // Writes the value already set, with its status check.
                if (acq->put_TimePerRecord(kRange) != S_OK) ++failures[t];
            } else if (t == 1) {
                LONG code = -1;
                com::Bstr msg;
                if (util->ErrorQuery(&code, msg.Out()) != S_OK || code != 0) ++failures[t];
            } else {
                double got = -1;
                if (acq->get_TimePerRecord(&got) != S_OK || got != kRange) ++failures[t];
            }
        }
    };
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) threads.emplace_back(run, t);
    for (auto& th : threads) th.join();
    for (int t = 0; t < kThreads; ++t) EXPECT_EQ(failures[t], 0) << "thread " << t;
    EXPECT_EQ(driver->Close(), S_OK);
}

}  // namespace
}  // namespace qn::test
