// The system members against the emulator over a loopback socket: setups
// that restore changed settings, the screen image, and the operation-complete
// wait against a peer that stays silent.
#include <gtest/gtest.h>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

class SystemOnEmulator : public ::testing::Test, protected EmulatedDriver {
protected:
    void SetUp() override { ASSERT_EQ(Open("QDS4034A", "QueryInstrStatus=true"), S_OK); }
    IQuorlen731XXSystem* System() { return driver.get(); }
    IQuorlen731XXCursors* Cursors() { return driver.get(); }
    IQuorlen731XXExternal* External() { return driver.get(); }
};

TEST_F(SystemOnEmulator, PutStateRestoresTheSettingsGetStateSaw) {
    ASSERT_EQ(External()->put_ProbeAttenuation(20.0), S_OK);
    ASSERT_EQ(Cursors()->put_X1Position(-1.2345678901234e-6), S_OK);
    SAFEARRAY* raw = nullptr;
    ASSERT_EQ(System()->GetState(&raw), S_OK);
    com::SafeArray setup(raw);
    ASSERT_GT(setup.size(), 0u);
    ASSERT_EQ(External()->put_ProbeAttenuation(2.0), S_OK);
    ASSERT_EQ(Cursors()->put_X1Position(0.5), S_OK);
    ASSERT_EQ(System()->PutState(setup.get()), S_OK);
    EXPECT_EQ(Got(External(), &IQuorlen731XXExternal::get_ProbeAttenuation), 20.0);
    EXPECT_EQ(Got(Cursors(), &IQuorlen731XXCursors::get_X1Position), -1.2345678901234e-6);
    // A setup the instrument refuses fails the status check and changes nothing.
    com::SafeArray bogus = com::SafeArray::Vector(VT_UI1, 3);
    EXPECT_EQ(System()->PutState(bogus.get()), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(Got(External(), &IQuorlen731XXExternal::get_ProbeAttenuation), 20.0);
}

TEST_F(SystemOnEmulator, ScreenBitmapIsABitmapFile) {
    SAFEARRAY* raw = nullptr;
    ASSERT_EQ(System()->GetScreenBitmap(&raw), S_OK);
    com::SafeArray bmp(raw);
    ASSERT_GT(bmp.size(), 54u);
    const auto* b = bmp.data<unsigned char>();
    EXPECT_EQ(b[0], 'B');
    EXPECT_EQ(b[1], 'M');
    EXPECT_EQ(ULONG(b[2] | b[3] << 8 | b[4] << 16 | b[5] << 24), bmp.size());
}

TEST_F(SystemOnEmulator, OperationCompleteTimesOutOnASilentPeerAndPollsAgain) {
    // A long session timeout: the wait must use its own, much shorter, time.
    ASSERT_EQ(System()->put_TimeoutMilliseconds(20000), S_OK);
    emu->SuppressReplies(1);
    EXPECT_EQ(System()->WaitForOperationComplete(300), E_QUORLEN731XX_MAX_TIME_EXCEEDED);
    EXPECT_TRUE(driver->Core().session.flags.query_instrument_status);
    EXPECT_EQ(Got(System(), &IQuorlen731XXSystem::get_TimeoutMilliseconds), 20000);
    // The session is in step again: the next wait succeeds and a query reads its own reply.
    EXPECT_EQ(System()->WaitForOperationComplete(2000), S_OK);
    EXPECT_EQ(Got(System(), &IQuorlen731XXSystem::get_Date), "+2026,+1,+1");
}

}  // namespace
}  // namespace qn::test
