// Helpers of the acquisition and channel tests: a session on a strict
// scripted provider for an early-family model (which starts with just the
// two identity queries), and typed access to its interfaces.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <type_traits>

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

// The value a getter gives (a BSTR as UTF-8 text), its success checked.
template <class Itf, class T>
auto Got(std::type_identity_t<Itf>* itf, HRESULT (Itf::*get)(T*)) {
    if constexpr (std::is_same_v<T, BSTR>) {
        com::Bstr s;
        EXPECT_EQ((itf->*get)(s.Out()), S_OK) << ErrorText();
        return s.utf8();
    } else {
        T v{};
        EXPECT_EQ((itf->*get)(&v), S_OK) << ErrorText();
        return v;
    }
}

// A driver object simulating `model`, with `more` appended to its options.
inline ComPtr<Quorlen731XX> SimulatedDriver(const std::string& model, const std::string& more = "") {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    com::Bstr r(""), o("Simulate=true,DriverSetup=Model=" + model + more);
    EXPECT_EQ(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK)
        << ErrorText();
    return driver;
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
