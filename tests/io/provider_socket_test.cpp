// The VISA-COM provider over a real socket session against a scripted peer:
// deadlines of whole operations, replies kept in step.
#include <gtest/gtest.h>

#include <chrono>
#include <future>
#include <string>

#include "Quorlen731XXErrors.h"
#include "io/visa_provider.h"
#include "tests/platform/visa/loopback_peer.h"

namespace qn::test {
namespace {

using visa::test::LoopbackPeer;

// A reply that never ends: 4 KiB pieces without a line feed, each well
// within the session timeout of the previous one, for about six seconds.
LoopbackPeer& SendEndlessLine(LoopbackPeer& peer) {
    return peer.Send(std::string(200 * 4096, 'x'), 4096, 30);
}

class ProviderOnPeer : public ::testing::Test {
protected:
    void Open(bool status_check, LONG timeout_ms) {
        flags_.query_instrument_status = status_check;
        peer_.Start();
        ASSERT_EQ(io_.Open(err_, &flags_, peer_.Resource()), S_OK);
        ASSERT_EQ(io_.SetIOTimeout(err_, timeout_ms), S_OK);
    }
    void TearDown() override { io_.Close(); }

    static bool Ready(std::future<void>& f) {
        return f.wait_for(std::chrono::seconds(0)) == std::future_status::ready;
    }

    LoopbackPeer peer_;
    CErrorManagerBase err_;
    SessionFlags flags_;
    CVisaComIOProvider io_;
};

// The rest of an over-long reply is dropped within the query's one deadline,
// not chunk by chunk with a fresh timeout each.
TEST_F(ProviderOnPeer, EndlessReplyEndsAtTheQueryDeadline) {
    SendEndlessLine(peer_.Expect("LONG?\n")).Notify();
    std::future<void> stream_done = peer_.Signal();
    Open(false, 300);
    std::string reply;
    EXPECT_EQ(io_.Query(err_, "LONG?", &reply, 10, kTimeoutSession), E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_TRUE(io_.IsTimeout());
    EXPECT_FALSE(Ready(stream_done)) << "the query waited for the whole stream";
}

// The status check after an operation has one deadline of its own.
TEST_F(ProviderOnPeer, EndlessStatusReplyEndsAtTheCheckDeadline) {
    SendEndlessLine(peer_.Expect("Q?\n").Send("1\n").Expect("*ESR?\n")).Notify();
    std::future<void> stream_done = peer_.Signal();
    Open(true, 300);
    std::string reply;
    EXPECT_EQ(io_.Query(err_, "Q?", &reply, 100, kTimeoutSession), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(reply, "1");
    EXPECT_FALSE(Ready(stream_done)) << "the status check waited for the whole stream";
}

// A line the instrument sends unasked is dropped before the next query is
// written: every later query gets its own reply.
TEST_F(ProviderOnPeer, StrayLineDoesNotShiftLaterReplies) {
    peer_.Send("STRAY\n").Notify();
    for (int i = 1; i <= 10; ++i) {
        const std::string n = std::to_string(i);
        peer_.Expect("Q" + n + "?\n").Send("A" + n + "\n");
    }
    std::future<void> stray_sent = peer_.Signal();
    Open(false, 2000);
    stray_sent.wait();
    for (int i = 1; i <= 10; ++i) {
        std::string reply;
        const std::string n = std::to_string(i);
        ASSERT_EQ(io_.Query(err_, "Q" + n + "?", &reply, 100, kTimeoutSession), S_OK);
        EXPECT_EQ(reply, "A" + n);
    }
    io_.Close();
    EXPECT_EQ(peer_.Finish(), "");
}

// A reply read with a character limit smaller than the message: the caller
// gets the first characters, the rest of that message is dropped and the
// next read starts with the next message.
TEST_F(ProviderOnPeer, ShortReadsDropTheRestOfTheirMessage) {
    struct Case {
        bool query;  // Query, or Write then ReadText
        LONG limit;
        const char* first;
    };
    const Case cases[] = {
        {false, 5, "HELLO"},  {false, 0, ""},  {false, -3, ""},
        {false, 10, "HELLOWORLD"}, {false, 11, "HELLOWORLD"}, {false, 64, "HELLOWORLD"},
        {true, 5, "HELLO"},   {true, 0, ""},   {true, 10, "HELLOWORLD"},
    };
    for (std::size_t i = 0; i < std::size(cases); ++i)
        peer_.Expect("R?\n").Send("HELLOWORLD\nSECOND\n");
    Open(false, 2000);
    for (const Case& c : cases) {
        SCOPED_TRACE(std::to_string(c.limit) + (c.query ? " query" : " read"));
        std::string first, second;
        if (c.query) {
            ASSERT_EQ(io_.Query(err_, "R?", &first, c.limit, kTimeoutSession), S_OK);
        } else {
            ASSERT_EQ(io_.Write(err_, "R?", kTimeoutSession, false), S_OK);
            ASSERT_EQ(io_.ReadText(err_, &first, c.limit, kTimeoutSession, true, false), S_OK);
        }
        EXPECT_EQ(first, c.first);
        ASSERT_EQ(io_.ReadText(err_, &second, 100, kTimeoutSession, true, false), S_OK);
        EXPECT_EQ(second, "SECOND");
    }
    io_.Close();
    EXPECT_EQ(peer_.Finish(), "");
}

}  // namespace
}  // namespace qn::test
