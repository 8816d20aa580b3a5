// Exact SCPI traffic of the system, display, marker, external-input and
// setup-memory members against the strict scripted provider, with the
// session's formatted I/O for the setup and screen blocks.
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <functional>
#include <iterator>
#include <vector>

#include "Qn731XX.h"
#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "io/io_manager.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/scripted_driver.h"
#include "tests/support/scripted_formatted.h"

namespace qn::test {
namespace {

// Records every timeout the session is given.
class TimeoutProvider : public ScriptedFormattedProvider {
public:
    std::vector<LONG> timeouts;

protected:
    HRESULT RawSetTimeout(LONG ms) override {
        timeouts.push_back(ms);
        return ScriptedFormattedProvider::RawSetTimeout(ms);
    }
};

class SystemTraffic : public ScriptedSessionTest<TimeoutProvider> {
protected:
    void SetUp() override { Open("73141D"); }
public:
    IQuorlen731XXSystem* System() { return driver_.get(); }
    IQuorlen731XXCursors* Cursors() { return driver_.get(); }
    IQuorlen731XXExternal* External() { return driver_.get(); }
    IQuorlen731XXDisplay* Display() { return driver_.get(); }

protected:
    void PollingOn() {
        io_->AnswerStatusWith("+0");
        driver_->Core().session.flags.query_instrument_status = true;
    }
    static com::SafeArray Bytes(std::string_view text) {
        com::SafeArray a = com::SafeArray::Vector(VT_UI1, ULONG(text.size()));
        std::copy(text.begin(), text.end(), a.data<char>());
        return a;
    }
    static std::string Text(SAFEARRAY* a) {
        com::SafeArray owned(a);
        return std::string(owned.data<char>(), owned.size());
    }
};

TEST_F(SystemTraffic, SingleCommandMembersSendTheirCommands) {
    com::Bstr date("+2026,+12,+6"), slot("3");
    IQuorlen731XXSystem* s = System();
    IQuorlen731XXDisplay* d = Display();
    IQuorlen731XXCursors* m = Cursors();
    IQuorlen731XXExternal* e = External();
    const std::pair<const char*, std::function<HRESULT()>> cases[] = {
        {":SYST:DATE +2026,+12,+6", [&] { return s->put_Date(date.get()); }},
        {"*SAV 3", [&] { return s->SaveState(slot.get()); }},
        {"*RCL 3", [&] { return s->RecallState(slot.get()); }},
        {":SYST:LOCK 0", [&] { return s->EnableLocalControls(); }},
        {":SYST:LOCK 1", [&] { return s->DisableLocalControls(); }},
        {":DISP:LAB 1", [&] { return d->put_LabelEnabled(VARIANT_TRUE); }},
        {":DISP:PERS INF", [&] { return d->put_Persistence(VARIANT_TRUE); }},
        {":DISP:PERS MIN", [&] { return d->put_Persistence(VARIANT_FALSE); }},
        {":CDIS", [&] { return d->Erase(); }},
        {":MARK:MODE MAN", [&] { return m->put_Enabled(VARIANT_TRUE); }},
        {":MARK:MODE OFF", [&] { return m->put_Enabled(VARIANT_FALSE); }},
        {":MARK:X2P -0.123456789012346", [&] { return m->put_X2Position(-0.12345678901234567); }},
        {":MARK:X1P 3.45678901234568e+21", [&] { return m->put_X1Position(3.4567890123456789e21); }},
        {":MARK:Y1P -2.34567890123457e-09", [&] { return m->put_Y1Position(-2.3456789012345678e-9); }},
        {":MARK:Y2P 0.987654321098765", [&] { return m->put_Y2Position(0.98765432109876543); }},
        {":EXT:UNIT AMP", [&] { return e->put_Units(Quorlen731XXUnitsAmps); }},
        {":EXT:UNIT VOLT", [&] { return e->put_Units(Quorlen731XXUnitsVolts); }},
        {":EXT:PROB 12.3456789012346", [&] { return e->put_ProbeAttenuation(12.345678901234567); }},
    };
    for (const auto& [sent, call] : cases) {
        SCOPED_TRACE(sent);
        Expect({sent});
        EXPECT_EQ(call(), S_OK);
        EXPECT_TRUE(io_->Done());
    }
}

TEST_F(SystemTraffic, TwoStateRepliesAreTrueOnlyForTheirOnToken) {
    struct Case {
        const char* reply;
        bool persistence, markers;  // reply read as Persistence / as Cursors.Enabled
    };
    const Case cases[] = {{"INF\n", true, false},  {"MIN\n", false, false},
                          {"inf\n", false, false}, {"INFINITE\n", false, false},
                          {"MAN\n", false, true},  {" MAN \n", false, true},
                          {"OFF\n", false, false}, {"1\n", false, false}};
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reply);
        VARIANT_BOOL v = VARIANT_TRUE;
        io_->Expect(":DISP:PERS?\n", c.reply).Expect(":MARK:MODE?\n", c.reply);
        EXPECT_EQ(Display()->get_Persistence(&v), S_OK);
        EXPECT_EQ(v, c.persistence ? VARIANT_TRUE : VARIANT_FALSE);
        EXPECT_EQ(Cursors()->get_Enabled(&v), S_OK);
        EXPECT_EQ(v, c.markers ? VARIANT_TRUE : VARIANT_FALSE);
    }
}

TEST_F(SystemTraffic, TimeoutBelowTheMinimumBecomesTheMinimum) {
    const std::pair<LONG, LONG> cases[] = {{-5, 100}, {50, 100}, {99, 100},
                                           {100, 100}, {101, 101}, {30000, 30000}};
    for (const auto& [given, set] : cases) {
        SCOPED_TRACE(given);
        ASSERT_EQ(System()->put_TimeoutMilliseconds(given), S_OK);
        LONG read = 0;
        EXPECT_EQ(System()->get_TimeoutMilliseconds(&read), S_OK);
        EXPECT_EQ(read, set);
        EXPECT_EQ(io_->SessionTimeout(), set);
    }
    EXPECT_TRUE(io_->Written().size() == 2);  // the identity queries only
}

// The wait runs under its own timeout (100 ms at least) without the status
// check, and puts both back whether the instrument replies or not.
TEST_F(SystemTraffic, OperationCompleteWaitsWithoutPollingAndRestoresBoth) {
    io_->AnswerStatusWith("+0");
    const struct {
        bool polling, replies;
        LONG max_time, waited;
    } cases[] = {{true, true, 10, 100}, {true, false, 2500, 2500}, {false, false, 2500, 2500}};
    for (const auto& c : cases) {
        SCOPED_TRACE(std::to_string(c.max_time) + (c.polling ? " polling" : ""));
        driver_->Core().session.flags.query_instrument_status = c.polling;
        io_->timeouts.clear();
        if (c.replies) io_->Expect("*OPC?\n", "1\n");
        else io_->ExpectTimeout("*OPC?\n");
        const std::size_t before = io_->Written().size();
        EXPECT_EQ(System()->WaitForOperationComplete(c.max_time),
                  c.replies ? S_OK : E_QUORLEN731XX_MAX_TIME_EXCEEDED);
        if (!c.replies) {
            EXPECT_NE(ErrorText().find("WaitForOperationComplete Max time exceeded."),
                      std::string::npos);
        }
        EXPECT_EQ(io_->timeouts, (std::vector<LONG>{c.waited, 2000}));
        EXPECT_EQ(io_->SessionTimeout(), 2000);
        EXPECT_EQ(driver_->Core().session.flags.query_instrument_status, c.polling);
        // The session stays usable, and the status check follows the next
        // command (only) when it is on.
        io_->Expect(":SER?\n", "QN1234\n");
        EXPECT_EQ(Got(System(), &IQuorlen731XXSystem::get_SerialNumber), "QN1234");
        const std::vector<std::string> sent(io_->Written().begin() + long(before),
                                            io_->Written().end());
        EXPECT_EQ(std::count(sent.begin(), sent.end(), "*ESR?\n"), c.polling ? 1 : 0);
        EXPECT_EQ(sent.back() == "*ESR?\n", c.polling);
    }
}

TEST_F(SystemTraffic, SetupBlocksGoOutWithTheirExactLength) {
    // Bytes that would end a text message (line feed, NUL) travel inside the block.
    const std::string setup("a\nb\0c", 5);
    com::SafeArray data = Bytes(setup);
    io_->Expect(":SYST:SET #15" + setup + "\n");
    EXPECT_EQ(System()->PutState(data.get()), S_OK);
    const std::string big(1234, 'x');
    com::SafeArray large = Bytes(big);
    io_->Expect(":SYST:SET #41234" + big + "\n");
    EXPECT_EQ(System()->PutState(large.get()), S_OK);
}

TEST_F(SystemTraffic, SetupDataThatIsNotBytesIsRefusedBeforeSending) {
    EXPECT_EQ(System()->PutState(nullptr), E_IVI_NULL_POINTER);
    com::SafeArray doubles = com::SafeArray::Vector(VT_R8, 4);
    EXPECT_EQ(System()->PutState(doubles.get()), E_IVI_INVALID_VALUE);
    EXPECT_NE(ErrorText().find("PutState"), std::string::npos);
    EXPECT_EQ(io_->Written().size(), 2u);
}

TEST_F(SystemTraffic, SetupAndScreenBlocksAreReadWhole) {
    SAFEARRAY* state = nullptr;
    io_->Expect(":SYST:SET?\n", std::string("#16a\n\0b\nc\n", 10));
    ASSERT_EQ(System()->GetState(&state), S_OK);
    EXPECT_EQ(Text(state), std::string("a\n\0b\nc", 6));
    SAFEARRAY* screen = nullptr;
    io_->Expect(":DISP:DATA? BMP,SCR\n", "#0BM\x02\x00\n");
    ASSERT_EQ(System()->GetScreenBitmap(&screen), S_OK);
    EXPECT_EQ(Text(screen).substr(0, 2), "BM");
}

TEST_F(SystemTraffic, BadSetupBlocksFailAndLeaveTheSessionUsable) {
    const char* replies[] = {
        "#9999999999\n",  // longer than any block the instrument makes
        "#2x1abc\n",      // a length that is not digits
        "SETUP\n",        // not a block
        "#\n",            // header cut short
    };
    for (const char* reply : replies) {
        SCOPED_TRACE(reply);
        SAFEARRAY* state = nullptr;
        io_->Expect(":SYST:SET?\n", reply);
        EXPECT_TRUE(FAILED(System()->GetState(&state)));
        EXPECT_EQ(state, nullptr);
        EXPECT_FALSE(ErrorText().empty());
        io_->Expect(":SYST:DATE?\n", "+2026,+12,+6\n");
        EXPECT_EQ(Got(System(), &IQuorlen731XXSystem::get_Date), "+2026,+12,+6");
    }
}

TEST_F(SystemTraffic, MarkerSourcesAreDisplayedAnalogChannels) {
    com::Bstr user2("UserChannel2"), ivi3("Channel3"), digital("UserDigitalChannel0"),
        external("VAL_EXTERNAL"), bogus("CHAN1");
    io_->Expect(":STAT? CHAN2\n", "1\n").Expect(":MARK:X1Y1 CHAN2\n");
    EXPECT_EQ(Cursors()->put_X1Y1Source(user2.get()), S_OK);
    io_->Expect(":STAT? CHAN3\n", "1\n").Expect(":MARK:X2Y2 CHAN3\n");
    EXPECT_EQ(Cursors()->put_X2Y2Source(ivi3.get()), S_OK);
    io_->Expect(":STAT? CHAN2\n", "0\n");
    EXPECT_EQ(Cursors()->put_X2Y2Source(user2.get()), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    EXPECT_NE(ErrorText().find("Specified channel is not enabled."), std::string::npos);
    for (const com::Bstr* name : {&digital, &external, &bogus}) {
        SCOPED_TRACE(name->utf8());
        EXPECT_EQ(Cursors()->put_X1Y1Source(name->get()), E_IVI_INVALID_VALUE);
    }
    EXPECT_TRUE(io_->Done());
}

TEST_F(SystemTraffic, MarkerSourcesReadBackAsDriverNames) {
    const std::pair<const char*, const char*> cases[] = {
        {"CHAN1\n", "UserChannel1"}, {"CHAN4\n", "UserChannel4"}, {"DIG3\n", "UserDigitalChannel3"},
        {"EXT\n", "VAL_EXTERNAL"},   {"LINE\n", "LINE"}};
    for (const auto& [reply, name] : cases) {
        SCOPED_TRACE(name);
        io_->Expect(":MARK:X2Y2?\n", reply);
        EXPECT_EQ(Got(Cursors(), &IQuorlen731XXCursors::get_X2Y2Source), name);
    }
}

TEST_F(SystemTraffic, AutomaticExternalProbeSensingIsRememberedWithoutIo) {
    const auto probe = [&] { return Got(External(), &IQuorlen731XXExternal::get_ProbeAttenuation); };
    io_->Expect(":EXT:PROB?\n", "10\n");
    EXPECT_EQ(probe(), 10.0);
    EXPECT_EQ(External()->put_ProbeAttenuation(-1.0), S_OK);
    EXPECT_EQ(probe(), -1.0);
    EXPECT_EQ(io_->Written().size(), 3u);
    // Another value is sent and read from the instrument again.
    io_->Expect(":EXT:PROB -1.5\n").Expect(":EXT:PROB?\n", "-1.5\n");
    EXPECT_EQ(External()->put_ProbeAttenuation(-1.5), S_OK);
    EXPECT_EQ(probe(), -1.5);
    // Reset forgets automatic sensing, as it does for the channels.
    EXPECT_EQ(External()->put_ProbeAttenuation(-1.0), S_OK);
    io_->Expect("*RST;*OPC?\n", "1\n").Expect(":EXT:PROB?\n", "1\n");
    EXPECT_EQ(driver_->Reset(), S_OK);
    EXPECT_EQ(probe(), 1.0);
}

TEST_F(SystemTraffic, ExternalUnitsTokens) {
    Quorlen731XXExternalUnitsEnum units = Quorlen731XXUnitsVolts;
    io_->Expect(":EXT:UNIT?\n", "AMP\n").Expect(":EXT:UNIT?\n", "OHM\n");
    EXPECT_EQ(Got(External(), &IQuorlen731XXExternal::get_Units), Quorlen731XXUnitsAmps);
    EXPECT_EQ(External()->get_Units(&units), E_IVI_UNEXPECTED_RESPONSE);
    for (LONG bad : {-1, 2}) {
        EXPECT_EQ(External()->put_Units(static_cast<Quorlen731XXExternalUnitsEnum>(bad)),
                  E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find("put_Units"), std::string::npos);
    }
}

TEST_F(SystemTraffic, IoIsTheSessionsFormattedIoObject) {
    ComPtr<IFormattedIO488> io;
    ASSERT_EQ(System()->get_IO(io.Out()), S_OK);
    EXPECT_EQ(io.get(), io_->FormattedInterface());
    io_->Expect("*CLS\n");
    com::Bstr cls("*CLS\n");
    EXPECT_EQ(io->WriteString(cls.get(), VARIANT_TRUE), S_OK);
    EXPECT_EQ(System()->get_IO(nullptr), E_IVI_NULL_POINTER);
}

TEST_F(SystemTraffic, ACReadTooLongForTheBufferKeepsTheReplyForTheNextRead) {
    ViSession vi = 0;
    ASSERT_EQ(Qn731XX_AttachToExistingCOMSession(static_cast<IIviDriver*>(driver_.get()), &vi),
              VI_SUCCESS);
    io_->Expect("*IDN?\n", "QUORLEN,73141D,SN7,2.10\n");
    ASSERT_EQ(Qn731XX_SystemWrite(vi, "*IDN?\n"), VI_SUCCESS);
    char text[64];
    // The size first (nothing copied), then a buffer one short: both keep it.
    EXPECT_EQ(Qn731XX_SystemRead(vi, 0, nullptr), 25);
    EXPECT_EQ(Qn731XX_SystemRead(vi, 24, text), 25);
    EXPECT_STREQ(text, "QUORLEN,73141D,SN7,2.10");
    EXPECT_EQ(Qn731XX_SystemRead(vi, sizeof text, text), VI_SUCCESS);
    EXPECT_STREQ(text, "QUORLEN,73141D,SN7,2.10\n");
    // Delivered: the next read asks the instrument again.
    io_->Expect("*OPC?\n", "1\n");
    ASSERT_EQ(Qn731XX_SystemWrite(vi, "*OPC?\n"), VI_SUCCESS);
    EXPECT_EQ(Qn731XX_SystemRead(vi, sizeof text, text), VI_SUCCESS);
    EXPECT_STREQ(text, "1\n");
    EXPECT_EQ(Qn731XX_SystemRead(vi, -1, text), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(Qn731XX_close(vi), VI_SUCCESS);
}

TEST_F(SystemTraffic, PointerGettersAndRegisterMovesOfAMessageSession) {
    ScriptedProvider plain;  // no formatted I/O, no message or register interface
    IFormattedIO488* formatted = reinterpret_cast<IFormattedIO488*>(0x1);
    EXPECT_EQ(plain.ioprvGetIFormattedIO488Pointer(&formatted), S_FALSE);
    EXPECT_EQ(formatted, nullptr);
    IRegister* reg = reinterpret_cast<IRegister*>(0x1);
    EXPECT_EQ(plain.ioprvGetIRegisterPointer(&reg), S_OK);
    EXPECT_EQ(reg, nullptr);
    EXPECT_EQ(plain.ioprvGetIMessagePointer(nullptr), E_POINTER);
    IMessage* message = nullptr;
    ASSERT_EQ(io_->ioprvGetIMessagePointer(&message), S_OK);
    ComPtr<IMessage> held(message, false);  // adopts the reference the getter added
    EXPECT_EQ(message, io_->MessageInterface());
    // Register block moves are refused on a message-based session; nothing is sent.
    SAFEARRAY* block = nullptr;
    EXPECT_EQ(Io(*driver_.get()).RegisterMoveIn16(1, 0x40, 4, &block), E_QUORLEN731XX_IO_GENERAL);
    EXPECT_NE(ErrorText().find("register access"), std::string::npos);
    EXPECT_EQ(block, nullptr);
    EXPECT_EQ(io_->Written().size(), 2u);
}

// The members no model supports fail the same way with and without an
// instrument, with the documented inserts.
void ExpectUnsupported(Quorlen731XX& d) {
    struct Case {
        std::function<HRESULT()> call;
        HRESULT hr;
        const char* text;
    };
    IQuorlen731XXSetupMemory* memory = &d;
    IQuorlen731XXDisplay* display = &d;
    IQuorlen731XXSystem* system = &d;
    com::Bstr file("setup.scp");
    BSTR fetched = SysAllocString(u"x");
    const BSTR callers = fetched;  // Fetch clears the pointer; the string stays the caller's
    VARIANT_BOOL b = VARIANT_FALSE;
    BSTR time = nullptr;
    const Case cases[] = {
        {[&] { return memory->Fetch(&fetched); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED, ": Fetch."},
        {[&] { return memory->Download(file.get()); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
         ": Download."},
        {[&] { return display->get_PersistTime(&time); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
         "get_IQuorlen731XXDisplayPersistTime"},
        {[&] { return display->put_PersistTime(file.get()); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
         "get_IQuorlen731XXDisplayPersistTime"},
        {[&] { return display->Configure(file.get()); }, E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
         "_IQuorlen731XXDisplayConfigure"},
        {[&] { return system->get_AsyncEventsEnabled(&b); }, E_IVI_PROPERTY_NOT_SUPPORTED,
         "get_AsyncEventsEnabled"},
        {[&] { return system->put_AsyncEventsEnabled(VARIANT_TRUE); },
         E_IVI_PROPERTY_NOT_SUPPORTED, "put_AsyncEventsEnabled"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.text);
        EXPECT_EQ(c.call(), c.hr);
        EXPECT_NE(ErrorText().find(c.text), std::string::npos);
    }
    EXPECT_EQ(fetched, nullptr);
    SysFreeString(callers);
}

TEST_F(SystemTraffic, UnsupportedMembersFailWithTheirInserts) { ExpectUnsupported(*driver_.get()); }

class SimulatedSystem : public ::testing::Test {
protected:
    ComPtr<Quorlen731XX> driver_ = SimulatedDriver("QDS4032A");
};

TEST_F(SimulatedSystem, UnsupportedMembersFailAlsoWhileSimulating) { ExpectUnsupported(*driver_.get()); }

TEST_F(SimulatedSystem, IoObjectIsNotAvailable) {
    IFormattedIO488* io = reinterpret_cast<IFormattedIO488*>(0x1);
    EXPECT_EQ(static_cast<IQuorlen731XXSystem*>(driver_.get())->get_IO(&io),
              E_QUORLEN731XX_IO_GENERAL);
    EXPECT_EQ(io, nullptr);
    EXPECT_NE(ErrorText().find("IO error: I/O not available while Simulating."), std::string::npos);
}

TEST_F(SimulatedSystem, MethodsSucceedWithoutAnInstrument) {
    IQuorlen731XXSystem* s = driver_.get();
    EXPECT_EQ(s->WaitForOperationComplete(0), S_OK);
    SAFEARRAY* state = nullptr;
    EXPECT_EQ(s->GetState(&state), S_OK);
    ASSERT_NE(state, nullptr);
    EXPECT_EQ(com::SafeArrayCount(state), 0u);
    SafeArrayDestroy(state);
    com::SafeArray data = com::SafeArray::Vector(VT_UI1, 3);
    EXPECT_EQ(s->PutState(data.get()), S_OK);
    EXPECT_EQ(s->DisableLocalControls(), S_OK);
    EXPECT_EQ(Got(s, &IQuorlen731XXSystem::get_Date), "+2008,+2,+27");
}

TEST_F(SimulatedSystem, CSessionLinkExistsOnlyWhenTheCApiMadeIt) {
    LONG handle = 7;
    EXPECT_EQ(driver_->get_NativeCHandle(&handle), E_IVI_PROPERTY_NOT_SUPPORTED);
    EXPECT_EQ(handle, 0);
    EXPECT_NE(ErrorText().find("get_NativeCHandle"), std::string::npos);
    EXPECT_EQ(driver_->AttachToExistingCSession(), E_IVI_METHOD_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("AttachToExistingCSession"), std::string::npos);
    EXPECT_EQ(driver_->get_NativeCHandle(nullptr), E_IVI_NULL_POINTER);
    driver_->Core().c_session_handle = 4242;
    EXPECT_EQ(driver_->AttachToExistingCSession(), S_OK);
    EXPECT_EQ(driver_->get_NativeCHandle(&handle), S_OK);
    EXPECT_EQ(handle, 4242);
}

TEST(SystemTracing, SwitchingTracingOffKeepsWhatWasRecorded) {
    const std::string path = ::testing::TempDir() + "qn_system_trace_switch.xml";
    std::remove(path.c_str());
    ComPtr<Quorlen731XX> driver = SimulatedDriver("QDS4032A", ",TraceName=" + path);
    IQuorlen731XXSystem* s = driver.get();
    EXPECT_EQ(Got(s, &IQuorlen731XXSystem::get_TraceEnabled), VARIANT_FALSE);
    ASSERT_EQ(s->put_TraceEnabled(VARIANT_TRUE), S_OK);
    EXPECT_EQ(Got(s, &IQuorlen731XXSystem::get_TraceEnabled), VARIANT_TRUE);
    EXPECT_EQ(s->DisableLocalControls(), S_OK);
    ASSERT_EQ(s->put_TraceEnabled(VARIANT_FALSE), S_OK);
    std::ifstream file(path);
    const std::string xml((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    EXPECT_NE(xml.find("DisableLocalControls"), std::string::npos);
    std::remove(path.c_str());
}

TEST(SystemTracing, AnUnwritableTraceFileLeavesTracingOffAndSaysSo) {
    // The session starts: a test program runs without its trace.
    ComPtr<Quorlen731XX> driver =
        SimulatedDriver("QDS4032A", ",Trace=true,TraceName=/nonexistent/qn-dir/trace");
    IQuorlen731XXSystem* s = driver.get();
    EXPECT_EQ(Got(s, &IQuorlen731XXSystem::get_TraceEnabled), VARIANT_FALSE);
    EXPECT_TRUE(FAILED(s->put_TraceEnabled(VARIANT_TRUE)));
    EXPECT_EQ(Got(s, &IQuorlen731XXSystem::get_TraceEnabled), VARIANT_FALSE);
    EXPECT_EQ(driver->Close(), S_OK);
}

}  // namespace
}  // namespace qn::test
