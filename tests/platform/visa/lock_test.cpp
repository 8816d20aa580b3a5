// The device lock between sessions: VXI-11 and HiSLIP against the emulator
// over loopback, and the buses without a lock.
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <functional>
#include <thread>

#include "emulator/emulator.h"
#include "platform/visa/onc_rpc.h"
#include "platform/visa/tcp_connect.h"
#include "platform/visa/vxi11_protocol.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;

ComPtr<IMessage> Open(const std::string& resource, LONG mode, LONG open_timeout,
                      HRESULT* hr = nullptr) {
    ComPtr<IResourceManager> rm;
    EXPECT_EQ(CreateResourceManager(rm.Out()), S_OK);
    ComPtr<IVisaSession> session;
    const HRESULT got =
        rm->Open(Bstr(resource).get(), mode, open_timeout, nullptr, session.Out());
    if (hr) *hr = got;
    ComPtr<IMessage> msg;
    if (session) session.As(msg);
    if (msg) msg->put_Timeout(1000);
    return msg;
}

// One VXI-11 call over a bare connection (no session around it): a link
// that holds the lock while the test decides how it ends.
class RawLink {
  public:
    explicit RawLink(std::uint16_t port) {
        std::string error;
        EXPECT_EQ(ConnectTcp("127.0.0.1", port, Deadline::FromTimeout(1000), &fd_, &error), S_OK);
        rpc::XdrWriter w;
        w.I32(1);
        w.Bool(false);
        w.U32(0);
        w.Opaque("inst0");
        rpc::XdrReader r = Call(vxi11::kCreateLink, w.data());
        EXPECT_TRUE(r.I32(&error_) && r.I32(&lid_));
    }
    std::int32_t Lock() {
        rpc::XdrWriter w;
        for (std::uint32_t v : {std::uint32_t(lid_), 0u, 0u}) w.U32(v);
        rpc::XdrReader r = Call(vxi11::kDeviceLock, w.data());
        std::int32_t e = -1;
        EXPECT_TRUE(r.I32(&e));
        return e;
    }
    // Ends the connection without destroy_link.
    void Drop() { fd_.reset(); }

  private:
    rpc::XdrReader Call(std::uint32_t procedure, const std::string& args) {
        const std::string call = rpc::FrameRecord(
            rpc::BuildCall(++xid_, vxi11::kCoreProgram, vxi11::kVersion, procedure, args));
        EXPECT_EQ(::send(fd_.get(), call.data(), call.size(), MSG_NOSIGNAL),
                  ssize_t(call.size()));
        rpc::RecordReader reader(4096);
        char buf[4096];
        for (;;) {
            pollfd p{fd_.get(), POLLIN, 0};
            if (::poll(&p, 1, 5000) != 1) return rpc::XdrReader("");
            const ssize_t n = ::recv(fd_.get(), buf, sizeof buf, 0);
            if (n <= 0) return rpc::XdrReader("");
            std::string_view in(buf, std::size_t(n));
            if (reader.Feed(&in, &record_) == rpc::RecordReader::Status::kRecord) break;
        }
        std::uint32_t xid = 0;
        rpc::AcceptStat stat{};
        std::string_view results;
        EXPECT_EQ(rpc::ParseReply(record_, &xid, &stat, &results), rpc::ReplyStatus::kAccepted);
        return rpc::XdrReader(results);
    }

    FdHolder fd_;
    std::string record_;
    std::uint32_t xid_ = 0;
    std::int32_t error_ = -1, lid_ = -1;
};

class Vxi11Lock : public ::testing::Test {
  protected:
    void SetUp() override {
        emu_.EnableVxi11();
        emu_.Start();
        resource_ = "TCPIP0::127.0.0.1:" + std::to_string(emu_.vxi11_port()) + "::inst0::INSTR";
    }
    emu::Emulator emu_{"QDS2014A"};
    std::string resource_;
};

// While one session holds the lock, every operation of another ends with
// "locked", waiting for it or not (timeout 0: no waitlock); the holder's own
// I/O goes on.
TEST_F(Vxi11Lock, OperationsOfAnotherLinkFailWhileLocked) {
    ComPtr<IMessage> holder = Open(resource_, kExclusiveLock, 1000);
    ASSERT_TRUE(holder);
    LONG state = kNoLock;
    ASSERT_EQ(holder->get_LockState(&state), S_OK);
    EXPECT_EQ(state, kExclusiveLock);
    ComPtr<IMessage> other = Open(resource_, kNoLock, 1000);
    ASSERT_TRUE(other);
    using Op = std::function<HRESULT(IMessage*)>;
    const std::pair<const char*, Op> ops[] = {
        {"write", [](IMessage* m) { return Write(m, "*CLS\n"); }},
        {"read", [](IMessage* m) { std::string s; return ReadText(m, &s); }},
        {"trigger", [](IMessage* m) { return m->AssertTrigger(kTriggerProtocolDefault); }},
        {"clear", [](IMessage* m) { return m->Clear(); }},
        {"status byte", [](IMessage* m) { SHORT stb; return m->ReadSTB(&stb); }},
        {"lock", [](IMessage* m) { return m->LockRsrc(kExclusiveLock, 50, nullptr, nullptr); }},
    };
    for (LONG timeout : {0, 50}) {
        other->put_Timeout(timeout);
        for (const auto& [what, op] : ops) {
            SCOPED_TRACE(std::string(what) + " timeout " + std::to_string(timeout));
            EXPECT_EQ(op(other.get()), E_VISA_RSRC_LOCKED);
            EXPECT_NE(ThreadErrorText().find("locked by another link"), std::string::npos);
        }
    }
    ASSERT_EQ(Write(holder.get(), "*TST?\n"), S_OK);
    std::string reply;
    ASSERT_EQ(ReadText(holder.get(), &reply), S_OK);
    EXPECT_EQ(reply, "0\n");
    // Opening with the lock waits for it within the open timeout, then fails.
    HRESULT hr = S_OK;
    EXPECT_FALSE(Open(resource_, kExclusiveLock, 50, &hr));
    EXPECT_EQ(hr, E_VISA_RSRC_LOCKED);
}

// However the holder gives the lock up, another link can have it at once.
TEST_F(Vxi11Lock, TheLockEndsWithUnlockCloseOrTheConnection) {
    enum class End { kUnlock, kNestedUnlock, kClose, kDropConnection, kWaitedFor };
    for (End end : {End::kUnlock, End::kNestedUnlock, End::kClose, End::kDropConnection,
                    End::kWaitedFor}) {
        SCOPED_TRACE(int(end));
        ComPtr<IMessage> other = Open(resource_, kNoLock, 1000);
        ASSERT_TRUE(other);
        if (end == End::kDropConnection) {
            RawLink raw(emu_.vxi11_port());
            ASSERT_EQ(raw.Lock(), vxi11::kNoError);
            EXPECT_EQ(other->LockRsrc(kExclusiveLock, 0, nullptr, nullptr), E_VISA_RSRC_LOCKED);
            raw.Drop();
        } else {
            ComPtr<IMessage> holder = Open(resource_, kNoLock, 1000);
            ASSERT_TRUE(holder);
            ASSERT_EQ(holder->LockRsrc(kExclusiveLock, 0, nullptr, nullptr), S_OK);
            if (end == End::kNestedUnlock) {
                // Locks nest: the first unlock of two keeps the device locked.
                ASSERT_EQ(holder->LockRsrc(kExclusiveLock, 0, nullptr, nullptr), S_OK);
                ASSERT_EQ(holder->UnlockRsrc(), S_OK);
                EXPECT_EQ(other->LockRsrc(kExclusiveLock, 0, nullptr, nullptr),
                          E_VISA_RSRC_LOCKED);
            }
            if (end == End::kWaitedFor) {
                // A lock request that waits gets the lock once it is given up.
                HRESULT waited = E_FAIL;
                std::thread t([&] {
                    waited = other->LockRsrc(kExclusiveLock, 20000, nullptr, nullptr);
                });
                EXPECT_EQ(holder->UnlockRsrc(), S_OK);
                t.join();
                EXPECT_EQ(waited, S_OK) << ThreadErrorText();
                continue;
            }
            if (end == End::kClose) {
                holder->Close();
            } else {
                ASSERT_EQ(holder->UnlockRsrc(), S_OK);
                EXPECT_EQ(holder->UnlockRsrc(), E_VISA_SESSION_NOT_LOCKED);
            }
        }
        // The link that ended with its connection may still be on its way out.
        ASSERT_EQ(other->LockRsrc(kExclusiveLock, 2000, nullptr, nullptr), S_OK)
            << ThreadErrorText();
        ASSERT_EQ(other->UnlockRsrc(), S_OK);
    }
}

// HiSLIP: the server arbitrates the lock between sessions too.
TEST(HislipLock, SessionsArbitrateTheLock) {
    emu::Emulator emu("QDS2014A");
    emu.EnableHislip();
    emu.Start();
    const std::string resource =
        "TCPIP0::127.0.0.1::hislip0," + std::to_string(emu.hislip_port()) + "::INSTR";
    ComPtr<IMessage> holder = Open(resource, kExclusiveLock, 1000);
    ASSERT_TRUE(holder);
    ComPtr<IMessage> other = Open(resource, kNoLock, 1000);
    ASSERT_TRUE(other);
    for (LONG timeout : {0, 50}) {
        EXPECT_EQ(other->LockRsrc(kExclusiveLock, timeout, nullptr, nullptr), E_VISA_RSRC_LOCKED);
    }
    EXPECT_EQ(other->UnlockRsrc(), E_VISA_SESSION_NOT_LOCKED);
    holder->Close();
    ASSERT_EQ(other->LockRsrc(kExclusiveLock, 2000, nullptr, nullptr), S_OK) << ThreadErrorText();
    ASSERT_EQ(other->UnlockRsrc(), S_OK);
    ASSERT_EQ(other->LockRsrc(kExclusiveLock, 0, nullptr, nullptr), S_OK) << ThreadErrorText();
}

// Lock types the sessions do not offer, and buses without a lock.
TEST(LockRefused, SharedLocksAndBusesWithoutALock) {
    emu::Emulator emu("QDS2014A");
    emu.EnableVxi11();
    emu.Start();
    const std::string socket = "TCPIP0::127.0.0.1::" + std::to_string(emu.port()) + "::SOCKET";
    const std::string vxi11 =
        "TCPIP0::127.0.0.1:" + std::to_string(emu.vxi11_port()) + "::inst0::INSTR";
    HRESULT hr = S_OK;
    EXPECT_FALSE(Open(vxi11, kSharedLock, 1000, &hr));
    EXPECT_EQ(hr, E_VISA_NOT_SUPPORTED);
    EXPECT_FALSE(Open(socket, kExclusiveLock, 1000, &hr));
    EXPECT_EQ(hr, E_VISA_NOT_SUPPORTED);
    ComPtr<IMessage> msg = Open(vxi11, kNoLock, 1000);
    ASSERT_TRUE(msg);
    EXPECT_EQ(msg->LockRsrc(kSharedLock, 0, nullptr, nullptr), E_VISA_NOT_SUPPORTED);
    EXPECT_EQ(msg->LockRsrc(7, 0, nullptr, nullptr), E_VISA_INVALID_LOCK_TYPE);
    EXPECT_EQ(msg->LockRsrc(kExclusiveLock, -2, nullptr, nullptr), E_INVALIDARG);
    LONG state = kExclusiveLock;
    ASSERT_EQ(msg->get_LockState(&state), S_OK);
    EXPECT_EQ(state, kNoLock);
    msg = Open(socket, kNoLock, 1000);
    ASSERT_TRUE(msg);
    EXPECT_EQ(msg->LockRsrc(kExclusiveLock, 0, nullptr, nullptr), E_VISA_NOT_SUPPORTED);
}

}  // namespace
}  // namespace qn::visa::test
