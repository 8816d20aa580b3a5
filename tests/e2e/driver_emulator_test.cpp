// The driver against the emulator over a real loopback socket.
#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "io/io_manager.h"

namespace qn::test {
namespace {

class DriverOnEmulator : public ::testing::Test {
protected:
    void SetUp() override { ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1); }
    void Start(const char* model) {
        emu_ = std::make_unique<emu::Emulator>(model);
        port_ = emu_->Start();
        driver_ = com::MakeComObject<Quorlen731XX>();
    }
    std::string Resource() const {
        return "TCPIP0::127.0.0.1::" + std::to_string(port_) + "::SOCKET";
    }
    HRESULT Init(const char* options = "", bool id_query = true, bool reset = false) {
        com::Bstr r(Resource()), o(options);
        return driver_->Initialize(r.get(), id_query ? VARIANT_TRUE : VARIANT_FALSE,
                                   reset ? VARIANT_TRUE : VARIANT_FALSE, o.get());
    }
    CDriverIOManager Io() { return qn::Io(*driver_.get()); }
    static std::string ErrorText() {
        com::ErrorRecord rec;
        return com::TakeThreadError(&rec) ? rec.description : std::string();
    }

    std::unique_ptr<emu::Emulator> emu_;
    std::uint16_t port_ = 0;
    ComPtr<Quorlen731XX> driver_;
};

TEST_F(DriverOnEmulator, IdentifiesAndChecksTheModel) {
    Start("QDS2014A");
    ASSERT_EQ(Init(), S_OK) << ErrorText();
    com::Bstr s;
    driver_->get_InstrumentManufacturer(s.Out());
    EXPECT_EQ(s.utf8(), "QUORLEN TECHNOLOGIES");
    driver_->get_InstrumentModel(s.Out());
    EXPECT_EQ(s.utf8(), "QDS2014A");
    driver_->get_IoResourceDescriptor(s.Out());
    EXPECT_EQ(s.utf8(), Resource());
    EXPECT_EQ(emu_->ReceivedMessages().front(), "*IDN?");
    EXPECT_EQ(driver_->Close(), S_OK);
}

TEST_F(DriverOnEmulator, BadCommandFailsWithStatusCheckAndIsReadBack) {
    Start("QDS4032A");
    ASSERT_EQ(Init("QueryInstrStatus=true"), S_OK) << ErrorText();
    EXPECT_EQ(Io().InstrWrite(":NO:SUCH:COMMand 1"), E_IVI_INSTRUMENT_STATUS);
    LONG code = 0;
    com::Bstr msg;
    ASSERT_EQ(driver_->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, -113);
    EXPECT_EQ(msg.utf8(), "Undefined header");
    ASSERT_EQ(driver_->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, 0);
}

TEST_F(DriverOnEmulator, ResetAndSelfTestTalkToTheInstrument) {
    Start("QMS3104A");
    ASSERT_EQ(Init("", true, /*reset=*/true), S_OK) << ErrorText();
    LONG result = -1;
    com::Bstr msg;
    EXPECT_EQ(driver_->SelfTest(&result, msg.Out()), S_OK);
    EXPECT_EQ(result, 0);
    EXPECT_EQ(msg.utf8(), "Selftest passed");
    auto log = emu_->ReceivedMessages();
    EXPECT_NE(std::find(log.begin(), log.end(), "*RST;*OPC?"), log.end());
    EXPECT_NE(std::find(log.begin(), log.end(), "*TST?"), log.end());
}

TEST_F(DriverOnEmulator, MissingReplyTimesOutAndTheSessionRecovers) {
    Start("QDS4032A");
    ASSERT_EQ(Init(), S_OK) << ErrorText();
    LONG before = 0;
    ASSERT_EQ(Io().GetIOTimeout(&before), S_OK);
    emu_->SuppressReplies(1);
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
}

TEST_F(DriverOnEmulator, TypedFormattedOperations) {
    Start("QDS4032A");
    ASSERT_EQ(Init(), S_OK) << ErrorText();
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
    // (this instrument has no command taking one, so it reports -113 for it).
    const BYTE bytes[] = {1, 2, 10, 3};
    emu_->ClearReceivedMessages();
    ASSERT_EQ(Io().FormattedWriteIEEEBlock(":NO:BLOCk ", bytes, 4, false), S_OK);
    ASSERT_EQ(Io().FormattedWriteString("\n", true), S_OK);
    LONG code = 0;
    com::Bstr msg;
    ASSERT_EQ(driver_->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, -113);
    ASSERT_FALSE(emu_->ReceivedMessages().empty());
    EXPECT_EQ(emu_->ReceivedMessages().front(), std::string(":NO:BLOCk #14\x01\x02\n\x03", 17));
    // A block of 16-bit words into a counted buffer, big-endian on the wire.
    emu_->ServeWaveformData(std::string("#16\x00\x01\xff\xfe\x80\x00", 9));
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
    Start("QDS4032A");
    ASSERT_EQ(Init(), S_OK) << ErrorText();
    std::string reply;  // the instrument ends each reply with a line feed
    emu_->ServeWaveformData(std::string(70000, '7'));
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &reply, 255), S_OK) << ErrorText();
    EXPECT_EQ(reply, std::string(255, '7'));
    emu_->ServeWaveformData("2.5" + std::string(200, '0'));
    double value = 0;
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &value), S_OK) << ErrorText();
    EXPECT_EQ(value, 2.5);
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 255), S_OK) << ErrorText();
    EXPECT_EQ(reply.rfind("QUORLEN TECHNOLOGIES,QDS4032A,", 0), 0u) << reply;
    // The status check reads its own reply, not the rest of the query's.
    driver_->Core().session.flags.query_instrument_status = true;
    emu_->ServeWaveformData(std::string(300, '4'));
    EXPECT_EQ(Io().InstrQuery(":WAV:DATA?", &reply, 10), S_OK) << ErrorText();
    EXPECT_EQ(reply, std::string(10, '4'));
}

TEST_F(DriverOnEmulator, DroppedConnectionIsAnIoError) {
    Start("QDS4032A");
    ASSERT_EQ(Init(), S_OK) << ErrorText();
    emu_->DropConnectionOnNextQuery();
    std::string reply;
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 256, 2000), E_QUORLEN731XX_IO_GENERAL);
    EXPECT_EQ(driver_->Close(), S_OK);
}

TEST_F(DriverOnEmulator, NothingListeningIsAnUnknownResource) {
    Start("QDS4032A");
    std::uint16_t port = port_;
    emu_->Stop();
    port_ = port;
    auto t0 = std::chrono::steady_clock::now();
    EXPECT_EQ(Init(), E_IVI_RESOURCE_UNKNOWN);
    EXPECT_LT(std::chrono::steady_clock::now() - t0, std::chrono::seconds(10));
    VARIANT_BOOL b = VARIANT_TRUE;
    driver_->get_Initialized(&b);
    EXPECT_EQ(b, VARIANT_FALSE);
    com::Bstr r("TCPIP0::no-such-host.invalid::5025::SOCKET"), o("");
    EXPECT_EQ(driver_->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()),
              E_IVI_RESOURCE_UNKNOWN);
    EXPECT_NE(ErrorText().find("Unknown resource."), std::string::npos);
}

}  // namespace
}  // namespace qn::test
