// HiSLIP sessions: against the emulator's server, and against a scripted
// server that answers with stale, broken, giant or missing messages.
#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <functional>
#include <mutex>
#include <thread>
#include <vector>

#include "emulator/emulator.h"
#include "platform/visa/hislip_protocol.h"
#include "platform/visa/visa.h"
#include "tests/platform/visa/loopback_peer.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

using namespace qn::hislip;

ComPtr<IMessage> OpenHislip(const std::string& resource, LONG timeout_ms = 2000) {
    ComPtr<IMessage> msg = OpenMessage(resource, timeout_ms);
    if (msg) msg->put_TerminationCharacterEnabled(VARIANT_FALSE);  // END ends messages
    return msg;
}

std::string HislipResource(std::uint16_t port) {
    return "TCPIP0::127.0.0.1::hislip0," + std::to_string(port) + "::INSTR";
}

class HislipOnEmulator : public ::testing::Test {
  protected:
    void SetUp() override {
        emu_.EnableHislip();
        emu_.Start();
    }
    emu::Emulator emu_{"QDS2014A"};
};

TEST_F(HislipOnEmulator, QueriesStatusByteAndClear) {
    // Both spellings of the port open: after the device name and after the host.
    ASSERT_TRUE(
        OpenHislip("TCPIP::127.0.0.1:" + std::to_string(emu_.hislip_port()) + "::hislip0::INSTR"));
    ComPtr<IMessage> msg = OpenHislip(HislipResource(emu_.hislip_port()));
    ASSERT_TRUE(msg);
    // No line feed is needed at the end of a message: END ends it. A reply read in
    // pieces: the count ends the first read, END the last.
    std::string reply, head, rest;
    ASSERT_EQ(Write(msg.get(), "*IDN?"), S_OK) << ThreadErrorText();
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(reply.rfind("QUORLEN TECHNOLOGIES,QDS2014A,", 0), 0u) << reply;
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &head, 5), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &rest), S_OK);
    EXPECT_EQ(head + rest, reply);
    // Message available (bit 4) only while a reply waits: not before, nor once it was
    // read, nor after a clear.
    const auto mav = [&] {
        SHORT stb = 0;
        EXPECT_EQ(msg->ReadSTB(&stb), S_OK) << ThreadErrorText();
        return stb & 0x10;
    };
    EXPECT_EQ(mav(), 0);
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    EXPECT_EQ(mav(), 0x10);
    ASSERT_EQ(msg->Clear(), S_OK) << ThreadErrorText();
    EXPECT_EQ(mav(), 0);
    ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK);
    EXPECT_EQ(reply, "0\n");
    EXPECT_EQ(mav(), 0);
    // The termination character ends a read when enabled; the next write drops the rest.
    msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
    msg->put_TerminationCharacter(',');
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &head), S_OK);
    EXPECT_EQ(head, "QUORLEN TECHNOLOGIES,");
    ASSERT_EQ(Write(msg.get(), "*OPC?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK);
    EXPECT_EQ(reply, "1\n");
}

// A reply that comes after its query timed out is dropped by its message id: the next
// query gets its own reply.
TEST_F(HislipOnEmulator, LateReplyIsNotTakenForTheNextOne) {
    ComPtr<IMessage> msg = OpenHislip(HislipResource(emu_.hislip_port()), 100);
    ASSERT_TRUE(msg);
    emu_.SetReplyDelay(std::chrono::milliseconds(300));
    ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
    std::string reply;
    EXPECT_EQ(ReadText(msg.get(), &reply), E_VISA_TIMEOUT);
    emu_.SetReplyDelay(std::chrono::milliseconds(0));
    msg->put_Timeout(5000);
    for (int i = 0; i < 3; ++i) {
        ASSERT_EQ(Write(msg.get(), "*TST?\n"), S_OK);
        ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
        EXPECT_EQ(reply, "0\n");
    }
}

// A HiSLIP server run by the test: it completes the handshake (announcing
// `server_max` as its largest message), answers the asynchronous channel,
// records the headers of the synchronous messages, and answers the nth
// DataEnd with the bytes the script gives (raw bytes, so anything can be
// sent).
class HislipPeer {
  public:
    using Script = std::function<std::string(const Header& data_end, int nth)>;
    // A reply starting with this is sent without it, then the connection closed.
    static inline const std::string kThenClose = "\x01then close\x01";

    explicit HislipPeer(Script script, std::uint64_t server_max = 1 << 20)
        : script_(std::move(script)), server_max_(server_max) {
        listen_ = ListenLoopback(&port_);
        [[maybe_unused]] int rc = ::pipe(wake_);
        thread_ = std::thread([this] { Run(); });
    }
    ~HislipPeer() {
        [[maybe_unused]] auto n = ::write(wake_[1], "x", 1);
        thread_.join();
        for (int fd : {listen_, wake_[0], wake_[1]}) ::close(fd);
    }
    std::string Resource() const { return HislipResource(port_); }
    std::vector<Header> Received() {
        std::lock_guard lock(m_);
        return received_;
    }
    static std::string Reply(std::uint8_t type, std::uint32_t id, std::string_view payload) {
        return EncodeMessage(type, 0, id, payload);
    }

  private:
    bool Wait(int fd) {
        pollfd p[2] = {{fd, POLLIN, 0}, {wake_[0], POLLIN, 0}};
        return ::poll(p, 2, 10000) > 0 && p[1].revents == 0;
    }
    bool Next(int fd, Header* h, std::string* payload) {
        std::uint8_t raw[kHeaderSize];
        if (!Wait(fd) || ::recv(fd, raw, sizeof raw, MSG_WAITALL) != ssize_t(sizeof raw) ||
            !DecodeHeader(raw, h) || h->length > (1u << 20))
            return false;
        payload->assign(std::size_t(h->length), '\0');
        return h->length == 0 ||
               ::recv(fd, payload->data(), payload->size(), MSG_WAITALL) == ssize_t(h->length);
    }
    void Send(int fd, const std::string& bytes) {
        if (fd >= 0 && !bytes.empty()) ::send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL);
    }
    int Accept() { return Wait(listen_) ? ::accept4(listen_, nullptr, nullptr, SOCK_CLOEXEC) : -1; }
    void Run() {
        Header h;
        std::string payload;
        int sync = Accept();
        if (sync < 0 || !Next(sync, &h, &payload)) return;
        Send(sync, EncodeMessage(kInitializeResponse, 0, 0x01000007u));
        int async = Accept();
        if (async >= 0 && Next(async, &h, &payload))
            Send(async, EncodeMessage(kAsyncInitializeResponse, 0, 0));
        for (int nth = 0;;) {
            pollfd p[3] = {{sync, POLLIN, 0}, {async, POLLIN, 0}, {wake_[0], POLLIN, 0}};
            if (::poll(p, 3, 10000) <= 0 || p[2].revents) break;
            if (p[0].revents) {
                if (!Next(sync, &h, &payload)) break;
                {
                    std::lock_guard lock(m_);
                    received_.push_back(h);
                }
                if (h.type == kDataEnd) {
                    const std::string out = script_(h, nth++);
                    if (out.rfind(kThenClose, 0) == 0) {
                        Send(sync, out.substr(kThenClose.size()));
                        break;
                    }
                    Send(sync, out);
                }
                if (h.type == kDeviceClearComplete)
                    Send(sync, EncodeMessage(kDeviceClearAcknowledge, 0, 0));
            }
            if (p[1].revents) {
                if (!Next(async, &h, &payload)) break;
                if (h.type == kAsyncMaximumMessageSize)
                    Send(async, EncodeMessage(kAsyncMaximumMessageSizeResponse, 0, 0,
                                              EncodeSize(server_max_)));
                if (h.type == kAsyncStatusQuery)
                    Send(async, EncodeMessage(kAsyncStatusResponse, 0x42, 0));
                if (h.type == kAsyncDeviceClear)
                    Send(async, EncodeMessage(kAsyncDeviceClearAcknowledge, 0, 0));
            }
        }
        ::close(sync);
        if (async >= 0) ::close(async);
    }

    Script script_;
    std::uint64_t server_max_;
    int listen_ = -1;
    int wake_[2] = {-1, -1};
    std::uint16_t port_ = 0;
    std::thread thread_;
    std::mutex m_;
    std::vector<Header> received_;
};

// Each hostile first reply ends the read with the right error; afterwards the
// session answers the next query properly, or, when the stream cannot be
// trusted any more, reports the connection lost (never hangs, never
// allocates what a length claims).
TEST(HislipHostile, BadRepliesFailCleanly) {
    enum After { kUsable, kClosed };
    struct Case {
        const char* what;
        std::function<std::string(std::uint32_t id)> first_reply;
        HRESULT expected;
        After after;
    };
    const std::string ok = "OK\n";
    const Case cases[] = {
        {"bad prologue", [](std::uint32_t) { return "XS" + std::string(14, '\0'); }, E_VISA_IO,
         kClosed},
        {"lying length",
         [](std::uint32_t id) {
             std::uint8_t raw[kHeaderSize];
             EncodeHeader({kDataEnd, 0, id, 1ull << 40}, raw);
             return std::string(reinterpret_cast<char*>(raw), sizeof raw) + "abc";
         },
         E_VISA_IO, kClosed},
        {"peer closes mid-message",
         [](std::uint32_t id) {
             return HislipPeer::kThenClose +
                    HislipPeer::Reply(kDataEnd, id, "0123456789").substr(0, 20);
         },
         E_VISA_CONNECTION_LOST, kClosed},
        {"status response on the synchronous channel",
         [](std::uint32_t) { return EncodeMessage(kAsyncStatusResponse, 0, 0, "xy"); }, E_VISA_IO,
         kUsable},
        {"unknown message type", [](std::uint32_t) { return EncodeMessage(99, 0, 0, "payload"); },
         E_VISA_IO, kUsable},
        {"Error", [](std::uint32_t) { return EncodeMessage(kError, 0, 0, "query refused"); },
         E_VISA_IO, kUsable},
        {"FatalError", [](std::uint32_t) { return EncodeMessage(kFatalError, 1, 0, "bye"); },
         E_VISA_IO, kClosed},
        {"only a reply to another message id",
         [](std::uint32_t id) { return HislipPeer::Reply(kDataEnd, id - 2, "OLD\n"); },
         E_VISA_TIMEOUT, kUsable},
        {"no reply", [](std::uint32_t) { return std::string(); }, E_VISA_TIMEOUT, kUsable},
        {"half a reply", [](std::uint32_t id) { return HislipPeer::Reply(kData, id, "HALF"); },
         E_VISA_TIMEOUT, kUsable},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        HislipPeer peer([&](const Header& h, int nth) {
            if (nth > 0) return HislipPeer::Reply(kDataEnd, h.parameter, ok);
            return c.first_reply(h.parameter);
        });
        ComPtr<IMessage> msg = OpenHislip(peer.Resource(), 200);
        ASSERT_TRUE(msg);
        ASSERT_EQ(Write(msg.get(), "*IDN?\n"), S_OK);
        std::string reply;
        EXPECT_EQ(ReadText(msg.get(), &reply), c.expected) << ThreadErrorText();
        HRESULT hr = Write(msg.get(), "*TST?\n");
        if (SUCCEEDED(hr)) hr = ReadText(msg.get(), &reply);
        if (c.after == kUsable) {
            EXPECT_EQ(hr, S_OK) << ThreadErrorText();
            EXPECT_EQ(reply, ok);
        } else {
            EXPECT_EQ(hr, E_VISA_CONNECTION_LOST) << ThreadErrorText();
        }
    }
}

// Writes are split at the size the server takes; every message takes the next id (2 apart),
// only the last carries END, and the first message after a whole reply was read says so.
// Stale replies and Interrupted messages before the awaited reply are skipped, a reply in
// several Data messages arrives whole.
TEST(HislipHostile, WritesSplitAtTheServerSizeAndRepliesMatchTheirIds) {
    HislipPeer peer(
        [](const Header& h, int) {
            return HislipPeer::Reply(kDataEnd, h.parameter - 2, "STALE\n") +
                   EncodeMessage(kInterrupted, 0, h.parameter) +
                   HislipPeer::Reply(kData, h.parameter, "AB") +
                   HislipPeer::Reply(kData, h.parameter, "") +
                   HislipPeer::Reply(kDataEnd, h.parameter, "C\n");
        },
        /*server_max=*/kHeaderSize + 64);
    ComPtr<IMessage> msg = OpenHislip(peer.Resource());
    ASSERT_TRUE(msg);
    ASSERT_EQ(Write(msg.get(), std::string(199, 'x') + "\n"), S_OK) << ThreadErrorText();
    std::string reply;
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(reply, "ABC\n");
    ASSERT_EQ(Write(msg.get(), "*OPC?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(reply, "ABC\n");
    std::vector<std::string> got;
    for (const Header& h : peer.Received())
        got.push_back(MessageTypeName(h.type) + " " + std::to_string(h.control) + " " +
                      std::to_string(h.parameter) + " " + std::to_string(h.length));
    EXPECT_EQ(got, (std::vector<std::string>{"Data 0 4294967040 64", "Data 0 4294967042 64",
                                             "Data 0 4294967044 64", "DataEnd 0 4294967046 8",
                                             "DataEnd 1 4294967048 6"}));
    // The status byte comes from the asynchronous channel; a clear starts the ids afresh.
    SHORT stb = 0;
    ASSERT_EQ(msg->ReadSTB(&stb), S_OK);
    EXPECT_EQ(stb, 0x42);
    ASSERT_EQ(msg->Clear(), S_OK) << ThreadErrorText();
    ASSERT_EQ(Write(msg.get(), "*OPC?\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &reply), S_OK) << ThreadErrorText();
    EXPECT_EQ(peer.Received().back().parameter, 0xFFFFFF00u);
}

}  // namespace
}  // namespace qn::visa::test
