// Exact SCPI traffic of the general trigger settings (source, coupling,
// modifier, continuous) and of the TV trigger's line numbering, against the
// strict scripted provider.
#include <gtest/gtest.h>

#include <vector>

#include "tests/scope/trigger_fixture.h"

namespace qn::test {
namespace {

class TriggerSettings : public TriggerTest {};

TEST_F(TriggerSettings, SourceIsWrittenToEveryTypeThatTakesIt) {
    Open("73142D");
    struct Case {
        const char* name;
        std::vector<const char*> sent;  // empty: refused
    };
    const Case cases[] = {
        {"UserChannel2", {":TRIG:TV:SOUR CHAN2", ":TRIG:SOUR CHAN2;:TRIG:GLIT:SOUR CHAN2"}},
        {"Channel1", {":TRIG:TV:SOUR CHAN1", ":TRIG:SOUR CHAN1;:TRIG:GLIT:SOUR CHAN1"}},
        {"VAL_EXTERNAL", {":TRIG:SOUR EXT;:TRIG:GLIT:SOUR EXT"}},
        {"UserDigitalChannel12", {":TRIG:SOUR DIG12;:TRIG:GLIT:SOUR DIG12"}},
        {"UserChannel5", {}},
        {"CHAN1", {}},
        {"LINE", {}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        const std::string before = Shadow().source;
        for (const char* m : c.sent) Expect({m});
        com::Bstr name(c.name);
        EXPECT_EQ(Trig()->put_Source(name.get()), c.sent.empty() ? E_IVI_INVALID_VALUE : S_OK);
        EXPECT_TRUE(io_->Done());
        if (c.sent.empty()) {
            EXPECT_EQ(Shadow().source, before);
        }
    }
    EXPECT_EQ(Shadow().source, "DIG12");
    com::Bstr injected("UserChannel1\n:RST");
    EXPECT_EQ(Trig()->put_Source(injected.get()), E_IVI_INVALID_VALUE);
}

TEST_F(TriggerSettings, SourceIsReadFromTheCurrentTypesQuery) {
    struct Case {
        Quorlen731XXTriggerTypeEnum type;
        const char* query;
        const char* reply;
        const char* name;  // null: unexpected response
    };
    const Case cases[] = {
        {Quorlen731XXTriggerEdge, ":TRIG:SOUR?", "CHAN2", "UserChannel2"},
        {Quorlen731XXTriggerGlitch, ":TRIG:GLIT:SOUR?", "DIG12", "UserDigitalChannel12"},
        {Quorlen731XXTriggerTV, ":TRIG:TV:SOUR?", "CHAN1", "UserChannel1"},
        {Quorlen731XXTriggerState, ":TRIG:SOUR?", "EXT", "VAL_EXTERNAL"},
        {Quorlen731XXTriggerACLine, ":TRIG:SOUR?", "LINE", "LINE"},
        {Quorlen731XXTriggerEdge, ":TRIG:SOUR?", "CHAN", nullptr},
        {Quorlen731XXTriggerEdge, ":TRIG:SOUR?", "MATH", nullptr},
        {Quorlen731XXTriggerEdge, ":TRIG:SOUR?", "", nullptr},
    };
    Open("73142D");
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reply);
        Shadow().type = c.type;
        Expect({(std::string(c.query) + "|" + c.reply).c_str()});
        com::Bstr out;
        HRESULT hr = Trig()->get_Source(out.Out());
        if (c.name) {
            EXPECT_EQ(hr, S_OK);
            EXPECT_EQ(com::BstrToUtf8(out.get()), c.name);
        } else {
            EXPECT_EQ(hr, E_IVI_UNEXPECTED_RESPONSE);
            EXPECT_NE(ErrorText().find(c.query), std::string::npos);
        }
    }
}

TEST_F(TriggerSettings, CouplingIsReadThroughTheRejectFiltersFirst) {
    struct Case {
        std::vector<const char*> traffic;
        HRESULT hr;
        LONG driver;  // driver value
        LONG ivi;     // the class-compliant reading of the same replies
    };
    const Case cases[] = {
        {{":TRIG:REJ?|HFR"}, S_OK, Quorlen731XXTriggerCouplingHFReject, 3},
        {{":TRIG:REJ?|OFF", ":TRIG:NREJ?|1"}, S_OK, Quorlen731XXTriggerCouplingNoiseReject, 5},
        {{":TRIG:REJ?|OFF", ":TRIG:NREJ?|0", ":TRIG:COUP?|AC"}, S_OK, 0, 0},
        {{":TRIG:REJ?|OFF", ":TRIG:NREJ?|0", ":TRIG:COUP?|DC"}, S_OK, 1, 1},
        {{":TRIG:REJ?|LFR", ":TRIG:NREJ?|0", ":TRIG:COUP?|LFR"}, S_OK, 3, 4},
        {{":TRIG:REJ?|OFF", ":TRIG:NREJ?|2", ":TRIG:COUP?|TV"}, S_OK, 5,
         IviScopeTriggerCouplingInstrumentTV},
        {{":TRIG:REJ?|OFF", ":TRIG:NREJ?|0", ":TRIG:COUP?|GND"}, E_IVI_UNEXPECTED_RESPONSE, 0, 0},
    };
    Open("73142A");
    for (const Case& c : cases) {
        SCOPED_TRACE(c.traffic.back());
        for (const char* m : c.traffic) Expect({m});
        Quorlen731XXTriggerCouplingEnum d{};
        EXPECT_EQ(Trig()->get_Coupling(&d), c.hr);
        for (const char* m : c.traffic) Expect({m});
        IviScopeTriggerCouplingEnum i{};
        EXPECT_EQ(IviTrig()->get_Coupling(&i), c.hr);
        if (SUCCEEDED(c.hr)) {
            EXPECT_EQ(d, c.driver);
            EXPECT_EQ(i, c.ivi);
        }
    }
}

TEST_F(TriggerSettings, CouplingWritesOneCommandPerValue) {
    struct Case {
        LONG ivi;     // -1: not a class value to test
        LONG driver;  // -1: none
        const char* sent;
    };
    const Case cases[] = {
        {0, 0, ":TRIG:COUP AC;REJ OFF;NREJ OFF"},
        {1, 1, ":TRIG:COUP DC;REJ OFF;NREJ OFF"},
        {3, 2, ":TRIG:COUP DC;REJ HFR;NREJ OFF"},
        {4, 3, ":TRIG:COUP LFR;NREJ OFF"},
        {5, 4, ":TRIG:COUP DC;REJ OFF;NREJ ON"},
    };
    Open("73142A");
    for (const Case& c : cases) {
        Expect({c.sent, c.sent});
        EXPECT_EQ(Trig()->put_Coupling(Quorlen731XXTriggerCouplingEnum(c.driver)), S_OK);
        EXPECT_EQ(IviTrig()->put_Coupling(IviScopeTriggerCouplingEnum(c.ivi)), S_OK);
    }
    EXPECT_EQ(Trig()->put_Coupling(Quorlen731XXTriggerCouplingTV), E_QUORLEN731XX_SETTINGS_CONFLICT);
    EXPECT_FALSE(ErrorText().empty());
    EXPECT_EQ(Trig()->put_Coupling(Quorlen731XXTriggerCouplingEnum(-1)), E_IVI_INVALID_VALUE);
    for (LONG v : {2L, 6L, -1L, 1005L})
        EXPECT_EQ(IviTrig()->put_Coupling(IviScopeTriggerCouplingEnum(v)), E_IVI_INVALID_VALUE) << v;
}

TEST_F(TriggerSettings, ModifierAutoLevelNeedsTheFeature) {
    Open("73142A");  // no auto-level sweep
    EXPECT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierAutoLevel), E_IVI_INVALID_VALUE);
    EXPECT_NE(ErrorText().find("put_Modifier"), std::string::npos);
    for (LONG v : {0L, 4L})
        EXPECT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierEnum(v)), E_IVI_INVALID_VALUE);
    Expect({":TRIG:SWE NORM", ":TRIG:SWE AUTO"});
    EXPECT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierNone), S_OK);
    EXPECT_EQ(IviTrig()->put_Modifier(IviScopeTriggerModifierAuto), S_OK);

    Open("73122A");  // auto-level sweep
    Expect({":TRIG:SWE AUTL"});
    EXPECT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierAutoLevel), S_OK);
    struct Reply {
        const char* text;
        LONG value;  // 0: unexpected
    } replies[] = {{"NORM", 1}, {"AUTO", 2}, {"AUTL", 3}, {"TRIG", 0}, {"auto", 0}};
    for (const Reply& r : replies) {
        Expect({(std::string(":TRIG:SWE?|") + r.text).c_str()});
        Quorlen731XXTriggerModifierEnum m{};
        EXPECT_EQ(Trig()->get_Modifier(&m), r.value ? S_OK : E_IVI_UNEXPECTED_RESPONSE) << r.text;
        if (r.value) {
            EXPECT_EQ(m, r.value);
        }
    }
}

TEST_F(TriggerSettings, ContinuousIsTheRunBit) {
    Open("73142A");
    struct Case {
        bool early;
        const char* reply;
        VARIANT_BOOL running;
    } cases[] = {
        {true, "8", VARIANT_TRUE},     {true, "7", VARIANT_FALSE},
        {true, "65527", VARIANT_FALSE}, {false, "8", VARIANT_TRUE},
        {false, "40", VARIANT_TRUE},    {false, "0", VARIANT_FALSE},
    };
    for (const Case& c : cases) {
        Features().early_family = c.early;
        Expect({(std::string(c.early ? ":OPER?|" : ":OPER:COND?|") + c.reply).c_str()});
        VARIANT_BOOL v = 5;
        EXPECT_EQ(Trig()->get_Continuous(&v), S_OK);
        EXPECT_EQ(v, c.running) << c.reply;
    }
    Expect({":RUN", ":RUN", ":STOP", ":RUN"});
    EXPECT_EQ(Trig()->put_Continuous(VARIANT_TRUE), S_OK);
    EXPECT_EQ(Trig()->put_Continuous(1), S_OK);  // a C caller's true
    EXPECT_EQ(Trig()->put_Continuous(VARIANT_FALSE), S_OK);
    EXPECT_EQ(IviTrig()->put_Continuous(VARIANT_TRUE), S_OK);
}

TEST_F(TriggerSettings, ConfigureSelectsTheTypeThenTheHoldoff) {
    Open("73142A");
    Expect({":TRIG:MODE TV", ":TRIG:HOLD 1.23456789012346e-07"});
    EXPECT_EQ(IviTrig()->Configure(IviScopeTriggerTV, 1.2345678901234567e-07), S_OK);
    EXPECT_EQ(Trig()->Configure(Quorlen731XXTriggerImmediate, 1.0),
              E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    Expect({":TRIG:TV:SOUR CHAN2", ":TRIG:SOUR CHAN2;:TRIG:GLIT:SOUR CHAN2",
            ":TRIG:LEV -0.123456789012346"});
    com::Bstr ch2("UserChannel2");
    IIviScopeTriggerEdge* edge = driver_.get();
    EXPECT_EQ(edge->Configure(ch2.get(), -0.12345678901234567, IviScopeTriggerSlopeNegative), S_OK);
    // TV is current: the edge slope waits for Edge.
    Expect({":TRIG:SLOP NEG", ":TRIG:MODE EDGE"});
    EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerEdge), S_OK);
}

TEST_F(TriggerSettings, TvLinesAreSelectedThroughTheirField) {
    struct Case {
        const char* standard;  // reply to the standard query
        LONG line;
        std::vector<const char*> sent;  // empty: refused
    };
    // Each format's last line and the one after it (NTSC and PAL-M 525, PAL
    // and SECAM 625, generic 1024, 480p 525, 720p 750, 1080 lines 1125).
    const Case cases[] = {
        {"NTSC", 300, {":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 37"}},
        {"NTS", 263, {":TRIG:TV:MODE LINEF1;:TRIG:TV:LINE 263"}},
        {"NTSC", 264, {":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 1"}},
        {"NTSC", 525, {":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 262"}},
        {"NTSC", 526, {}},
        {"PAL", 625, {":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 625"}},
        {"PAL", 626, {}},
        {"SEC", 313, {":TRIG:TV:MODE LINEF1;:TRIG:TV:LINE 313"}},
        {"SEC", 626, {}},
        {"PALM", 264, {":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 264"}},
        {"PALM", 526, {}},
        {"GEN", 1024, {":TRIG:TV:MODE LINEF1;:TRIG:TV:LINE 1024"}},
        {"GEN", 1025, {}},
        {"P480L60HZ", 525, {":TRIG:TV:MODE LINE", ":TRIG:TV:LINE 525"}},
        {"P480L60HZ", 526, {}},
        {"P720L60HZ", 750, {":TRIG:TV:MODE LINE", ":TRIG:TV:LINE 750"}},
        {"P720L60HZ", 751, {}},
        {"P1080L24HZ", 1125, {":TRIG:TV:MODE LINE", ":TRIG:TV:LINE 1125"}},
        {"P1080L24HZ", 1126, {}},
        {"I1080L50HZ", 1125, {":TRIG:TV:MODE LINE", ":TRIG:TV:LINE 1125"}},
        {"I1080L50HZ", 1126, {}},
    };
    Open("73142A");
    Shadow().tv_event = Quorlen731XXTVEventLineNumber;
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.standard) + " " + std::to_string(c.line));
        const LONG before = Shadow().tv_line;
        Expect({(std::string("TRIG:TV:STAN?|") + c.standard).c_str()});
        for (const char* m : c.sent) Expect({m});
        EXPECT_EQ(Tv()->put_LineNumber(c.line), c.sent.empty() ? E_IVI_INVALID_VALUE : S_OK);
        EXPECT_EQ(Shadow().tv_line, c.sent.empty() ? before : c.line);
        EXPECT_TRUE(io_->Done());
    }
    EXPECT_EQ(Tv()->put_LineNumber(0), E_IVI_INVALID_VALUE);  // before any query
    // Another event takes the line number as it is.
    Shadow().tv_event = Quorlen731XXTVEventField1;
    Expect({"TRIG:TV:STAN?|NTSC", ":TRIG:TV:LINE 300"});
    EXPECT_EQ(Tv()->put_LineNumber(300), S_OK);
}

TEST_F(TriggerSettings, TvLineNumberReadsBackAcrossFields) {
    Open("73142A");
    struct Case {
        std::vector<const char*> traffic;
        LONG line;
    } cases[] = {
        {{"TRIG:TV:STAN?|NTSC", ":TRIG:TV:LINE?|37", ":TRIGger:TV:MODE?|LINEF2"}, 300},
        {{"TRIG:TV:STAN?|NTSC", ":TRIG:TV:LINE?|37", ":TRIGger:TV:MODE?|LINEF1"}, 37},
        {{"TRIG:TV:STAN?|PAL", ":TRIG:TV:LINE?|400"}, 400},
    };
    for (const Case& c : cases) {
        for (const char* m : c.traffic) Expect({m});
        EXPECT_EQ(Got(Tv(), &IQuorlen731XXTriggerTv::get_LineNumber), c.line);
    }
}

TEST_F(TriggerSettings, TvEventAndFormatResendTheLineSelection) {
    Open("73142A");
    // The start line is 1, so the line-number event works on a new session.
    Expect({"TRIG:TV:STAN?|PAL", ":TRIG:TV:MODE LINEF1;:TRIG:TV:LINE 1"});
    EXPECT_EQ(Tv()->put_Event(Quorlen731XXTVEventLineNumber), S_OK);
    Expect({"TRIG:TV:STAN?|PAL", ":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 600"});
    EXPECT_EQ(Tv()->put_LineNumber(600), S_OK);
    // NTSC has no line 600: the standard is sent, the line is refused.
    Expect({"TRIG:TV:STAN NTSC", "TRIG:TV:STAN?|NTSC"});
    EXPECT_EQ(Tv()->put_SignalFormat(Quorlen731XXTVSignalFormatNTSC), E_IVI_INVALID_VALUE);
    Expect({"TRIG:TV:STAN SEC", "TRIG:TV:STAN?|SEC", ":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 600"});
    EXPECT_EQ(Tv()->put_SignalFormat(Quorlen731XXTVSignalFormatSECAM), S_OK);
    Expect({":TRIG:TV:MODE ALLL"});
    EXPECT_EQ(Tv()->put_Event(Quorlen731XXTVEventAnyLine), S_OK);
    for (LONG v : {0L, 9L})
        EXPECT_EQ(Tv()->put_Event(Quorlen731XXTVTriggerEventEnum(v)), E_IVI_INVALID_VALUE);
    EXPECT_EQ(Tv()->put_SignalFormat(Quorlen731XXTVSignalFormatEnum(10)), E_IVI_INVALID_VALUE);
    EXPECT_EQ(Tv()->put_polarity(Quorlen731XXTVTriggerPolarityEnum(3)), E_IVI_INVALID_VALUE);
    EXPECT_EQ(Shadow().tv_event, Quorlen731XXTVEventAnyLine);
}

TEST_F(TriggerSettings, TvRepliesAreNormalisedBeforeTheLookup) {
    Open("73142A");
    struct Case {
        const char* query;
        const char* reply;
        LONG value;  // 0: unexpected response
    } cases[] = {
        {"TRIG:TV:MODE?", "LFI2", 5},  {"TRIG:TV:MODE?", "LINEF1", 5},
        {"TRIG:TV:MODE?", "FIE2", 2},  {"TRIG:TV:MODE?", "AFI", 3},
        {"TRIG:TV:MODE?", "FIE1", 1},  {"TRIG:TV:MODE?", "LFI1", 5},
        {"TRIG:TV:MODE?", "ALIN", 4},  {"TRIG:TV:MODE?", "LALT", 6},
        {"TRIG:TV:MODE?", "LVER", 7},  {"TRIG:TV:MODE?", "VERT", 8},
        {"TRIG:TV:MODE?", "LINEF3", 0}, {"TRIG:TV:STAN?", "NTS", 1},
        {"TRIG:TV:STAN?", "I1080L50HZ", 9}, {"TRIG:TV:STAN?", "SECAM", 0},
        {":TRIG:TV:POL?", "NEG", 2},   {":TRIG:TV:POL?", "EITH", 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reply);
        Expect({(std::string(c.query) + "|" + c.reply).c_str()});
        LONG v = 0;
        HRESULT hr = E_FAIL;
        if (c.query[8] == 'M') {
            Quorlen731XXTVTriggerEventEnum e{};
            hr = Tv()->get_Event(&e);
            v = e;
        } else if (c.query[8] == 'S') {
            Quorlen731XXTVSignalFormatEnum f{};
            hr = Tv()->get_SignalFormat(&f);
            v = f;
        } else {
            Quorlen731XXTVTriggerPolarityEnum p{};
            hr = Tv()->get_polarity(&p);
            v = p;
        }
        EXPECT_EQ(hr, c.value ? S_OK : E_IVI_UNEXPECTED_RESPONSE);
        if (c.value) {
            EXPECT_EQ(v, c.value);
        }
    }
}

TEST_F(TriggerSettings, WidthThresholdsReadBackAsWritten) {
    Open("73142A");
    struct Case {
        const char* reply;
        bool ok;
        double low, high;
    } cases[] = {
        {"\"1e-06\",\"2.5e-06\"", true, 1e-06, 2.5e-06},
        {"-1.2345678901234567e-09,3E-3", true, -1.2345678901234567e-09, 3e-3},
        {"1e-06", false, 0, 0},
        {"\"\",\"\"", false, 0, 0},
        {"abc,def", false, 0, 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reply);
        double low = 0, high = 0;
        Expect({(std::string("TRIG:DUR:RANG?|") + c.reply).c_str()});
        HRESULT hr_low = Width()->get_ThresholdLow(&low);
        Expect({(std::string("TRIG:DUR:RANG?|") + c.reply).c_str()});
        HRESULT hr_high = Width()->get_ThresholdHigh(&high);
        if (c.ok) {
            EXPECT_EQ(hr_low, S_OK);
            EXPECT_EQ(hr_high, S_OK);
            EXPECT_EQ(low, c.low);
            EXPECT_EQ(high, c.high);
        } else {
            EXPECT_EQ(hr_high, E_IVI_UNEXPECTED_RESPONSE);
        }
    }
}

TEST_F(TriggerSettings, GlitchReadsStoreTheInstrumentsSettings) {
    Open("73142A");
    Expect({":TRIG:GLIT:QUAL?|GRE", ":TRIG:EDGE:SLOP?|NEG", ":TRIG:GLIT:POL?|EITH"});
    Got(Glitch(), &IQuorlen731XXTriggerGlitch::get_condition);
    EXPECT_EQ(Shadow().glitch_condition, Quorlen731XXGlitchGreaterThan);
    Got(Edge(), &IQuorlen731XXTriggerEdge::get_Slope);
    EXPECT_EQ(Shadow().edge_slope, Quorlen731XXTriggerSlopeNegative);
    Quorlen731XXGlitchPolarityEnum polarity{};
    EXPECT_EQ(Glitch()->get_polarity(&polarity), E_IVI_UNEXPECTED_RESPONSE);
    EXPECT_NE(ErrorText().find("EITH"), std::string::npos);
    // Writing the condition just read is no change.
    EXPECT_EQ(Glitch()->put_condition(Quorlen731XXGlitchGreaterThan), S_OK);
}

// Every edge slope goes out as its own token and is read back from it.
TEST_F(TriggerSettings, EdgeSlopesTravelAsTheirTokens) {
    Open("73142A");
    Expect({":TRIG:SLOP POS", ":TRIG:MODE EDGE"});
    ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerEdge), S_OK);
    const std::pair<Quorlen731XXTriggerSlopeEnum, std::string> slopes[] = {
        {Quorlen731XXTriggerSlopeNegative, "NEG"},
        {Quorlen731XXTriggerSlopePositive, "POS"},
        {Quorlen731XXTriggerSlopeEither, "EITH"},
        {Quorlen731XXTriggerSlopeAlternate, "ALT"}};
    for (const auto& [slope, token] : slopes) {
        SCOPED_TRACE(token);
        Expect({(":TRIG:SLOP " + token).c_str(), (":TRIG:EDGE:SLOP?|" + token).c_str()});
        EXPECT_EQ(Edge()->put_Slope(slope), S_OK);
        EXPECT_EQ(Got(Edge(), &IQuorlen731XXTriggerEdge::get_Slope), slope);
    }
}

TEST_F(TriggerSettings, SimulatedSessionsKeepTheirValuesWithoutIo) {
    Open("73142A");
    ASSERT_EQ(driver_->put_Simulate(VARIANT_TRUE), S_OK);
    com::Bstr ch2("UserChannel2");
    EXPECT_EQ(Trig()->put_Type(Quorlen731XXTriggerGlitch), S_OK);
    EXPECT_EQ(Glitch()->Configure(ch2.get(), 0.5, 1e-6, Quorlen731XXGlitchNegative,
                                  Quorlen731XXGlitchGreaterThan),
              S_OK);
    EXPECT_EQ(State()->Configure(ch2.get(), 0.5, Quorlen731XXTriggerSlopeNegative, 1, 1, 0, 0),
              S_OK);
    EXPECT_EQ(Got(Trig(), &IQuorlen731XXTrigger::get_Type), Quorlen731XXTriggerGlitch);
    EXPECT_EQ(Got(Glitch(), &IQuorlen731XXTriggerGlitch::get_Width), 1e-6);
    EXPECT_EQ(io_->Written().size(), 2u);
}

}  // namespace
}  // namespace qn::test
