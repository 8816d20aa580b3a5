// The system members against the emulator over a loopback socket: setups
// that restore changed settings, the screen image, and the operation-complete
// wait against a peer that stays silent.
#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "emulator/emulator.h"

namespace qn::test {
namespace {

class SystemOnEmulator : public ::testing::Test {
protected:
    void SetUp() override {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        port_ = emu_.Start();
        driver_ = com::MakeComObject<Quorlen731XX>();
        com::Bstr r("TCPIP0::127.0.0.1::" + std::to_string(port_) + "::SOCKET"),
            o("QueryInstrStatus=true");
        ASSERT_EQ(driver_->Initialize(r.get(), VARIANT_TRUE, VARIANT_FALSE, o.get()), S_OK);
    }
    IQuorlen731XXSystem* System() { return driver_.get(); }
    IQuorlen731XXCursors* Cursors() { return driver_.get(); }
    IQuorlen731XXExternal* External() { return driver_.get(); }

    emu::Emulator emu_{"QDS4034A"};
    std::uint16_t port_ = 0;
    ComPtr<Quorlen731XX> driver_;
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
    double v = 0;
    EXPECT_EQ(External()->get_ProbeAttenuation(&v), S_OK);
    EXPECT_EQ(v, 20.0);
    EXPECT_EQ(Cursors()->get_X1Position(&v), S_OK);
    EXPECT_EQ(v, -1.2345678901234e-6);
    // A setup the instrument refuses fails the status check and changes nothing.
    com::SafeArray bogus = com::SafeArray::Vector(VT_UI1, 3);
    EXPECT_EQ(System()->PutState(bogus.get()), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(External()->get_ProbeAttenuation(&v), S_OK);
    EXPECT_EQ(v, 20.0);
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
    emu_.SuppressReplies(1);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(System()->WaitForOperationComplete(300), E_QUORLEN731XX_MAX_TIME_EXCEEDED);
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
    VARIANT_BOOL polling = VARIANT_FALSE;
    EXPECT_EQ(driver_->get_QueryInstrumentStatus(&polling), S_OK);
    EXPECT_EQ(polling, VARIANT_TRUE);
    LONG timeout = 0;
    EXPECT_EQ(System()->get_TimeoutMilliseconds(&timeout), S_OK);
    EXPECT_EQ(timeout, 20000);
    // The session is in step again: the next wait succeeds and a query reads its own reply.
    EXPECT_EQ(System()->WaitForOperationComplete(2000), S_OK);
    com::Bstr date;
    EXPECT_EQ(System()->get_Date(date.Out()), S_OK);
    EXPECT_EQ(date.utf8(), "+2026,+1,+1");
}

}  // namespace
}  // namespace qn::test
