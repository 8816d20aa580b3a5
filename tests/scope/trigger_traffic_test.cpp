// Exact SCPI traffic of the trigger type selection and of the shadow writers
// against the strict scripted provider: a type's settings are sent only while
// the type is current and its settings are pending, at once or when the type
// is selected. 73142A: two channels, no digital channels; 73142D: two
// channels and sixteen digital channels.
#include <gtest/gtest.h>

#include <functional>
#include <tuple>
#include <vector>

#include "tests/scope/trigger_fixture.h"

namespace qn::test {
namespace {

class TriggerTraffic : public TriggerTest {};

TEST_F(TriggerTraffic, SelectingATypeSendsItsWholeConfigurationOnANewSession) {
    struct Case {
        Quorlen731XXTriggerTypeEnum type;
        std::vector<const char*> traffic;
    };
    const Case cases[] = {
        {Quorlen731XXTriggerEdge, {":TRIG:SLOP POS", ":TRIG:MODE EDGE"}},
        {Quorlen731XXTriggerWidth,
         {":TRIG:MODE DUR;:TRIG:DUR:QUAL INR;:TRIG:DUR:RANG 0,0", "TRIG:DUR:PATT 1,1"}},
        {Quorlen731XXTriggerGlitch,
         {":TRIG:MODE GLIT", ":TRIG:GLIT:QUAL LESS;:TRIG:GLIT:POL POS",
          ":TRIG:GLIT:LESS 0;:TRIG:GLIT:GRE 0", ":TRIG:GLIT:LESS?|2e-09"}},
        {Quorlen731XXTriggerTV, {":TRIG:MODE TV"}},
        {Quorlen731XXTriggerACLine,
         {":TRIG:MODE EDGE;EDGE:SOUR LINE;SLOP POS", ":TRIG:MODE EDGE"}},
        {Quorlen731XXTriggerPattern, {":TRIG:PATT 0,0;:TRIG:MODE PATT"}},
        {Quorlen731XXTriggerState, {":TRIG:PATT 0,0,CHAN1,POS;:TRIG:MODE PATT"}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.type);
        Open("73142A");
        for (const char* m : c.traffic) Expect({m});
        EXPECT_EQ(Trig()->put_Type(c.type), S_OK);
        EXPECT_TRUE(io_->Done());
        EXPECT_EQ(Got(Trig(), &IQuorlen731XXTrigger::get_Type), c.type);
    }
}

TEST_F(TriggerTraffic, RefusedTypesKeepThePreviousTypeAndSendNothing) {
    Open("73142A");
    Expect({":TRIG:MODE TV"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerTV), S_OK);
    struct Case {
        LONG type;
        HRESULT hr;
        const char* text;
    } cases[] = {
        {Quorlen731XXTriggerRunt, E_QUORLEN731XX_MODEL_NOT_SUPPORTED, "Runt Triggers"},
        {Quorlen731XXTriggerImmediate, E_QUORLEN731XX_MODEL_NOT_SUPPORTED, "Immediate Trigger"},
        {0, E_IVI_INVALID_VALUE, "put_Type"},
        {10, E_IVI_INVALID_VALUE, "put_Type"},
        {-1, E_IVI_INVALID_VALUE, "put_Type"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(Trig()->put_Type(static_cast<Quorlen731XXTriggerTypeEnum>(c.type)), c.hr);
        EXPECT_NE(ErrorText().find(c.text), std::string::npos) << c.type;
        EXPECT_EQ(Got(Trig(), &IQuorlen731XXTrigger::get_Type), Quorlen731XXTriggerTV) << c.type;
    }
    EXPECT_EQ(IviTrig()->put_Type(IviScopeTriggerRunt), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_EQ(Got(IviTrig(), &IIviScopeTrigger::get_Type), IviScopeTriggerTV);
}

// Each case writes a setting while Edge is current (nothing but the edge
// slope may go out), then selects the setting's type, which must send it.
TEST_F(TriggerTraffic, SettingsOfAnotherTypeWaitUntilTheirTypeIsSelected) {
    struct Case {
        const char* name;
        std::function<HRESULT(TriggerTest&)> write;
        Quorlen731XXTriggerTypeEnum type;
        std::vector<const char*> on_select;
    };
    const Case cases[] = {
        {"glitch width",
         [](TriggerTest& t) { return t.Glitch()->put_Width(1.2345678901234567e-06); },
         Quorlen731XXTriggerGlitch,
         {":TRIG:MODE GLIT", ":TRIG:GLIT:QUAL LESS;:TRIG:GLIT:POL POS",
          ":TRIG:GLIT:LESS 1.23456789012346e-06;:TRIG:GLIT:GRE 1.23456789012346e-06",
          ":TRIG:GLIT:LESS?|1.2e-06"}},
        {"glitch condition",
         [](TriggerTest& t) { return t.Glitch()->put_condition(Quorlen731XXGlitchGreaterThan); },
         Quorlen731XXTriggerGlitch,
         {":TRIG:MODE GLIT", ":TRIG:GLIT:QUAL GRE;:TRIG:GLIT:POL POS",
          ":TRIG:GLIT:LESS 0;:TRIG:GLIT:GRE 0", ":TRIG:GLIT:LESS?|2e-09"}},
        {"width low threshold",
         [](TriggerTest& t) { return t.Width()->put_ThresholdLow(-2.3456789012345678e-06); },
         Quorlen731XXTriggerWidth,
         {":TRIG:MODE DUR;:TRIG:DUR:QUAL INR;:TRIG:DUR:RANG -2.34567890123457e-06,0", "TRIG:DUR:PATT 1,1"}},
        {"width condition and polarity",
         [](TriggerTest& t) {
             HRESULT hr = t.Width()->put_condition(Quorlen731XXWidthOutside);
             return SUCCEEDED(hr) ? t.Width()->put_polarity(Quorlen731XXWidthNegative) : hr;
         },
         Quorlen731XXTriggerWidth,
         {":TRIG:MODE DUR;:TRIG:DUR:QUAL OUTR;:TRIG:DUR:RANG 0,0", "TRIG:DUR:PATT 0,1"}},
        {"AC-line slope",
         [](TriggerTest& t) { return t.AcLine()->put_Slope(Quorlen731XXACLineNegative); },
         Quorlen731XXTriggerACLine,
         {":TRIG:MODE EDGE;EDGE:SOUR LINE;SLOP NEG", ":TRIG:MODE EDGE"}},
        {"pattern analog mask",
         [](TriggerTest& t) { return t.Pattern()->put_AnalogMask(0x13); },
         Quorlen731XXTriggerPattern, {":TRIG:PATT 0,19;:TRIG:MODE PATT"}},
        {"pattern configure",
         [](TriggerTest& t) {
             return t.Pattern()->Configure(1, 3, 0, 0, Quorlen731XXPatternEnter);
         },
         Quorlen731XXTriggerPattern, {":TRIG:PATT 1,3;:TRIG:MODE PATT"}},
        {"state analog pattern",
         [](TriggerTest& t) { return t.State()->put_AnalogPattern(2); },
         Quorlen731XXTriggerState, {":TRIG:PATT 2,0,CHAN1,POS;:TRIG:MODE PATT"}},
        {"state clock slope",
         [](TriggerTest& t) { return t.State()->put_ClockSlope(Quorlen731XXTriggerSlopeEither); },
         Quorlen731XXTriggerState, {":TRIG:PATT 0,0,CHAN1,EITH;:TRIG:MODE PATT"}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Open("73142A");
        EXPECT_EQ(c.write(*this), S_OK);
        EXPECT_TRUE(io_->Done());
        for (const char* m : c.on_select) Expect({m});
        EXPECT_EQ(Trig()->put_Type(c.type), S_OK);
        EXPECT_TRUE(io_->Done());
    }
}

// With the type current and its settings sent, writing the value it already
// has sends nothing; writing a new value sends at once.
TEST_F(TriggerTraffic, WritesWhileTheTypeIsCurrentSendOnlyChanges) {
    Open("73142A");
    Expect({":TRIG:MODE GLIT", ":TRIG:GLIT:QUAL LESS;:TRIG:GLIT:POL POS",
            ":TRIG:GLIT:LESS 0;:TRIG:GLIT:GRE 0", ":TRIG:GLIT:LESS?|2e-09"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerGlitch), S_OK);
    // The coerced width read back is the shadow's: writing it is no change.
    EXPECT_EQ(Glitch()->put_Width(2e-09), S_OK);
    EXPECT_EQ(Glitch()->put_condition(Quorlen731XXGlitchLessThan), S_OK);
    EXPECT_EQ(Glitch()->put_polarity(Quorlen731XXGlitchPositive), S_OK);
    EXPECT_TRUE(io_->Done());
    Expect({"TRIG:GLIT:POL NEG", ":TRIG:MODE GLIT", ":TRIG:GLIT:QUAL LESS;:TRIG:GLIT:POL NEG",
            ":TRIG:GLIT:LESS 2e-09;:TRIG:GLIT:GRE 2e-09", ":TRIG:GLIT:LESS?|2e-09"});
    EXPECT_EQ(Glitch()->put_polarity(Quorlen731XXGlitchNegative), S_OK);
    EXPECT_TRUE(io_->Done());

    // The width writer always runs, and sends only what is pending.
    Expect({":TRIG:MODE DUR;:TRIG:DUR:QUAL INR;:TRIG:DUR:RANG 0,0", "TRIG:DUR:PATT 1,1"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerWidth), S_OK);
    EXPECT_EQ(Width()->put_condition(Quorlen731XXWidthWithin), S_OK);
    EXPECT_EQ(Width()->put_ThresholdHigh(0.0), S_OK);
    EXPECT_EQ(Width()->put_polarity(Quorlen731XXWidthPositive), S_OK);
    EXPECT_TRUE(io_->Done());
    Expect({":TRIG:MODE DUR;:TRIG:DUR:QUAL INR;:TRIG:DUR:RANG 0,3e-06", "TRIG:DUR:PATT 1,1"});
    EXPECT_EQ(Width()->put_ThresholdHigh(3e-06), S_OK);

    // The state clock source selects State; the same source again is no
    // change once sent.
    Expect({":TRIG:PATT 0,0,CHAN2,POS;:TRIG:MODE PATT"});
    com::Bstr ch2("UserChannel2");
    EXPECT_EQ(State()->put_ClockSource(ch2.get()), S_OK);
    EXPECT_EQ(State()->put_ClockSource(ch2.get()), S_OK);
    EXPECT_EQ(State()->put_DigitalMask(0), S_OK);
    EXPECT_TRUE(io_->Done());

    // The edge slope is sent whenever it is written while Edge is current.
    Expect({":TRIG:SLOP POS", ":TRIG:MODE EDGE", ":TRIG:SLOP POS"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerEdge), S_OK);
    EXPECT_EQ(Edge()->put_Slope(Quorlen731XXTriggerSlopePositive), S_OK);
}

TEST_F(TriggerTraffic, AFailedSendKeepsTheSettingsPending) {
    Open("73142A");
    Expect({":TRIG:PATT 0,0;:TRIG:MODE PATT"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerPattern), S_OK);
    io_->fail_next_write = true;
    EXPECT_TRUE(FAILED(Pattern()->put_DigitalPattern(1)));  // A = 2, D = 0: bit not used
    // Unchanged value, still pending: the writer tries again.
    Expect({":TRIG:PATT 0,0;:TRIG:MODE PATT"});
    EXPECT_EQ(Pattern()->put_DigitalPattern(1), S_OK);
    EXPECT_EQ(Pattern()->put_DigitalPattern(1), S_OK);
}

TEST_F(TriggerTraffic, EdgeAfterACLineGetsItsSourceBack) {
    Open("73142A");
    Expect({":TRIG:TV:SOUR CHAN2", ":TRIG:SOUR CHAN2;:TRIG:GLIT:SOUR CHAN2"});
    com::Bstr ch2("UserChannel2");
    ASSERT_EQ(Trig()->put_Source(ch2.get()), S_OK);
    Expect({":TRIG:MODE EDGE;EDGE:SOUR LINE;SLOP POS", ":TRIG:MODE EDGE"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerACLine), S_OK);
    Expect({":TRIG:MODE EDGE;EDGE:SOUR LINE;SLOP NEG"});
    EXPECT_EQ(AcLine()->put_Slope(Quorlen731XXACLineNegative), S_OK);
    Expect({":TRIG:EDGE:SOUR CHAN2", ":TRIG:SLOP POS", ":TRIG:MODE EDGE"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerEdge), S_OK);
    // Refused slopes send nothing and keep the stored one.
    EXPECT_EQ(AcLine()->put_Slope(Quorlen731XXACLineEither), E_IVI_INVALID_VALUE);
    EXPECT_EQ(Got(AcLine(), &IQuorlen731XXTriggerAcLine::get_Slope), Quorlen731XXACLineNegative);
}

TEST_F(TriggerTraffic, DurationPatternFollowsTheSourceAndTheInstrument) {
    struct Case {
        const char* model;
        const char* source;  // instrument name in the shadow
        Quorlen731XXWidthPolarityEnum polarity;
        const char* pattern;  // null: refused with `error` in the text
        const char* error;
    };
    const Case cases[] = {
        {"73142D", "CHAN2", Quorlen731XXWidthNegative, "TRIG:DUR:PATT 0,131072", nullptr},
        {"73142D", "CHAN1", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 65536,65536", nullptr},
        {"73142D", "DIG0", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 1,1", nullptr},
        {"73142D", "DIG15", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 32768,32768", nullptr},
        {"73142D", "LINE", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 0,0", nullptr},
        {"73142D", "EXT", Quorlen731XXWidthPositive, nullptr, "external"},
        {"73142D", "CHAN3", Quorlen731XXWidthPositive, nullptr, "Channel3"},
        {"73142A", "EXT", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 16,16", nullptr},
        {"73142A", "CHAN2", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 2,2", nullptr},
        {"73142A", "DIG3", Quorlen731XXWidthPositive, nullptr, "digital"},
        {"73124A", "CHAN4", Quorlen731XXWidthPositive, "TRIG:DUR:PATT 8,8", nullptr},
        {"73124A", "CHAN3", Quorlen731XXWidthNegative, "TRIG:DUR:PATT 0,4", nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.source) + " on " + c.model);
        Open(c.model);
        Shadow().source = c.source;
        Shadow().width_polarity = c.polarity;
        if (c.pattern) {
            Expect({":TRIG:MODE DUR;:TRIG:DUR:QUAL INR;:TRIG:DUR:RANG 0,0", c.pattern});
            EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerWidth), S_OK);
        } else {
            // Refused before the mode is sent; the settings stay pending.
            EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerWidth), E_IVI_INVALID_VALUE);
            EXPECT_NE(ErrorText().find(c.error), std::string::npos);
            EXPECT_TRUE(Shadow().width_pending);
        }
        EXPECT_TRUE(io_->Done());
    }
}

TEST_F(TriggerTraffic, RefusedValuesNeverEnterTheShadow) {
    Open("73142D");
    struct Case {
        const char* name;
        std::function<HRESULT(TriggerTest&)> write;
        HRESULT hr;
    };
    const Case cases[] = {
        {"edge slope 4", [](TriggerTest& t) { return t.Edge()->put_Slope(Quorlen731XXTriggerSlopeEnum(4)); }, E_IVI_INVALID_VALUE},
        {"glitch condition 3", [](TriggerTest& t) { return t.Glitch()->put_condition(Quorlen731XXGlitchConditionEnum(3)); }, E_IVI_INVALID_VALUE},
        {"glitch polarity either", [](TriggerTest& t) { return t.Glitch()->put_polarity(Quorlen731XXGlitchEither); }, E_IVI_INVALID_VALUE},
        {"width polarity either", [](TriggerTest& t) { return t.Width()->put_polarity(Quorlen731XXWidthEither); }, E_IVI_INVALID_VALUE},
        {"width condition 0", [](TriggerTest& t) { return t.Width()->put_condition(Quorlen731XXWidthConditionEnum(0)); }, E_IVI_INVALID_VALUE},
        {"pattern exit without sequence trigger", [](TriggerTest& t) { return t.Pattern()->put_condition(Quorlen731XXPatternExit); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED},
        {"pattern condition 2", [](TriggerTest& t) { return t.Pattern()->put_condition(Quorlen731XXPatternMatchingModeEnum(2)); }, E_IVI_INVALID_VALUE},
        {"state clock external", [](TriggerTest& t) { com::Bstr e("VAL_EXTERNAL"); return t.State()->put_ClockSource(e.get()); }, E_IVI_INVALID_VALUE},
        {"state clock slope -1", [](TriggerTest& t) { return t.State()->put_ClockSlope(Quorlen731XXTriggerSlopeEnum(-1)); }, E_IVI_INVALID_VALUE},
        {"glitch configure either", [](TriggerTest& t) { com::Bstr s("UserChannel1"); return t.Glitch()->Configure(s.get(), 1.0, 1e-6, Quorlen731XXGlitchEither, Quorlen731XXGlitchLessThan); }, E_IVI_INVALID_VALUE},
        {"width configure either", [](TriggerTest& t) { com::Bstr s("UserChannel1"); return t.Width()->Configure(s.get(), 1.0, 1e-6, 2e-6, Quorlen731XXWidthEither, Quorlen731XXWidthWithin); }, E_IVI_INVALID_VALUE},
        {"state configure external", [](TriggerTest& t) { com::Bstr s("VAL_EXTERNAL"); return t.State()->Configure(s.get(), 1.0, Quorlen731XXTriggerSlopePositive, 1, 1, 0, 0); }, E_IVI_INVALID_VALUE},
    };
    const auto fields = [](const TriggerShadow& s) {
        return std::make_tuple(s.type, s.edge_slope, s.glitch_condition, s.glitch_polarity,
                               s.width_polarity, s.width_condition, s.pattern_condition,
                               s.state_clock_source, s.state_clock_slope, s.state.analog_mask);
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        const auto before = fields(Shadow());
        EXPECT_EQ(c.write(*this), c.hr);
        EXPECT_FALSE(ErrorText().empty());
        EXPECT_EQ(fields(Shadow()), before);
    }
}

TEST_F(TriggerTraffic, PatternWordsFollowTheChannelCounts) {
    struct Case {
        const char* model;
        LONG analog_mask, analog_pattern, digital_mask, digital_pattern;
        const char* sent;
    };
    const Case cases[] = {
        {"73124A", 255, 0x21, 0xFFFF, 1, ":TRIG:PATT 1,31;:TRIG:MODE PATT"},
        {"73142A", 0xFF, 0x1C, 0xFF, 0, ":TRIG:PATT 16,19;:TRIG:MODE PATT"},
        {"73142D", 0x7, 0x2, 0x8001, 0x8000, ":TRIG:PATT 163840,229377;:TRIG:MODE PATT"},
        {"73142D", 0x10, 0x10, 0x0, 0x0, ":TRIG:PATT 0,0;:TRIG:MODE PATT"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.model);
        Open(c.model);
        EXPECT_EQ(Pattern()->Configure(c.analog_pattern, c.analog_mask, c.digital_pattern,
                                       c.digital_mask, Quorlen731XXPatternEnter),
                  S_OK);
        EXPECT_TRUE(io_->Done());  // nothing yet: Edge is current
        Expect({c.sent});
        EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerPattern), S_OK);
    }
    // The exit condition uses the sequence trigger where the instrument has it.
    Open("73124A");
    Features().sequence_trigger = true;
    EXPECT_EQ(Pattern()->Configure(1, 3, 0, 0, Quorlen731XXPatternExit), S_OK);
    Expect({":TRIG:SEQ:PATT1 1,3;:TRIG:SEQ:PATT2 1,3",
            ":TRIG:SEQ:FIND PATT1,ENT,NONE;TRIG PATT2,EXIT,NONE;RES NONE,NONE,NONE;:TRIG:MODE SEQ"});
    EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerPattern), S_OK);
}

TEST_F(TriggerTraffic, EveryRuntMemberFailsWithoutIo) {
    Open("73142A");
    Quorlen731XXRuntPolarityEnum polarity{};
    double v = 0;
    com::Bstr s("UserChannel1");
    IIviScopeTriggerRunt* ivi = driver_.get();
    const HRESULT results[] = {
        Runt()->get_polarity(&polarity),
        Runt()->put_polarity(Quorlen731XXRuntPolarityPositive),
        Runt()->get_ThresholdHigh(&v),
        Runt()->put_ThresholdHigh(1.0),
        Runt()->get_ThresholdLow(&v),
        Runt()->put_ThresholdLow(1.0),
        Runt()->Configure(s.get(), 0.0, 1.0, Quorlen731XXRuntPolarityNegative),
        ivi->put_polarity(IviScopeRuntPositive),
        ivi->Configure(s.get(), 0.0, 1.0, IviScopeRuntNegative),
    };
    for (HRESULT hr : results) EXPECT_EQ(hr, E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_EQ(io_->Written().size(), 2u);  // the identity queries only
}

}  // namespace
}  // namespace qn::test
