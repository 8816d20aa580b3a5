// IEEE 488.2 core, status model, message log and fault injection, over a real loopback socket.
#include <gtest/gtest.h>

#include <stdexcept>
#include <thread>
#include <vector>

#include "emulator/emulator.h"
#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using test::ScpiClient;

class EmulatorCore : public ::testing::Test {
  protected:
    void SetUp() override {
        port_ = emu_.Start();
        client_ = std::make_unique<ScpiClient>(port_);
        client_->Query("*CLS;*OPC?");  // also waits until the emulator is serving us
    }
    ScpiClient& c() { return *client_; }

    // Waits (bounded) until the emulator has taken `count` messages off the wire.
    void WaitUntilLogged(std::size_t count) {
        for (int i = 0; i < 10000 && emu_.ReceivedMessages().size() < count; ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
        }
        ASSERT_GE(emu_.ReceivedMessages().size(), count);
    }

    Emulator emu_{"QDS4032A"};
    std::uint16_t port_ = 0;
    std::unique_ptr<ScpiClient> client_;
};

TEST_F(EmulatorCore, IdentityNamesMakerModelSerialAndFirmware) {
    const std::string idn = c().Query("*IDN?");
    EXPECT_TRUE(idn.starts_with("QUORLEN TECHNOLOGIES,QDS4032A,QN")) << idn;
    EXPECT_EQ(std::count(idn.begin(), idn.end(), ','), 3);
    EXPECT_EQ(c().Query("*TST?"), "0");
}

TEST_F(EmulatorCore, HeadersInLongShortAndMixedCaseWithRelativePaths) {
    struct Case {
        const char* message;
        const char* reply;
    };
    const Case cases[] = {
        {":SYSTEM:ERROR?", R"(+0,"No error")"},
        {"syst:err:next?", R"(+0,"No error")"},
        {":SyStEm:ErR?;ERR?", R"(+0,"No error";+0,"No error")"},  // ERR relative to :SYST
        {"*ESE 36;*ESE?", "36"},
        {"*ese 0 ; *ESE?;:SYST:ERR?", R"(0;+0,"No error")"},
    };
    for (const Case& tc : cases) {
        SCOPED_TRACE(tc.message);
        EXPECT_EQ(c().Query(tc.message), tc.reply);
    }
}

TEST_F(EmulatorCore, EachErrorClassSetsItsEventBitAndQueuesItsNumber) {
    struct Case {
        const char* message;
        int esr;
        const char* error;
    };
    const Case cases[] = {
        {"BOGUS:HEADER", 32, R"(-113,"Undefined header")"},
        {"SYST:ERR:BOGUS?", 32, R"(-113,"Undefined header")"},
        {"*RST?", 32, R"(-113,"Undefined header")"},
        {"*ESE", 32, R"(-109,"Missing parameter")"},
        {"*ESE 1,2", 32, R"(-108,"Parameter not allowed")"},
        {"*ESE ON", 32, R"(-104,"Data type error")"},
        {"*ESE 256", 16, R"(-222,"Data out of range")"},
        {"*RCL 7", 16, R"(-221,"Settings conflict")"},
    };
    for (const Case& tc : cases) {
        SCOPED_TRACE(tc.message);
        c().Send(tc.message);
        EXPECT_EQ(c().Query("*ESR?"), std::to_string(tc.esr));
        EXPECT_EQ(c().Query("SYST:ERR?"), tc.error);
        EXPECT_EQ(c().Query("SYST:ERR?"), R"(+0,"No error")");
    }
}

TEST_F(EmulatorCore, UnreadReplyIsInterruptedByTheNextMessage) {
    c().SendRaw("*IDN?\n*ESR?\n");   // one segment: the second arrives before the first is read
    EXPECT_EQ(c().ReadLine(), "4");  // query error
    EXPECT_EQ(c().Query("SYST:ERR?"), R"(-410,"Query INTERRUPTED")");
}

TEST_F(EmulatorCore, CommandErrorDiscardsTheRestOfTheMessage) {
    c().Send("*ESE 8;BOGUS;*ESE 16");
    EXPECT_EQ(c().Query("*ESE?"), "8");
}

TEST_F(EmulatorCore, StatusByteSummarisesQueueEventsAndRequests) {
    EXPECT_EQ(c().Query("*STB?"), "0");
    EXPECT_EQ(c().Query("*IDN?;*STB?").substr(c().Query("*IDN?").size()), ";16");  // MAV
    c().Send("*ESE 32;BOGUS");
    EXPECT_EQ(c().Query("*STB?"), "36");  // ESB + error queue
    c().Send("*SRE 32");
    EXPECT_EQ(c().Query("*STB?"), "100");  // + RQS/MSS
    c().Send("*CLS");
    EXPECT_EQ(c().Query("*STB?"), "0");
    EXPECT_EQ(c().Query("*SRE?;*ESE?"), "32;32");  // *CLS keeps the enables
}

TEST_F(EmulatorCore, ErrorQueueOverflowKeepsOldestAndEndsWithQueueOverflow) {
    for (int i = 0; i < 15; ++i) c().Send("BOGUS");
    for (int i = 0; i < 9; ++i) EXPECT_EQ(c().Query("SYST:ERR?"), R"(-113,"Undefined header")");
    EXPECT_EQ(c().Query("SYST:ERR?"), R"(-350,"Queue overflow")");
    EXPECT_EQ(c().Query("SYST:ERR?"), R"(+0,"No error")");
    EXPECT_EQ(c().Query("*ESR?"), "40");  // command error + device-dependent error
}

TEST_F(EmulatorCore, OperationCompleteAndPowerOnBits) {
    Emulator fresh("QDS2014A");
    ScpiClient client(fresh.Start());
    EXPECT_EQ(client.Query("*ESR?"), "128");  // power-on, read and cleared
    EXPECT_EQ(client.Query("*ESR?"), "0");
    EXPECT_EQ(client.Query("*OPC;*ESR?"), "1");
    EXPECT_EQ(client.Query("*RST;*OPC?"), "1");
}

TEST_F(EmulatorCore, MessageLogHoldsExactTextOfEachMessage) {
    emu_.ClearReceivedMessages();
    c().SendRaw(":A #13x\ny;*IDN?\n");
    c().Query("*esr?");
    const std::vector<std::string> expected = {":A #13x\ny;*IDN?", "*esr?"};
    EXPECT_EQ(emu_.ReceivedMessages(), expected);
}

TEST_F(EmulatorCore, SuppressedRepliesAreNeverSentLater) {
    emu_.SuppressReplies(2);
    c().Send("*ESE 1;*ESE?");
    c().Send("*ESE 2;*ESE?");
    EXPECT_EQ(c().Query("*ESE 3;*ESE?"), "3");
    emu_.SuppressReplies(Emulator::kAllReplies);
    emu_.ClearReceivedMessages();
    c().Send("*IDN?");
    c().Send("*TST?");
    WaitUntilLogged(2);
    emu_.SuppressReplies(0);
    EXPECT_EQ(c().Query("*ESE?"), "3");
}

TEST_F(EmulatorCore, GarbledReplyKeepsOneTerminatorAndLaterRepliesAreClean) {
    emu_.GarbleReplies(1);
    const std::string garbled = c().Query("*IDN?");
    ASSERT_FALSE(garbled.empty());
    for (char ch : garbled) EXPECT_NE(static_cast<unsigned char>(ch) & 0x80, 0);
    EXPECT_EQ(c().Query("*TST?"), "0");
}

TEST_F(EmulatorCore, DelayedReplyStillArrives) {
    emu_.SetReplyDelay(std::chrono::milliseconds(50));
    EXPECT_EQ(c().Query("*TST?"), "0");
}

TEST_F(EmulatorCore, DroppedConnectionThenNextClientIsServed) {
    emu_.DropConnectionOnNextQuery();
    c().Send("*ESE 5");  // commands do not trigger the drop
    c().Send("*IDN?");
    EXPECT_TRUE(c().PeerClosed());
    ScpiClient next(port_);
    EXPECT_EQ(next.Query("*ESE?"), "5");  // state survives the connection
}

TEST_F(EmulatorCore, ForcedEventBitsAppearInEveryEventRead) {
    emu_.SetForcedEventStatusBits(0x04);
    EXPECT_EQ(c().Query("*ESR?"), "4");
    EXPECT_EQ(c().Query("*ESR?"), "4");
    emu_.ClearFaults();
    EXPECT_EQ(c().Query("*ESR?"), "0");
}

// Clients connected at the same time are all served, a burst of them too,
// and they share the one instrument.
TEST_F(EmulatorCore, ClientsAreServedAtTheSameTime) {
    std::vector<std::unique_ptr<ScpiClient>> burst;
    for (int i = 0; i < 40; ++i) burst.push_back(std::make_unique<ScpiClient>(port_));
    EXPECT_EQ(c().Query("*ESE 36;*ESE?"), "36");
    for (auto& other : burst) EXPECT_EQ(other->Query("*ESE?"), "36");
}

// The log keeps the newest messages up to its limit and counts the others.
TEST_F(EmulatorCore, MessageLogIsBoundedAndCountsWhatItDropped) {
    emu_.ClearReceivedMessages();
    emu_.SetLogLimit(3);
    const std::uint64_t before = emu_.DroppedLogEntries();
    for (const char* m : {"*ESE 1", "*ESE 2", "*ESE 3", "*ESE 4"}) c().Send(m);
    EXPECT_EQ(c().Query("*ESE?"), "4");
    EXPECT_EQ(emu_.ReceivedMessages(), (std::vector<std::string>{"*ESE 3", "*ESE 4", "*ESE?"}));
    EXPECT_EQ(emu_.DroppedLogEntries() - before, 2u);
}

TEST(EmulatorSetup, IdleClientsAreClosed) {
    Emulator emu("QDS2014A");
    emu.SetIdleTimeout(std::chrono::milliseconds(100));
    const std::uint16_t port = emu.Start();
    ScpiClient idle(port);
    EXPECT_EQ(idle.Query("*TST?"), "0");
    EXPECT_TRUE(idle.PeerClosed());  // waits well past the idle time
    ScpiClient fresh(port);
    EXPECT_EQ(fresh.Query("*TST?"), "0");
}

TEST_F(EmulatorCore, StopReturnsWhileAClientIsConnectedAndIsIdempotent) {
    c().Send("*ESE 1");
    emu_.Stop();
    emu_.Stop();
    EXPECT_TRUE(c().PeerClosed());
}

TEST(EmulatorSetup, UnknownModelIsRefused) {
    EXPECT_THROW(Emulator("qds4032a"), std::invalid_argument);
    EXPECT_THROW(Emulator("QDS9999Z"), std::invalid_argument);
}

}  // namespace
}  // namespace qn::emu
