// VXI-11 sessions: against the emulator's server, and against a scripted
// RPC peer that answers with stale, short, giant or missing replies.
#include <gtest/gtest.h>
#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <functional>
#include <mutex>
#include <thread>

#include "emulator/emulator.h"
#include "platform/visa/onc_rpc.h"
#include "platform/visa/visa.h"
#include "platform/visa/vxi11_protocol.h"
#include "tests/platform/visa/loopback_peer.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;

std::string Vxi11Resource(std::uint16_t port) {
    return "TCPIP0::127.0.0.1:" + std::to_string(port) + "::inst0::INSTR";
}

ComPtr<IMessage> OpenVxi11(std::uint16_t port, LONG timeout_ms = 2000) {
    ComPtr<IMessage> msg = OpenMessage(Vxi11Resource(port), timeout_ms);
    if (msg) msg->put_TerminationCharacterEnabled(VARIANT_FALSE);  // END ends messages
    return msg;
}

class Vxi11OnEmulator : public ::testing::Test {
  protected:
    void SetUp() override {
        emu_.EnableVxi11();
        emu_.Start();
    }
    emu::Emulator emu_{"QDS2014A"};
};

TEST_F(Vxi11OnEmulator, QueriesStatusByteAndClear) {
    ComPtr<IMessage> msg = OpenVxi11(emu_.vxi11_port());
    ASSERT_TRUE(msg);
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK) << ThreadErrorText();
    std::string reply;
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(reply.rfind("QUORLEN TECHNOLOGIES,QDS2014A,", 0), 0u) << reply;
    // A reply read in pieces: the count ends the first read, END the last.
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
    std::string head, rest;
    ASSERT_EQ(ReadText(msg.get(), &head, 5), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &rest), S_OK);
    EXPECT_EQ(head + rest, reply);
    // Status byte: bit 4 (message available) while a reply waits, clear after a device clear.
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    SHORT stb = 0;
    ASSERT_EQ(msg->ReadSTB(&stb), S_OK);
    EXPECT_EQ(stb & 0x10, 0x10);
    ASSERT_EQ(msg->Clear(), S_OK);
    ASSERT_EQ(msg->ReadSTB(&stb), S_OK);
    EXPECT_EQ(stb & 0x10, 0);
    // The termination character ends a read when enabled.
    msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
    msg->put_TerminationCharacter(',');
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &head), S_OK);
    EXPECT_EQ(head, "QUORLEN TECHNOLOGIES,");
}

// A message longer than the device takes in one call arrives whole.
TEST_F(Vxi11OnEmulator, LongWritesAreSplitAtTheDeviceLimit) {
    ComPtr<IMessage> msg = OpenVxi11(emu_.vxi11_port());
    ASSERT_TRUE(msg);
    const std::string label = ":DISP:TEXT \"" + std::string(200 * 1024, 'x') + "\"";
    ASSERT_EQ(Write(msg.get(), label + "\n"), S_OK) << ThreadErrorText();
    ASSERT_EQ(Write(msg.get(), "*OPC?\n"), S_OK);
    std::string reply;
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK);
    EXPECT_EQ(reply, "1\n");
    const auto log = emu_.ReceivedMessages();
    ASSERT_GE(log.size(), 2u);
    EXPECT_EQ(log[log.size() - 2], label);
}

// A reply that does not come in time is a timeout; the session stays usable.
TEST_F(Vxi11OnEmulator, MissingReplyTimesOutAndTheSessionRecovers) {
    ComPtr<IMessage> msg = OpenVxi11(emu_.vxi11_port(), 200);
    ASSERT_TRUE(msg);
    emu_.SuppressReplies(1);
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    std::string reply;
    EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK);
    EXPECT_EQ(reply, "0\n");
}

// A scripted RPC server: each call is answered with the bytes the script
// returns (framed or not, any xid).
class RpcPeer {
  public:
    using Script = std::function<std::string(const rpc::CallHeader&, std::string_view)>;

    explicit RpcPeer(Script script) : script_(std::move(script)) {
        listen_ = ListenLoopback(&port_);
        [[maybe_unused]] int rc = ::pipe(wake_);
        thread_ = std::thread([this] { Run(); });
    }
    ~RpcPeer() {
        [[maybe_unused]] auto n = ::write(wake_[1], "x", 1);
        thread_.join();
        ::close(listen_);
        ::close(wake_[0]);
        ::close(wake_[1]);
    }
    std::uint16_t port() const { return port_; }

    static std::string Reply(std::uint32_t xid, std::string_view results) {
        return rpc::FrameRecord(rpc::BuildReply(xid, rpc::kSuccess, results));
    }
    static std::string Words(std::initializer_list<std::uint32_t> words) {
        rpc::XdrWriter w;
        for (std::uint32_t v : words) w.U32(v);
        return std::move(w.data());
    }
    // create_link: no error, link 1, no abort channel, 1 KiB pieces.
    static std::string LinkReply(std::uint32_t xid) { return Reply(xid, Words({0, 1, 0, 1024})); }

  private:
    bool Wait(int fd) {
        pollfd p[2] = {{fd, POLLIN, 0}, {wake_[0], POLLIN, 0}};
        return ::poll(p, 2, 10000) > 0 && p[1].revents == 0;
    }
    void Run() {
        if (!Wait(listen_)) return;
        const int fd = ::accept4(listen_, nullptr, nullptr, SOCK_CLOEXEC);
        rpc::RecordReader reader(1 << 20);
        std::string record;
        char buf[4096];
        while (Wait(fd)) {
            const ssize_t n = ::recv(fd, buf, sizeof buf, 0);
            if (n <= 0) break;
            std::string_view in(buf, std::size_t(n));
            while (reader.Feed(&in, &record) == rpc::RecordReader::Status::kRecord) {
                rpc::CallHeader call;
                std::string_view args;
                if (!rpc::ParseCall(record, &call, &args)) continue;
                const std::string out = script_(call, args);
                if (!out.empty()) ::send(fd, out.data(), out.size(), MSG_NOSIGNAL);
            }
        }
        ::close(fd);
    }

    Script script_;
    int listen_ = -1;
    int wake_[2] = {-1, -1};
    std::uint16_t port_ = 0;
    std::thread thread_;
};

// Replies that break the protocol end the call with an I/O error or a
// timeout, within the timeout; nothing beyond the record bound is held.
TEST(Vxi11Hostile, BadRepliesFailCleanly) {
    struct Case {
        const char* what;
        std::function<std::string(std::uint32_t xid)> read_reply;
        HRESULT expected;
    };
    const Case cases[] = {
        {"giant record", [](std::uint32_t) { return RpcPeer::Words({0x8FFFFFFFu}); },
         E_VISA_IO},
        {"short record",
         [](std::uint32_t xid) { return rpc::FrameRecord(RpcPeer::Words({xid, 1})); }, E_VISA_IO},
        {"data longer than asked",
         [](std::uint32_t xid) {
             rpc::XdrWriter w;
             w.U32(0);
             w.U32(4);
             w.Opaque(std::string(4096, 'x'));
             return RpcPeer::Reply(xid, w.data());
         },
         E_VISA_IO},
        {"only a stale reply", [](std::uint32_t xid) { return RpcPeer::LinkReply(xid - 1); },
         E_VISA_TIMEOUT},
        {"no reply", [](std::uint32_t) { return std::string(); }, E_VISA_TIMEOUT},
        {"endless empty replies",
         [](std::uint32_t xid) {
             rpc::XdrWriter w;
             w.U32(0);
             w.U32(0);  // no END, no termination character
             w.Opaque({});
             return RpcPeer::Reply(xid, w.data());
         },
         E_VISA_TIMEOUT},
        {"device timeout", [](std::uint32_t xid) { return RpcPeer::Reply(xid, RpcPeer::Words({15, 0, 0})); },
         E_VISA_TIMEOUT},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        RpcPeer peer([&](const rpc::CallHeader& call, std::string_view) -> std::string {
            if (call.procedure == vxi11::kCreateLink) return RpcPeer::LinkReply(call.xid);
            if (call.procedure == vxi11::kDeviceRead) return c.read_reply(call.xid);
            if (call.procedure == vxi11::kDestroyLink)
                return RpcPeer::Reply(call.xid, RpcPeer::Words({0}));
            return {};
        });
        ComPtr<IMessage> msg = OpenVxi11(peer.port(), 200);
        ASSERT_TRUE(msg);
        BYTE buf[64];
        LONG got = 0;
        ComPtr<IMessageDirect> direct;
        ASSERT_EQ(msg.As(direct), S_OK);
        EXPECT_EQ(direct->ReadInto(buf, sizeof buf, kReadDefault, &got, nullptr), c.expected)
            << ThreadErrorText();
        EXPECT_EQ(got, 0);
        // A later call ends too (an error or a timeout), never hangs.
        EXPECT_TRUE(FAILED(direct->ReadInto(buf, sizeof buf, kReadDefault, &got, nullptr)));
    }
}

// The late reply of a call that timed out is dropped: the next call gets its
// own reply.
TEST(Vxi11Hostile, LateReplyIsNotTakenForTheNextOne) {
    std::uint32_t late_xid = 0;
    int reads = 0;
    RpcPeer peer([&](const rpc::CallHeader& call, std::string_view) -> std::string {
        if (call.procedure == vxi11::kCreateLink) return RpcPeer::LinkReply(call.xid);
        if (call.procedure != vxi11::kDeviceRead) return RpcPeer::Reply(call.xid, RpcPeer::Words({0}));
        rpc::XdrWriter w;
        w.U32(0);
        w.U32(vxi11::kReasonEnd);
        if (++reads == 1) {
            late_xid = call.xid;  // no answer now
            return {};
        }
        w.Opaque("NEW\n");
        rpc::XdrWriter old;
        old.U32(0);
        old.U32(vxi11::kReasonEnd);
        old.Opaque("OLD\n");
        // The late reply of the first read, then this read's own.
        return RpcPeer::Reply(late_xid, old.data()) + RpcPeer::Reply(call.xid, w.data());
    });
    ComPtr<IMessage> msg = OpenVxi11(peer.port(), 200);
    ASSERT_TRUE(msg);
    std::string reply;
    EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(reply, "NEW\n");
}

}  // namespace
}  // namespace qn::visa::test

namespace qn::visa::test {
namespace {

// A read the device would let wait far past the session timeout is ended
// through the abort channel: the next queries on the same session are
// served at once, each with its own reply.
TEST_F(Vxi11OnEmulator, AReadTheDeviceOverrunsIsAborted) {
    ComPtr<IMessage> msg = OpenVxi11(emu_.vxi11_port(), 300);
    ASSERT_TRUE(msg);
    emu_.OverrunIoTimeouts(true);
    emu_.SuppressReplies(1);
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    std::string reply;
    EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
    EXPECT_NE(ThreadErrorText().find("aborted"), std::string::npos);
    for (const char* query : {"*IDN?\n", "*TST?\n", "*ESE?\n"}) {
        ASSERT_EQ(Write(msg.get(), query), S_OK) << ThreadErrorText();
        ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
        EXPECT_EQ(reply == "0\n", std::string(query) != "*IDN?\n") << query << reply;
    }
}

// What the client sends for the new calls, word for word: the lock's
// waitlock flag and timeout, the link id, the abort program and procedure.
TEST(Vxi11Records, LockTriggerAndAbortArguments) {
    std::vector<std::pair<std::uint32_t, std::string>> seen;  // (program << 8 | procedure, args)
    std::mutex m;
    auto record = [&](const rpc::CallHeader& call, std::string_view args) {
        std::lock_guard lock(m);
        seen.emplace_back(call.program << 8 | call.procedure, std::string(args));
    };
    RpcPeer abort_peer([&](const rpc::CallHeader& call, std::string_view args) {
        record(call, args);
        return RpcPeer::Reply(call.xid, RpcPeer::Words({0}));
    });
    RpcPeer core([&](const rpc::CallHeader& call, std::string_view args) -> std::string {
        if (call.procedure == vxi11::kCreateLink)
            return RpcPeer::Reply(call.xid, RpcPeer::Words({0, 7, abort_peer.port(), 1024}));
        record(call, args);
        if (call.procedure == vxi11::kDeviceRead) return {};  // never answered: aborted
        return RpcPeer::Reply(call.xid, RpcPeer::Words({0}));
    });
    ComPtr<IMessage> msg = OpenVxi11(core.port(), 0);
    ASSERT_TRUE(msg);
    for (LONG timeout : {0, 300, -1}) {
        ASSERT_EQ(msg->LockRsrc(kExclusiveLock, timeout, nullptr, nullptr), S_OK);
        ASSERT_EQ(msg->UnlockRsrc(), S_OK);
    }
    ASSERT_EQ(msg->AssertTrigger(kTriggerProtocolDefault), S_OK);
    std::string reply;
    EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
    msg.reset();
    const std::uint32_t core_calls = vxi11::kCoreProgram << 8, abort = vxi11::kAbortProgram << 8;
    const std::pair<std::uint32_t, std::string> expected[] = {
        {core_calls | vxi11::kDeviceLock, RpcPeer::Words({7, 0, 0})},
        {core_calls | vxi11::kDeviceUnlock, RpcPeer::Words({7})},
        {core_calls | vxi11::kDeviceLock, RpcPeer::Words({7, 1, 300})},
        {core_calls | vxi11::kDeviceUnlock, RpcPeer::Words({7})},
        {core_calls | vxi11::kDeviceLock, RpcPeer::Words({7, 1, 0xFFFFFFFFu})},
        {core_calls | vxi11::kDeviceUnlock, RpcPeer::Words({7})},
        // Generic parameters: link, waitlock, lock and I/O timeouts (the session's, 0).
        {core_calls | vxi11::kDeviceTrigger, RpcPeer::Words({7, 1, 0, 0})},
        {core_calls | vxi11::kDeviceRead, RpcPeer::Words({7, 1024, 0, 0, 1, '\n'})},
        {abort | vxi11::kDeviceAbort, RpcPeer::Words({7})},
    };
    std::lock_guard lock(m);
    ASSERT_GE(seen.size(), std::size(expected));
    for (std::size_t i = 0; i < std::size(expected); ++i) EXPECT_EQ(seen[i], expected[i]) << i;
}

// Each device error code of a reply becomes its VISA status, with its
// reason in the error text; an unanswered or garbled reply ends the call
// within the timeout.
TEST(Vxi11Hostile, DeviceErrorsAndBadRepliesOfTriggerAndLock) {
    struct Case {
        std::string reply_words;  // the results, or "" for no reply
        bool stale;               // the reply carries another call's xid
        HRESULT expected;
        const char* text;
    };
    auto error = [](std::uint32_t code) { return RpcPeer::Words({code}); };
    const Case cases[] = {
        {error(1), false, E_VISA_IO, "syntax error"},
        {error(3), false, E_VISA_IO, "device not accessible"},
        {error(4), false, E_VISA_CONNECTION_LOST, "invalid link identifier"},
        {error(5), false, E_VISA_IO, "parameter error"},
        {error(8), false, E_VISA_NOT_SUPPORTED, "operation not supported"},
        {error(9), false, E_VISA_IO, "out of resources"},
        {error(11), false, E_VISA_RSRC_LOCKED, "device locked by another link"},
        {error(12), false, E_VISA_SESSION_NOT_LOCKED, "no lock held by this link"},
        {error(15), false, E_VISA_TIMEOUT, "I/O timeout"},
        {error(17), false, E_VISA_IO, "I/O error"},
        {error(23), false, E_VISA_ABORT, "aborted"},
        {error(99), false, E_VISA_IO, "device error (VXI-11 error 99)"},
        {"", false, E_VISA_IO, "short reply"},
        {error(0), true, E_VISA_TIMEOUT, "timeout"},
        {"", true, E_VISA_TIMEOUT, "no abort channel"},  // nothing comes back at all
    };
    for (const Case& c : cases) {
        for (std::uint32_t procedure : {vxi11::kDeviceTrigger, vxi11::kDeviceLock}) {
            SCOPED_TRACE(std::string(c.text) + " procedure " + std::to_string(procedure));
            const bool silent = c.stale && c.reply_words.empty();
            RpcPeer peer([&](const rpc::CallHeader& call, std::string_view) -> std::string {
                if (call.procedure == vxi11::kCreateLink) return RpcPeer::LinkReply(call.xid);
                if (call.procedure != procedure) return RpcPeer::Reply(call.xid, error(0));
                if (silent) return {};
                return RpcPeer::Reply(c.stale ? call.xid - 1 : call.xid, c.reply_words);
            });
            ComPtr<IMessage> msg = OpenVxi11(peer.port(), 100);
            ASSERT_TRUE(msg);
            const HRESULT hr = procedure == vxi11::kDeviceTrigger
                                   ? msg->AssertTrigger(kTriggerProtocolDefault)
                                   : msg->LockRsrc(kExclusiveLock, 100, nullptr, nullptr);
            EXPECT_EQ(hr, c.expected);
            EXPECT_NE(ThreadErrorText().find(c.text), std::string::npos);
            LONG state = kExclusiveLock;
            msg->get_LockState(&state);
            EXPECT_EQ(state, kNoLock);  // a failed lock is not held
        }
    }
}

// An abort channel that fails in any way leaves the read's timeout as it
// was, within its bound, and the session usable.
TEST(Vxi11Hostile, BrokenAbortChannels) {
    const std::pair<std::function<std::string(std::uint32_t)>, const char*> cases[] = {
        {[](std::uint32_t) { return std::string(); }, "abort channel: timeout"},
        {[](std::uint32_t xid) { return RpcPeer::Reply(xid - 1, RpcPeer::Words({0})); },
         "abort channel: timeout"},
        {[](std::uint32_t xid) { return RpcPeer::Reply(xid, ""); }, "abort channel: short reply"},
        {[](std::uint32_t xid) { return RpcPeer::Reply(xid, RpcPeer::Words({4})); },
         "abort refused (VXI-11 error 4)"},
    };
    for (const auto& c : cases) {
        const char* text = c.second;
        SCOPED_TRACE(text);
        RpcPeer abort_peer(
            [&](const rpc::CallHeader& call, std::string_view) { return c.first(call.xid); });
        int reads = 0;
        RpcPeer core([&](const rpc::CallHeader& call, std::string_view) -> std::string {
            if (call.procedure == vxi11::kCreateLink)
                return RpcPeer::Reply(call.xid, RpcPeer::Words({0, 1, abort_peer.port(), 1024}));
            if (call.procedure == vxi11::kDeviceRead && ++reads == 1) return {};
            rpc::XdrWriter w;
            w.U32(0);
            w.U32(vxi11::kReasonEnd);
            w.Opaque("OK\n");
            return RpcPeer::Reply(call.xid, w.data());
        });
        ComPtr<IMessage> msg = OpenVxi11(core.port(), 100);
        ASSERT_TRUE(msg);
        std::string reply;
        EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
        EXPECT_NE(ThreadErrorText().find(text), std::string::npos);
        ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
        EXPECT_EQ(reply, "OK\n");
    }
}

}  // namespace
}  // namespace qn::visa::test
