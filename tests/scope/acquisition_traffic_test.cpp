// The exact SCPI traffic of the acquisition and timebase members against a
// strict scripted provider.
#include <gtest/gtest.h>

#include "scope/waveform_source.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

class AcquisitionTraffic : public ScriptedScopeTest {};

TEST_F(AcquisitionTraffic, PointCountsAboveTheModelLimitAskForTheMaximum) {
    struct Case {
        const char* model;
        LONG limit;  // 0: the model's own
        bool counted;
        LONG points;
        const char* sent;
    };
    const Case cases[] = {
        // A newer family's limit of 1000, with and without counted maximum points.
        {"73141D", 1000, false, 1000, ":WAV:POIN 1000\n"},
        {"73141D", 1000, false, 1001, ":WAV:POIN MAX\n"},
        {"73141D", 1000, true, 1001, ":WAV:POIN MAX, 1001\n"},
        {"73141D", 1000, true, 1, ":WAV:POIN 1\n"},
        // The early families' own limit of 2000.
        {"73122A", 0, false, 2000, ":WAV:POIN 2000\n"},
        {"73122A", 0, false, 2001, ":WAV:POIN MAX\n"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::to_string(c.points) + " on " + c.model);
        Open(c.model);
        if (c.limit) Features().waveform_point_limit = c.limit;
        Features().counted_maximum_points = c.counted;
        ExpectSourceDisplayed();
        io_->Expect(c.sent);
        EXPECT_EQ(Acq()->put_NumberOfPointsMin(c.points), S_OK) << ErrorText();
        EXPECT_TRUE(io_->Done());
    }
}

TEST_F(AcquisitionTraffic, StartTimeFollowsTheReferencePoint) {
    const std::tuple<const char*, const char*, double> cases[] = {{"LEFT", "2.5E-4", 1.5e-4},
                                                                  {"CENT", "-3E-4", -8e-4},
                                                                  {"RIGHT", "0", -9e-4},
                                                                  {"RIGH", "1E-3", 1e-4}};
    Open("73141D");
    for (auto [reference, position, start] : cases) {
        SCOPED_TRACE(reference);
        io_->Expect(":TIM:RANG?\n", "1E-3\n")
            .Expect(":TIM:POS?\n", std::string(position) + "\n")
            .Expect(":TIM:REF?\n", std::string(reference) + "\n");
        double t = 1;
        EXPECT_EQ(Acq()->get_StartTime(&t), S_OK);
        EXPECT_NEAR(t, start, 1e-15);
    }
    io_->Expect(":TIM:RANG?\n", "1E-3\n")
        .Expect(":TIM:REF?\n", "CENT\n")
        .Expect(":TIM:POS 0.000376543210987654\n");
    EXPECT_EQ(IviAcq()->put_StartTime(-1.2345678901234567e-4), S_OK);
    io_->Expect(":TIM:RANG?\n", "2E-3\n")
        .Expect(":TIM:REF?\n", "LEFT\n")
        .Expect(":TIM:POS 0.0012\n");
    EXPECT_EQ(Acq()->put_StartTime(0.001), S_OK);
}

TEST_F(AcquisitionTraffic, UnknownReferenceFailsWithoutWriting) {
    Open("73141D");
    io_->Expect(":TIM:RANG?\n", "1E-3\n").Expect(":TIM:REF?\n", "right\n");
    EXPECT_EQ(Acq()->put_StartTime(0.0), E_IVI_UNEXPECTED_RESPONSE);
    io_->Expect(":TIM:RANG?\n", "1E-3\n").Expect(":TIM:POS?\n", "0\n").Expect(":TIM:REF?\n", "\n");
    double t = 0;
    EXPECT_EQ(Acq()->get_StartTime(&t), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(AcquisitionTraffic, HiResIsAveragingOverOneAcquisition) {
    Open("73141D");
    // A new session averages over 8 acquisitions.
    io_->Expect(":ACQ:TYPE AVER;:ACQ:COUN 8\n");
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeAverage), S_OK);

    io_->Expect(":ACQ:TYPE AVER;:ACQ:COUN 1\n");
    EXPECT_EQ(IviAcq()->put_Type(IviScopeAcquisitionTypeHiRes), S_OK);
    // The count stays 1 while the type is HiRes: nothing is sent.
    EXPECT_EQ(Acq()->put_NumberOfAverages(16), S_OK);

    io_->Expect("ACQ:TYPE?\n", "AVER\n").Expect(":ACQ:COUN?\n", "1\n");
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_Type), Quorlen731XXAcquisitionTypeHiRes);
    io_->Expect("ACQ:TYPE?\n", "AVER\n").Expect(":ACQ:COUN?\n", "2\n");  // the least Average
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_Type),
              Quorlen731XXAcquisitionTypeAverage);

    // No longer HiRes: the count is sent and remembered for Average.
    io_->Expect(":ACQ:COUN 16\n").Expect(":ACQ:TYPE AVER;:ACQ:COUN 16\n");
    EXPECT_EQ(Acq()->put_NumberOfAverages(16), S_OK);
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeAverage), S_OK);
    io_->Expect(":ACQ:COUN?\n", "64\n").Expect(":ACQ:TYPE AVER;:ACQ:COUN 64\n");
    EXPECT_EQ(Got(IviAcq(), &IIviScopeAcquisition::get_NumberOfAverages), 64);
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeAverage), S_OK);
}

TEST_F(AcquisitionTraffic, CountReadWhileHiResIsNotTakenForAverage) {
    Open("73141D");
    io_->Expect(":ACQ:COUN 32\n").Expect(":ACQ:TYPE AVER;:ACQ:COUN 1\n").Expect(":ACQ:COUN?\n", "1\n");
    EXPECT_EQ(Acq()->put_NumberOfAverages(32), S_OK);
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeHiRes), S_OK);
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_NumberOfAverages), 1);
    io_->Expect(":ACQ:TYPE AVER;:ACQ:COUN 32\n");
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeAverage), S_OK);
}

TEST_F(AcquisitionTraffic, AcquisitionTypesWithAndWithoutTokens) {
    Open("73141D");
    io_->Expect(":ACQ:TYPE NORM\n").Expect(":ACQ:TYPE PEAK\n");
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeNormal), S_OK);
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypePeakDetect), S_OK);
    EXPECT_EQ(Acq()->put_Type(Quorlen731XXAcquisitionTypeEnvelope), E_IVI_INVALID_VALUE);
    EXPECT_EQ(ErrorText(), "Quorlen731XX: Invalid value (3) for method put_Type, parameter val.");
    EXPECT_EQ(Acq()->put_Type(static_cast<Quorlen731XXAcquisitionTypeEnum>(9)),
              E_IVI_INVALID_VALUE);
    // The refused Envelope did not replace PeakDetect: averages are still sent.
    io_->Expect(":ACQ:COUN 4\n");
    EXPECT_EQ(Acq()->put_NumberOfAverages(4), S_OK);

    Quorlen731XXAcquisitionTypeEnum type{};
    io_->Expect("ACQ:TYPE?\n", "PEAK\n").Expect("ACQ:TYPE?\n", "ENV\n");
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_Type),
              Quorlen731XXAcquisitionTypePeakDetect);
    EXPECT_EQ(Acq()->get_Type(&type), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(AcquisitionTraffic, InterpolationSetsVectorsAndSamplingMode) {
    Open("73141D");
    io_->Expect(":DISP:VECT OFF;:ACQuire:MODE ETIM\n").Expect(":DISP:VECT ON;:ACQuire:MODE RTIM\n");
    EXPECT_EQ(Acq()->put_Interpolation(Quorlen731XXInterpolationNone), S_OK);
    EXPECT_EQ(IviAcq()->put_Interpolation(IviScopeInterpolationSineX), S_OK);
    EXPECT_EQ(Acq()->put_Interpolation(Quorlen731XXInterpolationLinear), E_IVI_INVALID_VALUE);
    EXPECT_NE(ErrorText().find("put_Interpolation"), std::string::npos);

    IviScopeInterpolationEnum interpolation{};
    io_->Expect(":DISP:VECT?\n", "1\n").Expect(":DISP:VECT?\n", "2\n");
    EXPECT_EQ(Got(IviAcq(), &IIviScopeAcquisition::get_Interpolation), IviScopeInterpolationSineX);
    EXPECT_EQ(IviAcq()->get_Interpolation(&interpolation), E_IVI_UNEXPECTED_RESPONSE);

    Quorlen731XXSampleModeEnum mode{};
    io_->Expect(":ACQ:MODE?\n", "ETIM\n").Expect(":ACQ:MODE?\n", "SEGM\n");
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_SampleMode),
              Quorlen731XXSampleModeEquivalentTime);
    EXPECT_EQ(Acq()->get_SampleMode(&mode), E_IVI_UNEXPECTED_RESPONSE);
}

TEST_F(AcquisitionTraffic, SampleRateIsTheInverseIncrementOrZero) {
    Open("73141D");
    io_->Expect(":WAV:XINC?\n", "0\n").Expect(":WAV:XINC?\n", "2E-9\n");
    EXPECT_EQ(Got(Acq(), &IQuorlen731XXAcquisition::get_SampleRate), 0.0);
    EXPECT_DOUBLE_EQ(Got(IviAcq(), &IIviScopeAcquisition::get_SampleRate), 5e8);
}

TEST_F(AcquisitionTraffic, EnvelopesAreNotSupported) {
    Open("73141D");
    LONG n = 0;
    EXPECT_EQ(Acq()->get_NumberOfEnvelopes(&n), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Instrument model does not support this feature: "
              "get_NumberOfEnvelopes.");
    EXPECT_EQ(IviAcq()->put_NumberOfEnvelopes(2), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("put_NumberOfEnvelopes"), std::string::npos);
}

TEST_F(AcquisitionTraffic, ConfigureRecordStopsAtTheFirstFailure) {
    Open("73141D");
    Features().digital_channel_count = 0;
    io_->Expect(":TIM:RANG 0.00234567890123457\n")
        .Expect(":WAV:SOUR?\n", "CHAN1\n")
        .Expect(":STAT? CHAN1\n", "0\n")
        .Expect(":STAT? CHAN1\n", "0\n")
        .Expect(":STAT? CHAN2\n", "0\n")
        .Expect(":STAT? MATH\n", "0\n");
    EXPECT_EQ(IviAcq()->ConfigureRecord(0.0023456789012345678, 500, 0.0), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    EXPECT_EQ(ErrorText(), "Quorlen731XX: Specified channel is not enabled.");

    io_->Expect(":TIM:RANG 0.001\n");
    ExpectSourceDisplayed();
    io_->Expect(":WAV:POIN 500\n")
        .Expect(":TIM:RANG?\n", "1E-3\n")
        .Expect(":TIM:REF?\n", "CENT\n")
        .Expect(":TIM:POS 0.0005\n");
    EXPECT_EQ(Acq()->ConfigureRecord(0.001, 500, 0.0), S_OK);
}

TEST_F(AcquisitionTraffic, SourceSearchProbesChannelsThenPodsThenMath) {
    Open("73141D");
    Features().analog_channel_count = 4;
    // Only channel 3 displayed, the current source off.
    io_->Expect(":WAV:SOUR?\n", "CHAN1\n").Expect(":STAT? CHAN1\n", "0\n");
    for (const char* ch : {"CHAN1", "CHAN2"}) io_->Expect(":STAT? " + std::string(ch) + "\n", "0\n");
    io_->Expect(":STAT? CHAN3\n", "1\n").Expect(":WAV:SOUR CHAN3\n");
    EXPECT_EQ(EnsureWaveformSourceDisplayed(*driver_.get()), S_OK);

    // Only the second pod displayed: the first is probed once per digital
    // channel it carries. A blank source reply is not probed.
    io_->Expect(":WAV:SOUR?\n", "\n");
    for (int i = 1; i <= 4; ++i) io_->Expect(":STAT? CHAN" + std::to_string(i) + "\n", "0\n");
    for (int d = 0; d < 8; ++d) io_->Expect(":STAT? POD1\n", "0\n");
    io_->Expect(":STAT? POD2\n", "1\n").Expect(":WAV:SOUR POD2\n");
    EXPECT_EQ(EnsureWaveformSourceDisplayed(*driver_.get()), S_OK);

    // A failing probe ends the search with its error.
    io_->Expect(":WAV:SOUR?\n", "MATH\n").ExpectTimeout(":STAT? MATH\n");
    EXPECT_EQ(EnsureWaveformSourceDisplayed(*driver_.get()), E_QUORLEN731XX_IO_TIMEOUT);
}

TEST_F(AcquisitionTraffic, WaveformSourceIsSelectedOnlyWhenDisplayed) {
    Open("73141D");
    io_->Expect(":STAT? POD1\n", "0\n").Expect(":STAT? CHAN2\n", "1\n").Expect(":WAV:SOUR CHAN2\n");
    EXPECT_EQ(SetWaveformSource(*driver_.get(), "POD1"), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    EXPECT_EQ(SetWaveformSource(*driver_.get(), "CHAN2"), S_OK);
    bool displayed = true;
    io_->Expect(":STAT? CHAN1\n", "2\n");
    EXPECT_EQ(IsSourceDisplayed(*driver_.get(), "CHAN1", &displayed), S_OK);
    EXPECT_FALSE(displayed);
}

}  // namespace
}  // namespace qn::test
