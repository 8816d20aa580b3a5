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

class TriggerTest : public ScriptedSessionTest<FailingProvider> {
public:
    TriggerShadow& Shadow() { return driver_->Core().trigger; }

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
};

}  // namespace qn::test
