// The exact SCPI traffic of the measurement members (the measurement
// objects, the reference levels, the configurable and two-source
// measurements) against a strict scripted provider, on the mixed-signal
// 73142D (four analog, sixteen digital channels) unless a case says otherwise.
#include <gtest/gtest.h>

#include <functional>
#include <iterator>
#include <tuple>

#include "io/io_manager.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

constexpr double kNoResult = 9.9e37;

class MeasurementTraffic : public ScriptedScopeTest {
protected:
    ComPtr<IQuorlen731XXMeasurement> Meas(const char* name) {
        return ChannelNamed<IQuorlen731XXMeasurements, IQuorlen731XXMeasurement>(*driver_.get(),
                                                                                name);
    }
    ComPtr<IIviScopeMeasurement> IviMeas(const char* name) {
        return ChannelNamed<IIviScopeMeasurements, IIviScopeMeasurement>(*driver_.get(), name);
    }
    IQuorlen731XXReferenceLevel* Ref() { return driver_.get(); }
    IQuorlen731XXConfigurableMeasurement* Conf() { return driver_.get(); }
    IQuorlen731XXMultiWaveformMeasurement* Multi() { return driver_.get(); }
    // The selection every measurement of a displayed source starts with.
    void ExpectSelected(const std::string& source) {
        io_->Expect(":STAT? " + source + "\n", "1\n").Expect(":MEAS:SOUR " + source + "\n");
    }
};

TEST_F(MeasurementTraffic, EachFormPutsItsParametersIntoTheQuery) {
    Open("73142D");
    struct Case {
        Quorlen731XXMeasurementEnum function;
        const char* query;
        const char* reply;
        double value;
        HRESULT hr;
    };
    // A new session measures the first rising edge and level 1 at time 0.
    const Case fresh[] = {
        {Quorlen731XXMeasurementTimeOfEdge, ":MEAS:TEDG? 1, CHAN2\n", "1E-3\n", 1e-3, S_OK},
        {Quorlen731XXMeasurementTimeAtValue, ":MEAS:TVAL? 1, 1, CHAN2\n", "2E-3\n", 2e-3, S_OK},
        {Quorlen731XXMeasurementValueAtTime, ":MEAS:VTIM? 0,CHAN2\n", "0.5\n", 0.5, S_OK},
    };
    const Case configured[] = {
        {Quorlen731XXMeasurementFrequency, ":MEAS:FREQ?\n", "+1.00000000000000E+03\n", 1000.0,
         S_OK},
        {Quorlen731XXMeasurementVoltageCycleRMS, ":MEAS:VRMS?\n", "0.70710678118654757\n",
         0.70710678118654757, S_OK},
        {Quorlen731XXMeasurementDutyCycleNeg, ":MEAS:DUTY?\n", "30\n", 70.0, S_OK},
        {Quorlen731XXMeasurementDutyCyclePos, ":MEAS:DUTY?\n", "30\n", 30.0, S_OK},
        // No result: the value stays in the output, also where it would be complemented.
        {Quorlen731XXMeasurementDutyCycleNeg, ":MEAS:DUTY?\n", "9.9E+37\n", kNoResult,
         E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT},
        {Quorlen731XXMeasurementPeriod, ":MEAS:PER?\n", "9.9E+37\n", kNoResult,
         E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT},
        {Quorlen731XXMeasurementPeriod, ":MEAS:PER?\n", "9.8999999999999E+37\n",
         9.8999999999999e37, S_OK},
        {Quorlen731XXMeasurementTimeOfEdge, ":MEAS:TEDG? -2, CHAN2\n", "-4E-6\n", -4e-6, S_OK},
        {Quorlen731XXMeasurementTimeAtValue,
         ":MEAS:TVAL? -0.123456789012345, 3, CHAN2\n", "1\n", 1.0, S_OK},
        {Quorlen731XXMeasurementValueAtTime, ":MEAS:VTIM? -1.23456789012346e-06,CHAN2\n",
         "-0.25\n", -0.25, S_OK},
    };
    ComPtr<IQuorlen731XXMeasurement> m = Meas("UserChannel2");
    auto run = [&](const Case& c) {
        SCOPED_TRACE(c.query);
        ExpectSelected("CHAN2");
        io_->Expect(c.query, c.reply);
        double v = 0;
        EXPECT_EQ(m->FetchWaveformMeasurement(c.function, &v), c.hr);
        EXPECT_EQ(v, c.value);
        EXPECT_TRUE(io_->Done());
    };
    for (const Case& c : fresh) run(c);
    EXPECT_EQ(Conf()->put_TimeAtEdgeOccurrence(2), S_OK);
    EXPECT_EQ(Conf()->put_TimeAtEdgeSlope(Quorlen731XXMeasurementSlopeNegative), S_OK);
    EXPECT_EQ(Conf()->put_TimeAtValueOccurrence(3), S_OK);
    EXPECT_EQ(Conf()->put_TimeAtValueValue(-0.123456789012345), S_OK);
    EXPECT_EQ(Conf()->put_ValueAtTimeTime(-1.2345678901234567e-6), S_OK);
    for (const Case& c : configured) run(c);
}

TEST_F(MeasurementTraffic, TwoSourceFormsUseTheInstrumentsSecondSource) {
    Open("73142D");
    ComPtr<IQuorlen731XXMeasurement> m = Meas("UserChannel1");
    double v = 0;
    ExpectSelected("CHAN1");
    io_->Expect(":MEAS:SOUR?\n", "CHAN1,CHAN3\n");
    ExpectSelected("CHAN3");
    io_->Expect(":MEAS:DEL? CHAN1,CHAN3\n", "-2.5E-4\n");
    EXPECT_EQ(m->FetchWaveformMeasurement(Quorlen731XXMeasurementDelay, &v), S_OK);
    EXPECT_EQ(v, -2.5e-4);

    struct Case {
        const char* sources;
        bool asks_display;
    } refused[] = {{"CHAN1,CHAN4\n", true}, {"CHAN1\n", false}, {"CHAN1,CHAN2;*RST\n", false},
                   {"CHAN1, \n", false}};
    for (const auto& c : refused) {
        SCOPED_TRACE(c.sources);
        ExpectSelected("CHAN1");
        io_->Expect(":MEAS:SOUR?\n", c.sources);
        if (c.asks_display) io_->Expect(":STAT? CHAN4\n", "0\n");
        v = 1;
        EXPECT_EQ(m->FetchWaveformMeasurement(Quorlen731XXMeasurementPhase, &v),
                  E_IVISCOPE_CHANNEL_NOT_ENABLED);
        EXPECT_TRUE(io_->Done());
    }
}

// The measurement functions as documented: the query token of the plain
// forms (null for the others), the name, and whether a digital, an external
// and the math object take it (an analog channel takes every function).
struct Function {
    const char* token;
    const char* name;
    bool digital, external, math;
};
const Function kFunctions[] = {
    {"RIS", "Rise Time", 0, 0, 1},          {"FALL", "Fall Time", 0, 0, 1},
    {"FREQ", "Frequency", 1, 0, 1},         {"PER", "Period", 1, 0, 1},
    {"VRMS", "RMS", 0, 0, 1},               {"VPP", "Peak-To-Peak", 0, 1, 1},
    {"VMAX", "Maximum", 0, 1, 1},           {"VMIN", "Minimum", 0, 1, 1},
    {"VTOP", "Top", 0, 0, 1},               {"VBAS", "Base", 0, 0, 1},
    {"VAV", "Y Average", 0, 1, 1},          {"NWID", "Neg Width", 1, 0, 1},
    {"PWID", "Pos Width", 1, 0, 1},         {"DUTY", "Neg Duty Cycle", 1, 0, 1},
    {"DUTY", "Pos Duty Cycle", 1, 0, 1},    {"VAMP", "Amplitude", 0, 0, 1},
    {"VRMS", "Cycle Y RMS", 0, 0, 1},       {"VAV", "Cycle Y Average", 0, 0, 1},
    {"OVER", "OverShoot", 0, 0, 1},         {"PRES", "Preshoot", 0, 0, 1},
    {"COUN", "Frequency Counter", 1, 0, 0}, {"XMAX", "X At Max", 0, 1, 1},
    {"XMIN", "X At Min", 0, 1, 1},          {nullptr, "Delay", 0, 0, 1},
    {nullptr, "Phase", 0, 0, 1},            {nullptr, "Value At X", 0, 0, 1},
    {nullptr, "X At Value", 0, 0, 1},       {nullptr, "X Of Edge", 1, 0, 1},
};

// Every function on every kind of object: refused ones fail before any
// traffic (the read member too, before acquiring), taken plain ones query
// their token on the object's source.
TEST_F(MeasurementTraffic, EveryFunctionHasItsTokenNameAndObjects) {
    Open("73142D");
    // The first two class-compliant-named measurements become the math and
    // the external object, as on a model with those inputs.
    driver_->Core().repcaps.math_measurements = {1, 1};
    driver_->Core().repcaps.external_measurements = {2, 2};
    for (LONG value = 0; value < LONG(std::size(kFunctions)); ++value) {
        const Function& f = kFunctions[value];
        const auto function = static_cast<Quorlen731XXMeasurementEnum>(value);
        SCOPED_TRACE(f.name);
        com::Bstr name;
        EXPECT_EQ(Meas("UserChannel1")->FunctionName(function, name.Out()), S_OK);
        EXPECT_EQ(name.utf8(), f.name);
        const std::tuple<const char*, const char*, bool> objects[] = {
            {"UserChannel4", "CHAN4", true},
            {"UserDigitalChannel15", "DIG15", f.digital},
            {"Channel2", "CHAN2", f.external},
            {"Channel1", "MATH", f.math}};
        for (const auto& [object, source, taken] : objects) {
            SCOPED_TRACE(object);
            if (taken && !f.token) continue;  // the other forms have their own tests
            if (taken) {
                ExpectSelected(source);
                io_->Expect(std::string(":MEAS:") + f.token + "?\n", "1\n");
            }
            double v = 0;
            EXPECT_EQ(Meas(object)->FetchWaveformMeasurement(function, &v),
                      taken ? S_OK : E_IVI_INVALID_VALUE);
            if (taken) {
                EXPECT_EQ(v, function == Quorlen731XXMeasurementDutyCycleNeg ? 99.0 : 1.0);
            } else {
                const std::string text = ErrorText();
                EXPECT_NE(text.find("FetchWaveformMeasurement"), std::string::npos) << text;
                EXPECT_NE(text.find("MeasFunction"), std::string::npos) << text;
                EXPECT_EQ(Meas(object)->ReadWaveformMeasurement(
                              function, Quorlen731XXTimeOutEnum(100), &v),
                          E_IVI_INVALID_VALUE);
                EXPECT_NE(ErrorText().find("WaveformMeasurement"), std::string::npos);
            }
            EXPECT_TRUE(io_->Done());
        }
    }
    // Functions outside the set have no name and are refused everywhere.
    for (LONG bad : {28, -1}) {
        const auto function = static_cast<Quorlen731XXMeasurementEnum>(bad);
        com::Bstr name;
        double v = 0;
        EXPECT_EQ(Meas("UserChannel4")->FunctionName(function, name.Out()), E_IVI_INVALID_VALUE);
        EXPECT_EQ(name.utf8(), "");
        EXPECT_EQ(Meas("UserChannel4")->FetchWaveformMeasurement(function, &v),
                  E_IVI_INVALID_VALUE);
    }
    // A hidden source ends the measurement after the display check.
    io_->Expect(":STAT? CHAN3\n", "0\n");
    double v = 0;
    EXPECT_EQ(Meas("UserChannel3")->FetchWaveformMeasurement(Quorlen731XXMeasurementFrequency, &v),
              E_IVISCOPE_CHANNEL_NOT_ENABLED);
}

// Records the session timeout at each message.
class TimedScript : public ScriptedProvider {
public:
    std::vector<LONG> timeouts;

protected:
    HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) override {
        timeouts.push_back(SessionTimeout());
        return ScriptedProvider::RawWrite(data, count, written);
    }
};

TEST_F(MeasurementTraffic, TheGivenTimeoutHoldsForTheQueryAndIsRestoredOnEveryPath) {
    TimedScript* io = nullptr;
    driver_ = DriverOnScript(&io);
    io_ = io;
    const std::string idn = "QUORLEN TECHNOLOGIES,73142D,SN0001,2.10\n";
    io->Expect("*IDN?\n", idn).Expect("*IDN?\n", idn);
    com::Bstr r("scripted"), o("");
    ASSERT_EQ(driver_->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
    ASSERT_EQ(Io(*driver_.get()).SetIOTimeout(1234), S_OK);
    ComPtr<IIviScopeMeasurement> m = IviMeas("Channel2");
    for (bool fails : {false, true}) {
        io->timeouts.clear();
        io->Expect(":DIG\n");
        ExpectSelected("CHAN2");
        if (fails)
            io->ExpectTimeout(":MEAS:VPP?\n");
        else
            io->Expect(":MEAS:VPP?\n", "2.0\n");
        double v = 0;
        HRESULT hr = m->ReadWaveformMeasurement(IviScopeMeasurementVoltagePeakToPeak, 2500, &v);
        EXPECT_EQ(FAILED(hr), fails);
        EXPECT_EQ(io->timeouts, (std::vector<LONG>{1234, 1234, 1234, 2500}));
        EXPECT_EQ(io->SessionTimeout(), 1234);
    }
    // The fetch member measures under the session's own timeout.
    io->timeouts.clear();
    ExpectSelected("CHAN2");
    io->Expect(":MEAS:DUTY?\n", "25\n");
    double v = 0;
    EXPECT_EQ(m->FetchWaveformMeasurement(IviScopeMeasurementDutyCycleNeg, &v), S_OK);
    EXPECT_EQ(v, 75.0);
    EXPECT_EQ(io->timeouts, (std::vector<LONG>{1234, 1234, 1234}));
}

TEST_F(MeasurementTraffic, SimulatedResultsAreZeroAndNamesAreTheSame) {
    driver_ = SimulatedDriver("73142D");
    com::Bstr name;
    EXPECT_EQ(Meas("UserChannel1")->FunctionName(Quorlen731XXMeasurementTimeOfEdge, name.Out()),
              S_OK);
    EXPECT_EQ(name.utf8(), "X Of Edge");
    double v = 5;
    EXPECT_EQ(Meas("UserChannel1")->FetchWaveformMeasurement(Quorlen731XXMeasurementDelay, &v),
              S_OK);
    EXPECT_EQ(v, 0.0);
    v = 5;
    EXPECT_EQ(IviMeas("Channel1")->ReadWaveformMeasurement(IviScopeMeasurementFrequency, 10, &v),
              S_OK);
    EXPECT_EQ(v, 0.0);
    EXPECT_EQ(Meas("UserDigitalChannel1")->FetchWaveformMeasurement(
                  Quorlen731XXMeasurementRiseTime, &v),
              E_IVI_INVALID_VALUE);
}

TEST_F(MeasurementTraffic, ReferenceLevelWritesCompleteTheDefinitionFromTheInstrument) {
    Open("73142D");
    const char* percent = "THR,PERC,+90.0E+00,+50.0E+00,+10.0E+00\n";
    const char* absolute = "THR,ABS,1.5,0.5,-0.25\n";
    io_->Expect(":MEAS:DEF? THR\n", percent).Expect(":MEAS:DEF THR,PERC,90,50,20\n");
    EXPECT_EQ(Ref()->put_Low(20), S_OK);
    io_->Expect(":MEAS:DEF? THR\n", absolute)
        .Expect(":MEAS:DEF THR,ABS,12.3456789012345,0.5,-0.25\n");
    EXPECT_EQ(Ref()->put_High(12.3456789012345), S_OK);
    io_->Expect(":MEAS:DEF? THR\n", absolute).Expect(":MEAS:DEF THR,ABS,1.5,-0.125,-0.25\n");
    EXPECT_EQ(static_cast<IIviScopeReferenceLevel*>(driver_.get())->put_Mid(-0.125), S_OK);
    io_->Expect(":MEAS:DEF? THR\n", percent).Expect(":MEAS:DEF THR,PERC,89.75,50,10.5\n");
    EXPECT_EQ(Ref()->Configure(10.5, 50, 89.75), S_OK);

    io_->Expect(":MEAS:DEF? THR\n", absolute)
        .Expect(":MEAS:DEF? THR\n", absolute)
        .Expect(":MEAS:DEF? THR\n", absolute);
    EXPECT_EQ(Got(Ref(), &IQuorlen731XXReferenceLevel::get_High), 1.5);
    EXPECT_EQ(Got(driver_.get(), &IIviScopeReferenceLevel::get_Mid), 0.5);
    EXPECT_EQ(Got(Ref(), &IQuorlen731XXReferenceLevel::get_Low), -0.25);
    double high = 0, mid = 0;

    // Replies that are not a definition: the read fails, the write sends nothing.
    for (const char* bad : {"PERC,90,50,10\n", "THR,PERC,90,50\n", "THR,perc,90,50,10\n",
                            "THR,PERC,90,x,10\n", "THR,PERC,nan,50,10\n",
                            "THR,PERC,90,50,10,5\n", "\n"}) {
        SCOPED_TRACE(bad);
        io_->Expect(":MEAS:DEF? THR\n", bad).Expect(":MEAS:DEF? THR\n", bad);
        EXPECT_EQ(Ref()->get_Mid(&mid), E_IVI_UNEXPECTED_RESPONSE);
        EXPECT_EQ(Ref()->put_Mid(40), E_IVI_UNEXPECTED_RESPONSE);
        EXPECT_TRUE(io_->Done());
    }
    // An unknown mode still delivers the level it read.
    io_->Expect(":MEAS:DEF? THR\n", "THR,DIV,7,5,3\n").Expect(":MEAS:DEF? THR\n", "THR,DIV,7,5,3\n");
    EXPECT_EQ(Ref()->get_High(&high), E_IVI_UNEXPECTED_RESPONSE);
    EXPECT_EQ(high, 7.0);
    EXPECT_EQ(Ref()->put_High(8), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(MeasurementTraffic, DelayEdgesReadAndWriteAsSignedNumbers) {
    Open("73142D");
    using M = IQuorlen731XXMultiWaveformMeasurement;
    io_->Expect(":MEAS:DEF? DEL\n", "1,-2\n").Expect(":MEAS:DEF? DEL\n", "+1,-2\n");
    EXPECT_EQ(Got(Multi(), &M::get_DelaySlope2), Quorlen731XXMeasurementSlopeNegative);
    EXPECT_EQ(Got(Multi(), &M::get_DelayOccurence2), 2);
    LONG occurrence = 0;

    struct Write {
        const char* current;
        std::function<HRESULT()> put;
        const char* sent;
    } writes[] = {
        {"1,-2\n", [&] { return Multi()->put_DelayOccurence1(3); }, ":MEAS:DEF DEL,3,-2\n"},
        // An occurrence below 1 is never negated.
        {"0,5\n", [&] { return Multi()->put_DelaySlope1(Quorlen731XXMeasurementSlopeNegative); },
         ":MEAS:DEF DEL,0,5\n"},
        {"-4,-3\n", [&] { return Multi()->put_DelaySlope2(Quorlen731XXMeasurementSlopePositive); },
         ":MEAS:DEF DEL,-4,3\n"},
        {"-4,3\n",
         [&] { return Multi()->put_DelaySlope1(Quorlen731XXMeasurementSlopePositive); },
         ":MEAS:DEF DEL,4,3\n"},
        {"-4,3\n", [&] { return Multi()->put_DelayOccurence2(6); }, ":MEAS:DEF DEL,-4,6\n"},
    };
    for (const Write& w : writes) {
        SCOPED_TRACE(w.sent);
        io_->Expect(":MEAS:DEF? DEL\n", w.current)
            .Expect(":MEAS:DEL\n")
            .Expect(":MEAS:CLE\n")
            .Expect(w.sent);
        EXPECT_EQ(w.put(), S_OK);
        EXPECT_TRUE(io_->Done());
    }
    for (const char* bad : {"1\n", "1,2,3\n", "a,b\n", "0x10,1\n", "99999999999,1\n", "1.5,2\n",
                            "+-1,2\n", ",\n"}) {
        SCOPED_TRACE(bad);
        io_->Expect(":MEAS:DEF? DEL\n", bad).Expect(":MEAS:DEF? DEL\n", bad);
        EXPECT_EQ(Multi()->get_DelayOccurence1(&occurrence), E_IVI_UNEXPECTED_RESPONSE);
        EXPECT_EQ(Multi()->put_DelayOccurence1(1), E_IVI_UNEXPECTED_RESPONSE);
        EXPECT_TRUE(io_->Done());
    }
    // ConfigureDelay writes the whole definition without reading it, then the source.
    io_->Expect(":MEAS:DEL\n")
        .Expect(":MEAS:CLE\n")
        .Expect(":MEAS:DEF DEL,-2,1\n")
        .Expect(":MEAS:SOUR?\n", "CHAN1\n")
        .Expect(":MEAS:SOUR CHAN1,CHAN3\n");
    com::Bstr ch3("UserChannel3");
    EXPECT_EQ(Multi()->ConfigureDelay(ch3.get(), Quorlen731XXMeasurementSlopeNegative,
                                      Quorlen731XXMeasurementSlopePositive, 2, 1),
              S_OK);
}

TEST_F(MeasurementTraffic, SecondSourceMustBeAnAnalogChannel) {
    Open("73142D");
    struct Case {
        const char* name;
        const char* current;  // reply to ":MEAS:SOUR?", null: not asked
        const char* sent;     // null: refused
        HRESULT hr;
        const char* method;
    } cases[] = {
        {"UserChannel3", "CHAN2\n", ":MEAS:SOUR CHAN2,CHAN3\n", S_OK, ""},
        {"Channel4", "CHAN1,CHAN2\n", ":MEAS:SOUR CHAN1,CHAN4\n", S_OK, ""},
        {"VAL_EXTERNAL", nullptr, nullptr, E_IVI_INVALID_VALUE, "VirtualToSCPI"},
        {"UserDigitalChannel3", nullptr, nullptr, E_IVI_INVALID_VALUE,
         "PutSCPIMeasurementSources"},
        {"UserChannel2\n:RST", nullptr, nullptr, E_IVI_INVALID_VALUE, "put_Source2"},
        {"UserChannel2", "CHAN1;*RST\n", nullptr, E_IVI_UNEXPECTED_RESPONSE, ""},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        if (c.current) io_->Expect(":MEAS:SOUR?\n", c.current);
        if (c.sent) io_->Expect(c.sent);
        com::Bstr name(c.name);
        EXPECT_EQ(Multi()->put_Source2(name.get()), c.hr);
        if (*c.method) {
            EXPECT_NE(ErrorText().find(c.method), std::string::npos);
        }
        EXPECT_TRUE(io_->Done());
    }
    driver_->Core().virtual_names["probe"] = "UserChannel4";
    const std::pair<const char*, const char*> reads[] = {
        {"CHAN1,CHAN3\n", "UserChannel3"}, {"CHAN1\n", ""}, {"CHAN1, DIG12\n", "UserDigitalChannel12"}};
    for (const auto& [reply, name] : reads) {
        io_->Expect(":MEAS:SOUR?\n", reply);
        EXPECT_EQ(Got(Multi(), &IQuorlen731XXMultiWaveformMeasurement::get_Source2), name);
    }
}

TEST_F(MeasurementTraffic, ActivityCountersExistOnlyOnDigitalModels) {
    Open("73142D");
    LONG edges = 0, levels = 0;
    io_->Expect(":ACT\n").Expect(":ACT?\n", "12,-3\n");
    EXPECT_EQ(Multi()->ResetActivity(), S_OK);
    EXPECT_EQ(Multi()->ReadActivity(&edges, &levels), S_OK);
    EXPECT_EQ(edges, 12);
    EXPECT_EQ(levels, -3);
    for (const char* bad : {"12\n", "12,3,4\n", "x,3\n"}) {
        io_->Expect(":ACT?\n", bad);
        EXPECT_EQ(Multi()->ReadActivity(&edges, &levels), E_IVI_UNEXPECTED_RESPONSE) << bad;
    }
    Open("73142A");
    EXPECT_EQ(Multi()->ResetActivity(), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_EQ(Multi()->ReadActivity(&edges, &levels), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("ReadActivity"), std::string::npos);
}

TEST_F(MeasurementTraffic, SlopesOutsideTheirSetAreRefused) {
    Open("73142D");
    for (LONG bad : {-1, 2}) {
        const auto slope = static_cast<Quorlen731XXMeasurementSlopeEnum>(bad);
        EXPECT_EQ(Conf()->put_TimeAtEdgeSlope(slope), E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find("put_TimeAtEdgeSlope"), std::string::npos);
        EXPECT_EQ(Conf()->put_TimeAtValueSlope(slope), E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find("put_TimeAtValueSlope"), std::string::npos);
    }
    EXPECT_EQ(Got(Conf(), &IQuorlen731XXConfigurableMeasurement::get_TimeAtEdgeSlope),
              Quorlen731XXMeasurementSlopePositive);
}

TEST_F(MeasurementTraffic, SimulatedReferenceLevelsAndActivity) {
    driver_ = SimulatedDriver("73142D");
    using R = IIviScopeReferenceLevel;
    using M = IQuorlen731XXMultiWaveformMeasurement;
    EXPECT_EQ(Got(driver_.get(), &R::get_High), 90.0);
    EXPECT_EQ(static_cast<R*>(driver_.get())->Configure(15, 45, 85), S_OK);
    EXPECT_EQ(Got(Ref(), &IQuorlen731XXReferenceLevel::get_High), 85.0);
    EXPECT_EQ(Got(driver_.get(), &R::get_Mid), 45.0);
    EXPECT_EQ(Got(Ref(), &IQuorlen731XXReferenceLevel::get_Low), 15.0);
    EXPECT_EQ(Multi()->ResetActivity(), E_IVI_METHOD_NOT_SUPPORTED);
    LONG edges = 0, levels = 0;
    EXPECT_EQ(Multi()->ReadActivity(&edges, &levels), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    com::Bstr ch3("UserChannel3");
    EXPECT_EQ(Multi()->ConfigureDelay(ch3.get(), Quorlen731XXMeasurementSlopeNegative,
                                      Quorlen731XXMeasurementSlopePositive, 2, 4),
              S_OK);
    EXPECT_EQ(Got(Multi(), &M::get_Source2), "UserChannel3");
    EXPECT_EQ(Got(Multi(), &M::get_DelayOccurence2), 4);
}

}  // namespace
}  // namespace qn::test
