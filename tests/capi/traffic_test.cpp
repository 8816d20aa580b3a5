// The exact SCPI traffic of a representative function of each interface
// group, called through the C API on a driver bound to a strict scripted
// provider.
#include <gtest/gtest.h>

#include "Qn731XX.h"
#include "capi_fixture.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

class CTraffic : public ScriptedScopeTest {
protected:
    void OpenC(const char* model = "73141D") {
        Open(model);
        IUnknown* unknown = static_cast<IIviDriver*>(driver_.get());
        ASSERT_EQ(Qn731XX_AttachToExistingCOMSession(unknown, &vi_), VI_SUCCESS);
    }
    void TearDown() override {
        if (vi_) {
            EXPECT_EQ(Qn731XX_close(vi_), VI_SUCCESS);
        }
        ScriptedScopeTest::TearDown();
    }
    ViSession vi_ = 0;
};

TEST_F(CTraffic, ChannelAcquisitionAndStatusFunctionsSendTheirCommands) {
    OpenC();
    io_->Expect(":CHAN2:PROB 10\n")
        .Expect(":CHAN2:RANG 4\n")
        .Expect(":CHAN2:OFFS -1.5\n")
        .Expect(":CHAN2:COUP DC\n")
        .Expect(":CHAN2:DISP 1\n");
    EXPECT_EQ(Qn731XX_ConfigureChannel(vi_, "Channel2", 4.0, -1.5, QN731XX_VAL_VERTICAL_COUPLING_DC,
                                       10.0, 2),
              VI_SUCCESS)
        << RecordedError(vi_);
    ASSERT_TRUE(io_->Done());
    // A full-precision value reaches the wire with all its digits.
    io_->Expect(":CHAN1:OFFS -0.123456789012346\n");
    EXPECT_EQ(Qn731XX_SetAttributeViReal64(vi_, "Channel1", IVISCOPE_ATTR_VERTICAL_OFFSET,
                                           -0.12345678901234567),
              VI_SUCCESS);
    io_->Expect("*CLS\n");
    EXPECT_EQ(Qn731XX_StatusClear(vi_), VI_SUCCESS);
    io_->Expect(":CHAN3:RANG?\n", "2.5E+00\n");
    ViReal64 range = 0;
    // The class-compliant collection names its items Channel<n>.
    EXPECT_LT(Qn731XX_GetAttributeViReal64(vi_, "UserChannel3, Channel1",
                                           IVISCOPE_ATTR_VERTICAL_RANGE, &range),
              0);
    EXPECT_FALSE(RecordedError(vi_).empty());
    EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi_, "Channel3", IVISCOPE_ATTR_VERTICAL_RANGE, &range),
              VI_SUCCESS);
    EXPECT_EQ(range, 2.5);
    EXPECT_TRUE(io_->Done());
}

TEST_F(CTraffic, ARefusedValueSendsNothingAndLeavesTheSessionUsable) {
    OpenC();
    EXPECT_EQ(Qn731XX_SetAttributeViInt32(vi_, "UserChannel1", QN731XX_ATTR_CHANNEL_UNITS, 9),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(Qn731XX_SetAttributeViString(vi_, "UserChannel1", QN731XX_ATTR_CHANNEL_LABEL,
                                           "a\n:RST"),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_TRUE(io_->Written().size() == 2u) << "only the two identity queries";
    io_->Expect(":CHAN1:LAB \"ok\"\n");
    EXPECT_EQ(Qn731XX_SetAttributeViString(vi_, "UserChannel1", QN731XX_ATTR_CHANNEL_LABEL,
                                           "\"ok\""),
              VI_SUCCESS);
}


TEST_F(CTraffic, AMeasurementSelectsItsSourceAndCopiesOnlyAResult) {
    OpenC("73142D");
    io_->Expect(":STAT? CHAN2\n", "1\n").Expect(":MEAS:SOUR CHAN2\n");
    io_->Expect(":MEAS:FREQ?\n", "+1.00000000000000E+03\n");
    ViReal64 v = 0;
    EXPECT_EQ(Qn731XX_FetchWaveformMeasurement(vi_, "Channel2", QN731XX_VAL_MEASUREMENT_FREQUENCY, &v),
              VI_SUCCESS);
    EXPECT_EQ(v, 1000.0);
    // No result: the failure and its text, the caller's variable untouched.
    io_->Expect(":STAT? CHAN2\n", "1\n").Expect(":MEAS:SOUR CHAN2\n");
    io_->Expect(":MEAS:PER?\n", "9.9E+37\n");
    v = -3.0;
    EXPECT_EQ(Qn731XX_FetchWaveformMeasurement(vi_, "Channel2", QN731XX_VAL_MEASUREMENT_PERIOD, &v),
              IVISCOPE_ERROR_UNABLE_TO_PERFORM_MEASUREMENT);
    EXPECT_EQ(v, -3.0);
    EXPECT_FALSE(RecordedError(vi_).empty());
    // Refused before anything is sent.
    EXPECT_EQ(Qn731XX_FetchWaveformMeasurement(vi_, "Channel2", QN731XX_VAL_MEASUREMENT_PERIOD,
                                               nullptr),
              QN731XX_ERROR_FAILURE);
    char name[64];
    EXPECT_EQ(Qn731XX_MeasurementFunctionName(vi_, "UserChannel1",
                                              QN731XX_VAL_MEASUREMENT_DUTY_CYCLE_NEG, sizeof name,
                                              name),
              VI_SUCCESS);
    EXPECT_STREQ(name, "Neg Duty Cycle");
    EXPECT_TRUE(io_->Done());
}


TEST_F(CTraffic, SystemFunctionsSendTheirCommands) {
    OpenC();
    io_->Expect("*SAV 3\n");
    EXPECT_EQ(Qn731XX_SystemSaveState(vi_, "3"), VI_SUCCESS) << RecordedError(vi_);
    io_->Expect(":CDIS\n");
    EXPECT_EQ(Qn731XX_DisplayErase(vi_), VI_SUCCESS) << RecordedError(vi_);
    // A text that would end the message is refused before anything is sent.
    EXPECT_EQ(Qn731XX_SystemSaveState(vi_, "3\n*RST"), IVI_ERROR_INVALID_VALUE);
    ViByte bytes[4];
    ViInt32 actual = 0;
    EXPECT_EQ(Qn731XX_SystemGetState(vi_, -1, bytes, &actual), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(Qn731XX_SystemGetState(vi_, 4, bytes, nullptr), QN731XX_ERROR_FAILURE);
    EXPECT_TRUE(io_->Done());
}

}  // namespace
}  // namespace qn::test
