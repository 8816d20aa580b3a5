// The exact SCPI traffic of the digital channel members against a strict
// scripted provider: commands carry the zero-based index, transfers select
// the channel's pod.
#include <gtest/gtest.h>

#include <vector>

#include "io/io_manager.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

class DigitalTraffic : public ScriptedScopeTest {
protected:
    ComPtr<IQuorlen731XXDigitalChannel> Dig(int d) {
        return ChannelNamed<IQuorlen731XXDigitalChannels, IQuorlen731XXDigitalChannel>(
            *driver_.get(), ("UserDigitalChannel" + std::to_string(d)).c_str());
    }
};

TEST_F(DigitalTraffic, PropertiesUseTheZeroBasedIndex) {
    Open("73142D");
    io_->Expect(":DIG9:DISP 1\n")
        .Expect(":DIG0:DISP 0\n")
        .Expect(":DIG15:THR -1.23456789012345\n")
        .Expect(":DIG9:LAB \"CLK\"\n");
    EXPECT_EQ(Dig(9)->put_Enabled(VARIANT_TRUE), S_OK);
    EXPECT_EQ(Dig(0)->put_Enabled(VARIANT_FALSE), S_OK);
    EXPECT_EQ(Dig(15)->put_Threshold(-1.23456789012345), S_OK);
    com::Bstr label("\"CLK\""), bad("\"A\"\n:DIG1:DISP 0");
    EXPECT_EQ(Dig(9)->put_Label(label.get()), S_OK);
    EXPECT_EQ(Dig(9)->put_Label(bad.get()), E_IVI_INVALID_VALUE);

    io_->Expect(":DIG9:DISP?\n", "1\n").Expect(":DIG8:THR?\n", "+1.4E+00\n");
    EXPECT_EQ(Got(Dig(9).get(), &IQuorlen731XXDigitalChannel::get_Enabled), VARIANT_TRUE);
    EXPECT_EQ(Got(Dig(8).get(), &IQuorlen731XXDigitalChannel::get_Threshold), 1.4);
}

TEST_F(DigitalTraffic, TransfersSelectThePodAndRestoreTheTimeout) {
    Open("73142D");
    ASSERT_EQ(Io(*driver_.get()).SetIOTimeout(4321), S_OK);
    SAFEARRAY* bytes = nullptr;
    double x0 = 1, dx = 1;
    // A hidden pod ends the transfer before any data command.
    io_->Expect(":STAT? POD2\n", "0\n");
    EXPECT_EQ(Dig(9)->FetchDigitalWaveform(&bytes, &x0, &dx), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    EXPECT_EQ(bytes, nullptr);
    // A preamble that does not parse fails under the given timeout, which is
    // put back afterwards; no array is produced.
    io_->Expect(":DIG\n")
        .Expect(":STAT? POD1\n", "1\n")
        .Expect(":WAV:SOUR POD1\n")
        .Expect(":WAV:FORM BYTE;UNS 1\n")
        .Expect(":WAV:PRE?\n", "garbage\n");
    EXPECT_EQ(Dig(7)->ReadDigitalWaveform(Quorlen731XXTimeOutEnum(2500), &bytes, &x0, &dx),
              E_IVI_UNEXPECTED_RESPONSE);
    EXPECT_EQ(bytes, nullptr);
    EXPECT_EQ(io_->SessionTimeout(), 4321);
    io_->Expect(":STAT? POD2\n", "1\n")
        .Expect(":WAV:SOUR POD2\n")
        .Expect(":WAV:FORM BYTE;UNS 1\n")
        .ExpectTimeout(":WAV:PRE?\n");
    EXPECT_EQ(Dig(8)->FetchDigitalWaveform(&bytes, &x0, &dx), E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_EQ(io_->SessionTimeout(), 4321);
}

TEST_F(DigitalTraffic, SimulatedTransfersGiveZeroBytes) {
    driver_ = SimulatedDriver("73142D");
    SAFEARRAY* a = nullptr;
    double x0 = 1, dx = 1;
    ASSERT_EQ(Dig(3)->ReadDigitalWaveform(Quorlen731XXTimeOutEnum(10), &a, &x0, &dx), S_OK);
    com::SafeArray bytes(a);
    EXPECT_EQ(std::vector<std::uint8_t>(bytes.data<std::uint8_t>(),
                                        bytes.data<std::uint8_t>() + bytes.size()),
              std::vector<std::uint8_t>(100, 0));
    EXPECT_EQ(x0, 0.0);
    EXPECT_EQ(dx, 0.0);
}

}  // namespace
}  // namespace qn::test
