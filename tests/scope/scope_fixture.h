// Helpers of the acquisition and channel tests: a session on a strict
// scripted provider for an early-family model (which starts with just the
// two identity queries), and typed access to its interfaces.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
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

inline std::string ErrorText() {
    com::ErrorRecord rec;
    return com::TakeThreadError(&rec) ? rec.description : std::string();
}

class ScriptedScopeTest : public ::testing::Test {
protected:
    void SetUp() override { ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1); }
    void TearDown() override {
        if (io_ && !HasFailure()) {
            EXPECT_TRUE(io_->Done()) << "scripted messages were not sent";
        }
    }
    // Opens a session on `model` (7312X or 7314X).
    void Open(const std::string& model) {
        driver_ = DriverOnScript(&io_);
        const std::string idn = "QUORLEN TECHNOLOGIES," + model + ",SN0001,2.10\n";
        io_->Expect("*IDN?\n", idn).Expect("*IDN?\n", idn);
        com::Bstr r("scripted"), o("");
        ASSERT_EQ(driver_->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
    }
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
    FeatureRecord& Features() { return driver_->Core().features; }
    // Scripts the current waveform source being displayed.
    void ExpectSourceDisplayed(const char* source = "CHAN1") {
        io_->Expect(":WAV:SOUR?\n", std::string(source) + "\n")
            .Expect(":STAT? " + std::string(source) + "\n", "1\n");
    }

    ComPtr<Quorlen731XX> driver_;
    ScriptedProvider* io_ = nullptr;
};

}  // namespace qn::test
