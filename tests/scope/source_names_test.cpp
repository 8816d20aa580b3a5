// Driver source names to instrument source names and back, on a mixed-signal
// model with four analog channels and sixteen digital channels.
#include <gtest/gtest.h>

#include "scope/source_names.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

class SourceNamesTest : public ScriptedScopeTest {};

TEST_F(SourceNamesTest, DriverNamesToInstrumentNames) {
    Open("73142D");
    driver_->Core().virtual_names["probe"] = "UserChannel2";
    driver_->Core().virtual_names["clk"] = "UserDigitalChannel15";
    const SourceNameRules none{}, digital{true, false}, external{false, true}, all{true, true};
    struct Case {
        const char* name;
        SourceNameRules rules;
        const char* scpi;  // null: refused
    } cases[] = {
        {"UserChannel1", none, "CHAN1"},       {"userchannel2", none, "CHAN2"},
        {"Channel2", none, "CHAN2"},           {"probe", none, "CHAN2"},
        {"UserChannel5", all, nullptr},        {"UserChannel0", all, nullptr},
        {"UserDigitalChannel0", digital, "DIG0"},
        {"UserDigitalChannel15", all, "DIG15"}, {"clk", digital, "DIG15"},
        {"UserDigitalChannel16", all, nullptr}, {"UserDigitalChannel3", external, nullptr},
        {"VAL_EXTERNAL", external, "EXT"},     {"VAL_EXTERNAL", digital, nullptr},
        {"EXT", all, nullptr},                 {"CHAN1", all, nullptr},
    };
    for (const Case& c : cases) {
        std::string scpi = "unchanged";
        HRESULT hr = VirtualToSCPI(*driver_.get(), c.name, c.rules, &scpi);
        if (c.scpi) {
            EXPECT_EQ(hr, S_OK) << c.name;
            EXPECT_EQ(scpi, c.scpi) << c.name;
        } else {
            EXPECT_EQ(hr, E_IVI_INVALID_VALUE) << c.name;
            EXPECT_EQ(scpi, "unchanged") << c.name;
            const std::string text = ErrorText();
            EXPECT_NE(text.find("VirtualToSCPI"), std::string::npos) << text;
            EXPECT_NE(text.find(c.name), std::string::npos)
                << c.name;
        }
    }
}

TEST_F(SourceNamesTest, InstrumentNamesToDriverNames) {
    Open("73142D");
    driver_->Core().virtual_names["userchannel2"] = "Probe";
    struct Case {
        const char* scpi;
        bool class_compliant;
        const char* name;
    } cases[] = {
        {"CHAN1", false, "UserChannel1"}, {"CHAN1", true, "Channel1"},
        {"CHAN2", false, "Probe"},        {"DIG0", false, "UserDigitalChannel0"},
        {"DIG13", false, "UserDigitalChannel13"}, {"EXT", false, "VAL_EXTERNAL"},
        {"LINE", true, "LINE"},           {"MATH", false, "MATH"},
    };
    for (const Case& c : cases)
        EXPECT_EQ(SCPIToVirtual(driver_->Core(), c.scpi, c.class_compliant), c.name) << c.scpi;
}

}  // namespace
}  // namespace qn::test
