// The driver against the emulator over a real loopback socket.
#include <gtest/gtest.h>

#include <algorithm>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "io/io_manager.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

class DriverOnEmulator : public ::testing::Test, protected EmulatedDriver {
protected:
    CDriverIOManager Io() { return qn::Io(*driver.get()); }
};

TEST_F(DriverOnEmulator, IdentifiesResetsAndSelfTests) {
    ASSERT_EQ(Open("QDS2014A", "", true, /*reset=*/true), S_OK) << ErrorText();
    using I = IIviDriverIdentity;
    EXPECT_EQ(Got(driver.get(), &I::get_InstrumentManufacturer), "QUORLEN TECHNOLOGIES");
    EXPECT_EQ(Got(driver.get(), &I::get_InstrumentModel), "QDS2014A");
    EXPECT_EQ(Got(driver.get(), &IIviDriverOperation::get_IoResourceDescriptor),
              SocketResource(port));
    LONG result = -1;
    com::Bstr msg;
    EXPECT_EQ(driver->SelfTest(&result, msg.Out()), S_OK);
    EXPECT_EQ(result, 0);
    EXPECT_EQ(msg.utf8(), "Selftest passed");
    const auto log = emu->ReceivedMessages();
    EXPECT_EQ(log.front(), "*IDN?");
    EXPECT_NE(std::find(log.begin(), log.end(), "*RST;*OPC?"), log.end());
    EXPECT_NE(std::find(log.begin(), log.end(), "*TST?"), log.end());
    EXPECT_EQ(driver->Close(), S_OK);
}

TEST_F(DriverOnEmulator, MissingReplyTimesOutAndTheSessionRecovers) {
    ASSERT_EQ(Open("QDS4032A"), S_OK) << ErrorText();
    LONG before = 0;
    ASSERT_EQ(Io().GetIOTimeout(&before), S_OK);
    emu->SuppressReplies(1);
    std::string reply;
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 256, 300), E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_NE(ErrorText().find("IO timeout error"), std::string::npos);
    bool timed_out = false;
    Io().IsTimeout(&timed_out);
    EXPECT_TRUE(timed_out);
    LONG after = 0;
    ASSERT_EQ(Io().GetIOTimeout(&after), S_OK);
    EXPECT_EQ(after, before);
    // The next query gets its own reply, not a late one.
    ASSERT_EQ(Io().InstrQuery("*ESE?", &reply, 256), S_OK);
    EXPECT_EQ(reply, "0");
    // A dropped connection is an I/O error, not a timeout.
    emu->DropConnectionOnNextQuery();
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 256, 2000), E_QUORLEN731XX_IO_GENERAL);
    EXPECT_EQ(driver->Close(), S_OK);
}

TEST_F(DriverOnEmulator, TypedFormattedOperations) {
    ASSERT_EQ(Open("QDS4032A"), S_OK) << ErrorText();
    // A number written after a command text, read back as a number.
    ASSERT_EQ(Io().FormattedWriteString("*ESE ", false), S_OK);
    ASSERT_EQ(Io().FormattedWriteNumber(LONG{36}, false), S_OK);
    ASSERT_EQ(Io().FormattedWriteString("\n", true), S_OK);  // nothing is appended
    ASSERT_EQ(Io().FormattedWriteString("*ESE?\n", true), S_OK);
    LONG ese = 0;
    ASSERT_EQ(Io().FormattedReadNumber(&ese, true), S_OK);
    EXPECT_EQ(ese, 36);
    // A list into a counted buffer: the preamble's ten fields, and a buffer
    // too short for them.
    double fields[10] = {};
    LONG n = 0;
    ASSERT_EQ(Io().FormattedWriteString(":WAV:PRE?\n", true), S_OK);
    ASSERT_EQ(Io().FormattedReadList(fields, 10, &n), S_OK);
    EXPECT_EQ(n, 10);
    EXPECT_GT(fields[4], 0.0);  // x increment
    ASSERT_EQ(Io().FormattedWriteString(":WAV:PRE?\n", true), S_OK);
    EXPECT_EQ(Io().FormattedReadList(fields, 3, &n), E_INVALIDARG);
    EXPECT_EQ(n, 3);
    // A list written after a command text sets a value the instrument reports.
    const double range[] = {0.002};
    ASSERT_EQ(Io().FormattedWriteString(":TIM:RANG ", false), S_OK);
    ASSERT_EQ(Io().FormattedWriteList(range, 1, ",", false), S_OK);
    ASSERT_EQ(Io().FormattedWriteString("\n", true), S_OK);
    double read_back = 0;
    ASSERT_EQ(Io().InstrQuery(":TIM:RANG?", &read_back), S_OK);
    EXPECT_EQ(read_back, 0.002);
    // A block written after a command: the bytes arrive as a definite block
    // (this instrument has no command taking one, so it reports -113 for it,
    // which the error query reads back once).
    const BYTE bytes[] = {1, 2, 10, 3};
    emu->ClearReceivedMessages();
    ASSERT_EQ(Io().FormattedWriteIEEEBlock(":NO:BLOCk ", bytes, 4, false), S_OK);
    ASSERT_EQ(Io().FormattedWriteString("\n", true), S_OK);
    LONG code = 0;
    com::Bstr msg;
    ASSERT_EQ(driver->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, -113);
    EXPECT_EQ(msg.utf8(), "Undefined header");
    ASSERT_FALSE(emu->ReceivedMessages().empty());
    EXPECT_EQ(emu->ReceivedMessages().front(), std::string(":NO:BLOCk #14\x01\x02\n\x03", 17));
    ASSERT_EQ(driver->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, 0);
    // A block of 16-bit words into a counted buffer, big-endian on the wire.
    emu->ServeWaveformData(std::string("#16\x00\x01\xff\xfe\x80\x00", 9));
    ASSERT_EQ(Io().FormattedWriteString(":WAV:DATA?\n", true), S_OK);
    SHORT words[8] = {};
    ASSERT_EQ(Io().FormattedReadIEEEBlock(words, 8, &n, false, true), S_OK);
    ASSERT_EQ(n, 3);
    EXPECT_EQ(words[0], 1);
    EXPECT_EQ(words[1], -2);
    EXPECT_EQ(words[2], -32768);
}

// A reply longer than the caller's limit is cut there and the rest of that
// reply is dropped: it must never be read as the reply to the next query.
TEST_F(DriverOnEmulator, OverlongReplyDoesNotLeakIntoTheNextQuery) {
    ASSERT_EQ(Open("QDS4032A"), S_OK) << ErrorText();
    std::string reply;  // the instrument ends each reply with a line feed
    emu->ServeWaveformData(std::string(70000, '7'));
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &reply, 255), S_OK) << ErrorText();
    EXPECT_EQ(reply, std::string(255, '7'));
    emu->ServeWaveformData("2.5" + std::string(200, '0'));
    double value = 0;
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &value), S_OK) << ErrorText();
    EXPECT_EQ(value, 2.5);
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 255), S_OK) << ErrorText();
    EXPECT_EQ(reply.rfind("QUORLEN TECHNOLOGIES,QDS4032A,", 0), 0u) << reply;
    // The status check reads its own reply, not the rest of the query's.
    driver->Core().session.flags.query_instrument_status = true;
    emu->ServeWaveformData(std::string(300, '4'));
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &reply, 10), S_OK) << ErrorText();
    EXPECT_EQ(reply, std::string(10, '4'));
}

TEST_F(DriverOnEmulator, NothingListeningIsAnUnknownResource) {
    ASSERT_EQ(Open("QDS4032A"), S_OK);
    driver->Close();
    emu->Stop();
    com::Bstr r(SocketResource(port)), o("");
    EXPECT_EQ(driver->Initialize(r.get(), VARIANT_TRUE, VARIANT_FALSE, o.get()),
              E_IVI_RESOURCE_UNKNOWN);
    EXPECT_NE(ErrorText().find("Unknown resource."), std::string::npos);
    VARIANT_BOOL b = VARIANT_TRUE;
    driver->get_Initialized(&b);
    EXPECT_EQ(b, VARIANT_FALSE);
}

}  // namespace
}  // namespace qn::test
