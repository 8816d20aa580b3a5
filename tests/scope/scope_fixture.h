// Helpers of the acquisition and channel tests: a session on a strict
// scripted provider for an early-family model (which starts with just the
// two identity queries), and typed access to its interfaces.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "tests/support/error_text.h"
#include "tests/support/scripted_driver.h"

namespace qn::test {

// The interface `Itf` of the channel named `name` ("UserChannel2",
// "Channel1") of an initialized session.
template <class Collection, class Itf>
ComPtr<Itf> ChannelNamed(Quorlen731XX& driver, const char* name) {
    ComPtr<Itf> channel;
    com::Bstr n(name);
    EXPECT_EQ(static_cast<Collection*>(&driver)->get_Item(n.get(), channel.Out()), S_OK) << name;
    return channel;
}

class ScriptedScopeTest : public ScriptedSessionTest<> {
protected:
    IQuorlen731XXAcquisition* Acq() { return driver_.get(); }
    IIviScopeAcquisition* IviAcq() { return driver_.get(); }
    ComPtr<IQuorlen731XXChannel> User(int n) {
        return ChannelNamed<IQuorlen731XXChannels, IQuorlen731XXChannel>(
            *driver_.get(), ("UserChannel" + std::to_string(n)).c_str());
    }
    ComPtr<IIviScopeChannel> Ivi(int n) {
        return ChannelNamed<IIviScopeChannels, IIviScopeChannel>(
            *driver_.get(), ("Channel" + std::to_string(n)).c_str());
    }
    // Scripts the current waveform source being displayed.
    void ExpectSourceDisplayed(const char* source = "CHAN1") {
        io_->Expect(":WAV:SOUR?\n", std::string(source) + "\n")
            .Expect(":STAT? " + std::string(source) + "\n", "1\n");
    }
};

}  // namespace qn::test
