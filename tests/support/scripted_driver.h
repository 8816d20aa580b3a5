// A root driver object whose instrument session is a scripted provider, with
// the configuration store pointed at a file that does not exist, and a test
// fixture holding one.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <initializer_list>
#include <memory>
#include <string>
#include <string_view>

#include "core/root.h"
#include "tests/support/scripted_provider.h"

namespace qn::test {

template <class Provider = ScriptedProvider>
ComPtr<Quorlen731XX> DriverOnScript(Provider** io) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    auto p = std::make_unique<Provider>();
    *io = p.get();
    driver->Core().io = std::move(p);
    return driver;
}

// A session on a strict scripted provider of type `Provider`: Open starts it
// for an early-family model (which starts with just the two identity
// queries), and every scripted message must have been sent by the end of a
// test that has not failed otherwise.
template <class Provider = ScriptedProvider>
class ScriptedSessionTest : public ::testing::Test {
protected:
    void TearDown() override {
        if (io_ && !HasFailure()) {
            EXPECT_TRUE(io_->Done()) << "scripted messages were not sent";
        }
    }
    // Opens a session on `model` (7312X or 7314X) with `options`; with the
    // status check on, every command is answered "+0".
    void Open(const std::string& model, const char* options = "") {
        driver_ = DriverOnScript(&io_);
        const std::string idn = "QUORLEN TECHNOLOGIES," + model + ",SN0001,2.10\n";
        io_->Expect("*IDN?\n", idn).Expect("*IDN?\n", idn);
        if (std::string_view(options).find("QueryInstrStatus") != std::string_view::npos)
            io_->AnswerStatusWith("+0");
        com::Bstr r("scripted"), o(options);
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
    FeatureRecord& Features() { return driver_->Core().features; }

    ComPtr<Quorlen731XX> driver_;
    Provider* io_ = nullptr;
};

}  // namespace qn::test
