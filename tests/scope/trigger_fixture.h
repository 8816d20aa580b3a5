// A session on the strict scripted provider for the trigger tests, with a
// provider that can fail the next write (to test what a failed send leaves
// pending), and typed access to the trigger interfaces.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {

class FailingProvider : public ScriptedProvider {
public:
    bool fail_next_write = false;

protected:
    HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) override {
        if (std::exchange(fail_next_write, false)) return E_FAIL;
        return ScriptedProvider::RawWrite(data, count, written);
    }
};

class TriggerTest : public ::testing::Test {
protected:
    void TearDown() override {
        if (io_ && !HasFailure()) {
            EXPECT_TRUE(io_->Done()) << "scripted messages were not sent";
        }
    }
    // Opens a session on an early-family model (2 identity queries only).
    void Open(const std::string& model) {
        driver_ = DriverOnScript(&io_);
        const std::string idn = "QUORLEN TECHNOLOGIES," + model + ",SN0001,2.10\n";
        io_->Expect("*IDN?\n", idn).Expect("*IDN?\n", idn);
        com::Bstr r("scripted"), o("");
        ASSERT_EQ(driver_->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
    }
    // Scripts `messages` in order (each a write, or "write|reply").
    void Expect(std::initializer_list<const char*> messages) {
        for (const char* m : messages) {
            std::string s(m);
            const std::size_t bar = s.find('|');
            if (bar == std::string::npos)
                io_->Expect(s + "\n");
            else
                io_->Expect(s.substr(0, bar) + "\n", s.substr(bar + 1) + "\n");
        }
    }
public:
    TriggerShadow& Shadow() { return driver_->Core().trigger; }
    FeatureRecord& Features() { return driver_->Core().features; }

    IQuorlen731XXTrigger* Trig() { return driver_.get(); }
    IQuorlen731XXTriggerEdge* Edge() { return driver_.get(); }
    IQuorlen731XXTriggerAcLine* AcLine() { return driver_.get(); }
    IQuorlen731XXTriggerGlitch* Glitch() { return driver_.get(); }
    IQuorlen731XXTriggerWidth* Width() { return driver_.get(); }
    IQuorlen731XXTriggerRunt* Runt() { return driver_.get(); }
    IQuorlen731XXTriggerTv* Tv() { return driver_.get(); }
    IQuorlen731XXTriggerPattern* Pattern() { return driver_.get(); }
    IQuorlen731XXTriggerState* State() { return driver_.get(); }
    IIviScopeTrigger* IviTrig() { return driver_.get(); }

protected:
    ComPtr<Quorlen731XX> driver_;
    FailingProvider* io_ = nullptr;
};

}  // namespace qn::test
