#include "io/io_manager.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cmath>
#include <filesystem>
#include <functional>
#include <tuple>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "services/trace_document.h"
#include "tests/support/error_text.h"
#include "tests/support/scripted_driver.h"

namespace qn::test {
namespace {

class IoManagerTest : public ScriptedSessionTest<> {
  protected:
    void Open(const char* options = "") { ScriptedSessionTest::Open("73141D", options); }
    CDriverIOManager Io() { return qn::Io(*driver_.get()); }
};

TEST_F(IoManagerTest, InitializeIdentifiesTheInstrument) {
    Open();
    const InstrumentIdentity& id = driver_->Core().session.identity;
    EXPECT_EQ((std::vector<std::string>{id.manufacturer, id.model, id.serial_number,
                                        id.firmware_revision}),
              (std::vector<std::string>{"QUORLEN TECHNOLOGIES", "73141D", "SN0001", "2.10"}));
}

// Each error bit of the event status register alone fails the check, the
// other bits and an unreadable reply do not; without the check no *ESR? is sent.
TEST_F(IoManagerTest, StatusCheckFailsOnErrorBitsOnly) {
    Open("QueryInstrStatus=true");
    const std::pair<const char*, HRESULT> cases[] = {
        {"+1", S_OK},
        {"+2", S_OK},
        {"+64", S_OK},
        {"+128", S_OK},
        {"garbage", S_OK},
        {"+8", E_IVI_INSTRUMENT_STATUS},
        {"16", E_IVI_INSTRUMENT_STATUS},
        {"32", E_IVI_INSTRUMENT_STATUS},
        {"+60", E_IVI_INSTRUMENT_STATUS},
        {"+4", E_IVI_INSTRUMENT_STATUS},
    };
    for (auto [esr, expected] : cases) {
        io_->AnswerStatusWith(esr);
        io_->Expect(":RUN\n");
        EXPECT_EQ(Io().InstrWrite(":RUN"), expected) << esr;
    }
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Instrument error detected.  Use ErrorQuery() to determine the "
              "error(s).");
    driver_->Core().session.flags.query_instrument_status = false;
    const std::size_t before = io_->Written().size();
    io_->Expect(":RUN\n").ExpectTimeout(":ACQ:COUN?\n");
    EXPECT_EQ(Io().InstrWrite(":RUN"), S_OK);
    LONG v = 0;
    EXPECT_EQ(Io().InstrQuery(":ACQ:COUN?", &v), E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_EQ(io_->Written().size(), before + 2);
}

TEST_F(IoManagerTest, TerminatorIsAppendedOnceAndStrippedOnce) {
    Open();
    io_->Expect("*CLS\n").Expect(":A\n").Expect(":B?\n", "x\n\n");
    EXPECT_EQ(Io().InstrWrite("*CLS\n"), S_OK);
    EXPECT_EQ(Io().InstrWrite(":A"), S_OK);
    std::string reply;
    EXPECT_EQ(Io().InstrQuery(":B?", &reply, 100), S_OK);
    EXPECT_EQ(reply, "x\n");
}

// Whole numbers are cut toward zero (an empty reply is 0); reals keep every
// digit, and a word is NaN.
TEST_F(IoManagerTest, NumericRepliesConvertByType) {
    Open();
    for (auto [reply, want] :
         {std::pair<const char*, LONG>{"\n", 0}, {"2.7\n", 2}, {"-2.7\n", -2}}) {
        io_->Expect("A?\n", reply);
        LONG l = 7;
        EXPECT_EQ(Io().InstrQuery("A?", &l), S_OK);
        EXPECT_EQ(l, want) << reply;
    }
    io_->Expect("D?\n", "-1.2345678901234567E-05\n").Expect("D?\n", "OFF\n");
    double d = 0;
    EXPECT_EQ(Io().InstrQuery("D?", &d), S_OK);
    EXPECT_EQ(d, -1.2345678901234567E-05);
    EXPECT_EQ(Io().InstrQuery("D?", &d), S_OK);
    EXPECT_TRUE(std::isnan(d));
}

TEST_F(IoManagerTest, TimeoutIsReportedAndTheSessionTimeoutRestored) {
    Open("QueryInstrStatus=true");
    io_->ExpectTimeout("*IDN?\n");
    std::string reply;
    EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 100, 500), E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: IO timeout error: Timeout expired before operation completed..");
    bool timed_out = false;
    Io().IsTimeout(&timed_out);
    EXPECT_TRUE(timed_out);
    EXPECT_EQ(io_->SessionTimeout(), 2000);
    EXPECT_EQ(io_->Clears(), 1);
    // The failure cleared the event status register once more.
    EXPECT_EQ(io_->Written().back(), "*ESR?\n");
}

// Device clear, serial poll and any other operation that succeeds end the
// timed-out state a timeout left.
TEST_F(IoManagerTest, OperationsAfterATimeoutClearTheTimedOutState) {
    Open();
    const std::function<HRESULT()> next[] = {
        [&] { return Io().DeviceClear(); },
        [&] {
            SHORT stb = -1;
            return Io().ReadSTB(&stb);
        },
        [&] {
            io_->Expect(":RUN\n");
            return Io().InstrWrite(":RUN");
        },
    };
    for (const auto& op : next) {
        io_->ExpectTimeout("*IDN?\n");
        std::string reply;
        EXPECT_EQ(Io().InstrQuery("*IDN?", &reply, 100), E_QUORLEN731XX_IO_TIMEOUT);
        bool timed_out = false;
        Io().IsTimeout(&timed_out);
        ASSERT_TRUE(timed_out);
        EXPECT_EQ(op(), S_OK);
        Io().IsTimeout(&timed_out);
        EXPECT_FALSE(timed_out);
    }
}

// Every operation of the I/O manager leaves its own trace record.
TEST_F(IoManagerTest, EveryOperationOpensItsTraceRecord) {
    const auto dir =
        std::filesystem::temp_directory_path() / ("qn-io-trace-" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    Open(("DriverSetup=Trace=true,TraceName=" + (dir / "io").string()).c_str());
    bool b = false;
    BYTE c = 0;
    SHORT stb = 0;
    const std::pair<const char*, std::function<void()>> ops[] = {
        {"IsTimeout", [&] { Io().IsTimeout(&b); }},
        {"SetSendEndEnabled", [&] { Io().SetSendEndEnabled(true); }},
        {"GetSendEndEnabled", [&] { Io().GetSendEndEnabled(&b); }},
        {"SetTerminationCharacter", [&] { Io().SetTerminationCharacter('\n'); }},
        {"GetTerminationCharacter", [&] { Io().GetTerminationCharacter(&c); }},
        {"SetTerminationCharacterEnabled", [&] { Io().SetTerminationCharacterEnabled(true); }},
        {"GetTerminationCharacterEnabled", [&] { Io().GetTerminationCharacterEnabled(&b); }},
        {"FormattedSetBufferSize", [&] { Io().FormattedSetBufferSize(16, 4096); }},
        {"DeviceClear", [&] { Io().DeviceClear(); }},
        {"ReadSTB", [&] { Io().ReadSTB(&stb); }},
    };
    for (const auto& [name, op] : ops) {
        op();
        int records = 0;
        const auto& doc = driver_->Core().tracer.Document();
        ASSERT_TRUE(doc);
        for (pugi::xml_node m : doc->records.children("Method"))
            records += std::string(m.attribute("Interface").value()) == "CDriverIOManager" &&
                       std::string(m.attribute("Name").value()) == name;
        EXPECT_EQ(records, 1) << name;
    }
    driver_->Close();
    std::filesystem::remove_all(dir);
}

// Boolean and enumeration queries of the command on the stack: the reply is
// converted, one outside the set is an unexpected response, and one read
// before a failed status check is still delivered.
TEST_F(IoManagerTest, CommandStackQueries) {
    Open();
    io_->Expect("\n");
    EXPECT_EQ(Io().InstrPrintCommand(), S_OK);  // empty stack: just the terminator
    static const CEnumCommandTable kUnits{{"", 0, "VOLT"}, {"", 1, "AMP"}};
    struct Case {
        const char* command;
        const char* reply;
        bool status_check;
        HRESULT hr;
        LONG value;  // boolean: 1 true, 0 false (set false from true); enumeration from -1
    };
    const Case cases[] = {
        {":CHAN1:DISP?", " 1 ", false, S_OK, 1},
        {":CHAN1:DISP?", "ON", false, E_IVI_UNEXPECTED_RESPONSE, 0},
        {":CHAN1:DISP?", "1", true, E_IVI_INSTRUMENT_STATUS, 1},
        {":CHAN1:UNIT?", "AMP", false, S_OK, 1},
        {":CHAN1:UNIT?", "volt", false, E_IVI_UNEXPECTED_RESPONSE, -1},
        {":CHAN1:UNIT?", "AMP", true, E_IVI_INSTRUMENT_STATUS, 1},
    };
    io_->AnswerStatusWith("+32");
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.command) + " " + c.reply);
        driver_->Core().session.flags.query_instrument_status = c.status_check;
        driver_->Commands().PushCommand(c.command);
        io_->Expect(std::string(c.command) + "\n", std::string(c.reply) + "\n");
        LONG value = -1;
        if (std::string_view(c.command).ends_with("DISP?")) {
            VARIANT_BOOL b = VARIANT_TRUE;
            EXPECT_EQ(Io().InstrQueryCommandBool(&b), c.hr);
            value = b == VARIANT_TRUE ? 1 : b == VARIANT_FALSE ? 0 : -2;
        } else {
            EXPECT_EQ(Io().InstrQueryCommandEnum(kUnits, &value), c.hr);
        }
        EXPECT_EQ(value, c.value);
        driver_->Commands().PopCommand();
    }
}

TEST_F(IoManagerTest, ErrorQueryParsesTheReplyWithoutCheckingStatus) {
    Open("QueryInstrStatus=true");
    const std::size_t before = io_->Written().size();
    io_->Expect("SYST:ERR?\n", "+0,\"No error\"\n")
        .Expect("SYST:ERR?\n", "-113,\"Undefined header\"\n")
        .Expect("SYST:ERR?\n", "-113\n");
    const std::tuple<HRESULT, LONG, const char*> want[] = {{S_OK, 0, "No error"},
                                                           {S_OK, -113, "Undefined header"},
                                                           {E_IVI_UNEXPECTED_RESPONSE, 0, ""}};
    for (auto [hr, want_code, want_text] : want) {
        LONG code = 1;
        com::Bstr msg;
        EXPECT_EQ(driver_->ErrorQuery(&code, msg.Out()), hr) << want_text;
        if (hr == S_OK) {
            EXPECT_EQ(std::make_pair(code, msg.utf8()),
                      std::make_pair(want_code, std::string(want_text)));
        }
    }
    EXPECT_EQ(io_->Written().size(), before + 3);  // no status query
    EXPECT_TRUE(driver_->Core().session.flags.query_instrument_status);
}

TEST_F(IoManagerTest, UtilityOperationsSendTheirCommands) {
    Open();
    io_->Expect("*RST;*OPC?\n", "1\n").Expect("*TST?\n", "1\n").Expect("*CLS\n");
    EXPECT_EQ(driver_->Reset(), S_OK);
    LONG result = 0;
    com::Bstr msg;
    EXPECT_EQ(driver_->SelfTest(&result, msg.Out()), S_OK);
    EXPECT_EQ(result, 1);
    EXPECT_EQ(msg.utf8(), "Selftest failed");
    io_->AnswerStatusWith("+0");
    EXPECT_EQ(driver_->put_QueryInstrumentStatus(VARIANT_TRUE), S_OK);
    EXPECT_EQ(io_->SessionTimeout(), 2000);  // the 30 s reset timeout was restored
}

TEST_F(IoManagerTest, CloseReleasesTheSession) {
    Open();
    EXPECT_EQ(driver_->Close(), S_OK);
    EXPECT_EQ(Io().InstrWrite(":RUN"), E_QUORLEN731XX_IO_GENERAL);
}

}  // namespace
}  // namespace qn::test
