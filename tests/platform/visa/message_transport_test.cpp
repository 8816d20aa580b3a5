// What every message transport does alike, run over a raw socket, a serial
// line and USBTMC: replies read whole however they are cut, the termination
// character and the count end reads, the rest of a reply read in part never
// passes for the next one, a clear forgets unread input, and an instrument
// that goes away is a connection loss. Over byte streams, input the
// instrument sent unasked is dropped before each write and a reply that
// trickles in ends at the read's one deadline.
#include <gtest/gtest.h>

#include <functional>

#include "tests/platform/visa/instrument_ends.h"

namespace qn::visa::test {
namespace {

struct Kind {
    const char* name;
    std::function<std::unique_ptr<InstrumentEnd>()> make;
};
void PrintTo(const Kind& k, std::ostream* os) {
    *os << k.name;
}

const Kind kKinds[] = {
    {"Socket", [] { return std::make_unique<SocketEnd>(); }},
    {"Serial", [] { return std::make_unique<PtyEnd>(); }},
    {"Usbtmc", [] { return std::make_unique<UsbtmcEnd>(); }},
};

class MessageTransport : public ::testing::TestWithParam<Kind> {
  protected:
    void Start(LONG timeout_ms = 2000) {
        end_ = GetParam().make();
        msg_ = end_->Open(timeout_ms);
        ASSERT_TRUE(msg_);
    }
    // Writes a query and checks that the instrument received exactly it.
    void Ask(const std::string& query) {
        ASSERT_EQ(Write(msg_.get(), query), S_OK) << ThreadErrorText();
        EXPECT_EQ(end_->ReceiveLine(), query);
    }
    std::string Read(LONG count = 1024) {
        std::string text;
        EXPECT_EQ(ReadText(msg_.get(), &text, count), S_OK) << ThreadErrorText();
        return text;
    }
    void TearDown() override {
        msg_.reset();
        end_.reset();
    }
    std::unique_ptr<InstrumentEnd> end_;
    ComPtr<IMessage> msg_;
};

TEST_P(MessageTransport, RepliesCutAnywhereAreReadWhole) {
    Start();
    const std::string reply = "QUORLEN,731XX,SN42,1.3.20\n";
    // A quiet line between pieces (150 ms) is not the end of a reply either.
    const std::pair<std::size_t, int> kPieces[] = {{1, 1},  {2, 1},    {3, 1}, {7, 1},
                                                   {25, 1}, {13, 150}, {0, 0}};
    for (auto [piece, gap] : kPieces) {
        Ask("*IDN?\n");
        end_->Send(reply, piece, gap);
        EXPECT_EQ(Read(), reply) << "pieces of " << piece;
    }
}

TEST_P(MessageTransport, TerminationCharacterAndCountEndReads) {
    Start();
    end_->Send("ab;cd\nef\n");
    msg_->put_TerminationCharacter(';');
    EXPECT_EQ(Read(), "ab;");
    // Disabled: only the count ends the read, line feeds included.
    msg_->put_TerminationCharacterEnabled(VARIANT_FALSE);
    EXPECT_EQ(Read(4), "cd\ne");
    // Enabled again with line feed; the count can end a read first.
    msg_->put_TerminationCharacter('\n');
    msg_->put_TerminationCharacterEnabled(VARIANT_TRUE);
    EXPECT_EQ(Read(1), "f");
    EXPECT_EQ(Read(), "\n");
}

// The unread rest of a reply is dropped before the next query is written.
TEST_P(MessageTransport, RestOfAReplyReadInPartIsDroppedBeforeTheNextWrite) {
    Start();
    Ask("R?\n");
    end_->Send("0123456789ABCDEF\n", 3);
    EXPECT_EQ(Read(4), "0123");
    if (auto* fd_end = dynamic_cast<FdEnd*>(end_.get())) fd_end->Join();
    Ask("Q?\n");
    end_->Send("SECOND\n");
    EXPECT_EQ(Read(), "SECOND\n");
}

// A clear forgets a reply read in part and input not yet read, with no write
// in between that would drop it anyway.
TEST_P(MessageTransport, ClearForgetsUnreadInput) {
    Start();
    end_->Send("STALE\nREPLY\n", 4);
    EXPECT_EQ(Read(), "STALE\n");
    if (auto* fd_end = dynamic_cast<FdEnd*>(end_.get())) fd_end->Join();
    ASSERT_EQ(msg_->Clear(), S_OK) << ThreadErrorText();
    end_->Send("AFTER\n");
    EXPECT_EQ(Read(), "AFTER\n");
}

TEST_P(MessageTransport, InstrumentGoneMidReplyIsAConnectionLoss) {
    Start(kTimeoutInfinite);
    Ask("Q?\n");
    end_->Send("PARTIAL", 3);
    end_->HangUp();
    std::string text;
    EXPECT_EQ(ReadText(msg_.get(), &text), E_VISA_CONNECTION_LOST);
    EXPECT_NE(ThreadErrorText().find(end_->LostText()), std::string::npos);
    // Writing fails too, at the latest the second time (a socket learns of
    // the loss from the first write's answer).
    HRESULT hr = Write(msg_.get(), "A\n");
    if (SUCCEEDED(hr)) hr = Write(msg_.get(), "B\n");
    EXPECT_EQ(hr, E_VISA_CONNECTION_LOST);
    EXPECT_EQ(msg_->Close(), S_OK);
}

// Transports over which the instrument can send unasked (not USBTMC).
class ByteStream : public MessageTransport {};

// Noise and stray lines sent unasked never pass for a reply: each of ten
// queries gets its own answer.
TEST_P(ByteStream, InputSentUnaskedIsDroppedBeforeEachWrite) {
    Start(200);
    std::string text;
    end_->Send(std::string("\x01\xff\x7f garbage", 12));
    EXPECT_EQ(ReadText(msg_.get(), &text), E_VISA_TIMEOUT);
    for (int i = 0; i < 10; ++i) {
        const std::string n = std::to_string(i);
        end_->Send("noise" + std::string(i, '#') + "\nSTRAY\n");
        Ask("Q" + n + "?\n");
        end_->Send("A" + n + "\n");
        EXPECT_EQ(Read(), "A" + n + "\n");
    }
}

// A reply dripping in faster than the timeout per byte but slower than it in
// all ends at the read's deadline; its late rest is not the next reply.
TEST_P(ByteStream, TricklingReplyEndsAtTheReadDeadline) {
    Start(150);
    Ask("SLOW?\n");
    end_->Send(std::string(30, 'x') + "\n", 1, 20);
    std::string text;
    EXPECT_EQ(ReadText(msg_.get(), &text), E_VISA_TIMEOUT);
    EXPECT_NE(ThreadErrorText().find("timeout"), std::string::npos);
    LONG timeout = 0;
    msg_->get_Timeout(&timeout);
    EXPECT_EQ(timeout, 150);
    static_cast<FdEnd*>(end_.get())->Join();
    Ask("NEXT?\n");
    end_->Send("fresh\n");
    EXPECT_EQ(Read(), "fresh\n");
}

std::string KindName(const ::testing::TestParamInfo<Kind>& p) {
    return p.param.name;
}
INSTANTIATE_TEST_SUITE_P(Transports, MessageTransport, ::testing::ValuesIn(kKinds), KindName);
INSTANTIATE_TEST_SUITE_P(Transports, ByteStream, ::testing::ValuesIn(kKinds, kKinds + 2), KindName);

}  // namespace
}  // namespace qn::visa::test
