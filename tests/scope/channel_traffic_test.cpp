// The exact SCPI traffic of the analog channel members against a strict
// scripted provider. 73141D has the 50-ohm input, probe skew and protection
// but no ground coupling; 73122A the reverse.
#include <gtest/gtest.h>

#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

class ChannelTraffic : public ScriptedScopeTest {};

TEST_F(ChannelTraffic, ImpedanceIsOneMegohmOrFiftyOhmWhereFitted) {
    struct Case {
        const char* model;
        double ohms;
        const char* sent;  // nullptr: refused
    };
    const Case cases[] = {
        {"73141D", 50.0, ":CHAN1:IMP FIFT\n"}, {"73141D", 1e6, ":CHAN1:IMP ONEM\n"},
        {"73141D", 49.999, nullptr},           {"73141D", 1e6 + 1e-6, nullptr},
        {"73122A", 50.0, nullptr},             {"73122A", 1e6, ":CHAN1:IMP ONEM\n"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::to_string(c.ohms) + " on " + c.model);
        Open(c.model);
        if (c.sent) io_->Expect(c.sent);
        EXPECT_EQ(User(1)->put_InputImpedance(c.ohms), c.sent ? S_OK : E_IVI_INVALID_VALUE);
        if (!c.sent) {
            EXPECT_NE(ErrorText().find("put_InputImpedance, parameter val"), std::string::npos);
        }
        EXPECT_TRUE(io_->Done());
    }
    io_->Expect(":CHAN2:IMP?\n", "FIFT\n").Expect(":CHAN2:IMP?\n", "ONEM\n");
    EXPECT_EQ(Got(Ivi(2).get(), &IIviScopeChannel::get_InputImpedance), 50.0);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_InputImpedance), 1e6);
    double ohms = 0;
    io_->Expect(":CHAN2:IMP?\n", "75\n");
    EXPECT_EQ(User(2)->get_InputImpedance(&ohms), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(ChannelTraffic, BandwidthLimitSwitchesAtTheFilterFrequency) {
    Open("73141D");  // limit 25 MHz, bandwidth 300 MHz
    io_->Expect(":CHAN2:BWL ON\n").Expect(":CHAN2:BWL OFF\n").Expect(":CHAN2:BWL ON\n");
    EXPECT_EQ(User(2)->put_InputFrequencyMax(2.5e7), S_OK);
    EXPECT_EQ(User(2)->put_InputFrequencyMax(2.5e7 + 1), S_OK);
    EXPECT_EQ(Ivi(2)->put_InputFrequencyMax(1.0), S_OK);
    io_->Expect(":CHAN2:BWL?\n", "1\n").Expect(":CHAN2:BWL?\n", "0\n");
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_InputFrequencyMax), 2.5e7);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_InputFrequencyMax), 3e8);
}

TEST_F(ChannelTraffic, AutomaticProbeSensingSendsNothing) {
    Open("73141D");
    const auto probe = [&](int n) {
        return Got(User(n).get(), &IQuorlen731XXChannel::get_ProbeAttenuation);
    };
    // A new channel asks the instrument.
    io_->Expect(":CHAN1:PROB?\n", "10\n");
    EXPECT_EQ(probe(1), 10.0);
    EXPECT_EQ(Ivi(1)->put_ProbeAttenuation(-1.0), S_OK);
    EXPECT_EQ(probe(1), -1.0);
    // Channel 2 keeps its own state.
    io_->Expect(":CHAN2:PROB?\n", "1\n");
    EXPECT_EQ(probe(2), 1.0);
    io_->Expect(":CHAN1:PROB 100\n").Expect(":CHAN1:PROB?\n", "100\n");
    EXPECT_EQ(User(1)->put_ProbeAttenuation(100.0), S_OK);
    EXPECT_EQ(probe(1), 100.0);
    // The sensed value is not remembered as an attenuation.
    io_->Expect(":CHAN1:PROB?\n", "100\n");
    Got(User(1).get(), &IQuorlen731XXChannel::get_ProbeSense);

    // Reset puts the instrument's probe back at its default: automatic
    // sensing is no longer remembered, the instrument is asked.
    EXPECT_EQ(Ivi(1)->put_ProbeAttenuation(-1.0), S_OK);
    io_->Expect("*RST;*OPC?\n", "1\n").Expect(":CHAN1:PROB?\n", "1\n");
    EXPECT_EQ(driver_->Reset(), S_OK);
    EXPECT_EQ(probe(1), 1.0);
}

TEST_F(ChannelTraffic, GroundCouplingNeedsTheFeature) {
    Open("73141D");
    EXPECT_EQ(User(1)->put_Coupling(Quorlen731XXVerticalCouplingGnd),
              E_QUORLEN731XX_VERTICAL_GROUND_COUPLING);
    EXPECT_EQ(User(1)->put_Coupling(static_cast<Quorlen731XXVerticalCouplingEnum>(3)),
              E_IVI_INVALID_VALUE);
    EXPECT_EQ(User(1)->put_Units(static_cast<Quorlen731XXChannelUnitsEnum>(2)),
              E_IVI_INVALID_VALUE);
    io_->Expect(":CHAN1:COUP AC\n").Expect(":CHAN1:COUP DC\n");
    EXPECT_EQ(Ivi(1)->put_Coupling(IviScopeVerticalCouplingAC), S_OK);
    EXPECT_EQ(User(1)->put_Coupling(Quorlen731XXVerticalCouplingDC), S_OK);

    Open("73122A");
    io_->Expect(":CHAN2:COUP GND\n");
    EXPECT_EQ(Ivi(2)->put_Coupling(IviScopeVerticalCouplingGnd), S_OK);
    io_->Expect(":CHAN2:COUP?\n", "GND\n").Expect(":CHAN2:COUP?\n", "DC\n");
    EXPECT_EQ(Got(Ivi(2).get(), &IIviScopeChannel::get_Coupling), IviScopeVerticalCouplingGnd);
    EXPECT_EQ(Got(Ivi(2).get(), &IIviScopeChannel::get_Coupling), IviScopeVerticalCouplingDC);
    IviScopeVerticalCouplingEnum coupling{};
    io_->Expect(":CHAN2:COUP?\n", "LFR\n");
    EXPECT_EQ(Ivi(2)->get_Coupling(&coupling), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(ChannelTraffic, ConfigureStopsAtTheFirstFailure) {
    Open("73141D");
    io_->Expect(":CHAN1:PROB 12.3456789012346\n").Expect(":CHAN1:RANG 2\n").Expect(":CHAN1:OFFS 0.5\n");
    EXPECT_EQ(Ivi(1)->Configure(2.0, 0.5, IviScopeVerticalCouplingGnd, 12.345678901234567, VARIANT_TRUE),
              E_QUORLEN731XX_VERTICAL_GROUND_COUPLING);
    EXPECT_TRUE(io_->Done());

    // Doubles go out with 15 significant digits.
    io_->Expect(":CHAN2:RANG 1.23456789012346\n")
        .Expect(":CHAN2:OFFS -0.987654321098765\n")
        .Expect(":CHAN2:COUP DC\n")
        .Expect(":CHAN2:DISP 0\n");
    EXPECT_EQ(User(2)->Configure(1.2345678901234567, -0.98765432109876543,
                                 Quorlen731XXVerticalCouplingDC, -1.0, VARIANT_FALSE),
              S_OK);
    io_->Expect(":CHAN2:IMP ONEM\n").Expect(":CHAN2:BWL OFF\n");
    EXPECT_EQ(Ivi(2)->ConfigureCharacteristics(1e6, 1e9), S_OK);
    EXPECT_EQ(User(2)->ConfigureCharacteristics(75.0, 1e9), E_IVI_INVALID_VALUE);
}

TEST_F(ChannelTraffic, SkewAndProtectionNeedTheirFeatures) {
    Open("73122A");
    double skew = 0;
    Quorlen731XXChannelProtectionEnum protection{};
    EXPECT_EQ(User(1)->get_ProbeSkew(&skew), E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED);
    EXPECT_EQ(User(1)->put_ProbeSkew(1e-9), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("put_ProbeSkew"), std::string::npos);
    EXPECT_EQ(User(1)->get_Protection(&protection), E_IVI_VALUE_NOT_SUPPORTED);
    EXPECT_EQ(User(1)->ClearProtection(), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("ClearProtection"), std::string::npos);

    Open("73141D");
    io_->Expect(":CHAN2:PROB:SKEW -1.23456789012346e-09\n")
        .Expect(":CHAN2:PROB:SKEW?\n", "-1.23456789012346E-09\n");
    EXPECT_EQ(User(2)->put_ProbeSkew(-1.2345678901234567e-9), S_OK);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_ProbeSkew), -1.23456789012346e-9);
    io_->Expect(":CHAN2:PROT?\n", "NORM\n").Expect(":CHAN2:PROT?\n", "TRIP\n");
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_Protection),
              Quorlen731XXChannelProtectionOK);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_Protection),
              Quorlen731XXChannelProtectionTripped);
    io_->Expect(":CHAN2:PROT:CLE\n");
    EXPECT_EQ(User(2)->ClearProtection(), S_OK);
}

TEST_F(ChannelTraffic, LabelsWithLineBreaksOrNulAreRefused) {
    Open("73141D");
    const char16_t lf[] = u"\"A\nB\"";
    const char16_t nul[] = {u'"', u'A', 0, u'B', u'"'};
    com::Bstr with_lf{std::u16string_view(lf)};
    com::Bstr with_nul{std::u16string_view(nul, 5)};
    EXPECT_EQ(User(1)->put_Label(with_lf.get()), E_IVI_INVALID_VALUE);
    EXPECT_NE(ErrorText().find("for method put_Label, parameter val"), std::string::npos);
    EXPECT_EQ(User(1)->put_Label(with_nul.get()), E_IVI_INVALID_VALUE);
    io_->Expect(":CHAN1:LAB \"Clock\"\n").Expect(":CHAN1:LAB?\n", "\"Clock\"\n");
    com::Bstr label("\"Clock\"");
    EXPECT_EQ(User(1)->put_Label(label.get()), S_OK);
    EXPECT_EQ(Got(User(1).get(), &IQuorlen731XXChannel::get_Label), "\"Clock\"");
}

// A text read before the status check failed is delivered with the failure,
// as numbers are.
TEST_F(ChannelTraffic, TextReadBeforeAFailedStatusCheckIsDelivered) {
    Open("73141D");
    driver_->Core().session.flags.query_instrument_status = true;
    io_->AnswerStatusWith("+16");
    io_->Expect(":CHAN1:LAB?\n", "\"Clock\"\n").Expect(":CHAN1:RANG?\n", "8\n");
    com::Bstr label;
    EXPECT_EQ(User(1)->get_Label(label.Out()), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(label.utf8(), "\"Clock\"");
    double range = 0;
    EXPECT_EQ(User(1)->get_Range(&range), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(range, 8.0);
}

}  // namespace
}  // namespace qn::test
