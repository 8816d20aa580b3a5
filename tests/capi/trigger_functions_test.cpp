// The trigger functions of the C API in simulation: the values they pass
// reach the trigger members at full precision.
#include "tests/capi/capi_fixture.h"

namespace qn::test {
namespace {

using CTrigger = CSessionTest;

TEST_F(CTrigger, ConfigureFunctionsReachTheTriggerMembers) {
    OpenSimulated();
    const ViReal64 level = -0.12345678901234567, holdoff = 2.5e-7;
    ASSERT_EQ(Qn731XX_ConfigureTrigger(vi_, 1, holdoff), VI_SUCCESS) << RecordedError(vi_);
    ASSERT_EQ(Qn731XX_ConfigureEdgeTriggerSource(vi_, "Channel2", level, 0), VI_SUCCESS)
        << RecordedError(vi_);
    ViReal64 got = 0;
    ASSERT_EQ(Qn731XX_GetAttributeViReal64(vi_, "", IVISCOPE_ATTR_TRIGGER_LEVEL, &got), VI_SUCCESS);
    EXPECT_EQ(got, level);
    ASSERT_EQ(Qn731XX_GetAttributeViReal64(vi_, "", IVISCOPE_ATTR_TRIGGER_HOLDOFF, &got),
              VI_SUCCESS);
    EXPECT_EQ(got, holdoff);
    ViInt32 slope = -1;
    ASSERT_EQ(Qn731XX_GetAttributeViInt32(vi_, "", IVISCOPE_ATTR_TRIGGER_SLOPE, &slope),
              VI_SUCCESS);
    EXPECT_EQ(slope, 0);

}

}  // namespace
}  // namespace qn::test
