// The device lock between sessions: VXI-11 and HiSLIP against the emulator
// over loopback, and what is refused.
#include <gtest/gtest.h>

#include <functional>
#include <thread>

#include "emulator/emulator.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

ComPtr<IMessage> Open(const std::string& resource, LONG mode, LONG open_timeout,
                      HRESULT* hr = nullptr) {
    ComPtr<IResourceManager> rm;
    EXPECT_EQ(CreateResourceManager(rm.Out()), S_OK);
    ComPtr<IVisaSession> session;
    const HRESULT got =
        rm->Open(qn::com::Bstr(resource).get(), mode, open_timeout, nullptr, session.Out());
    if (hr) *hr = got;
    ComPtr<IMessage> msg;
    if (session) session.As(msg);
    if (msg) msg->put_Timeout(1000);
    return msg;
}

HRESULT Lock(IMessage* m, LONG timeout) {
    return m->LockRsrc(kExclusiveLock, timeout, nullptr, nullptr);
}

class DeviceLock : public ::testing::Test {
  protected:
    void SetUp() override {
        emu_.EnableVxi11();
        emu_.EnableHislip();
        emu_.Start();
        vxi11_ = "TCPIP0::127.0.0.1:" + std::to_string(emu_.vxi11_port()) + "::inst0::INSTR";
        hislip_ = "TCPIP0::127.0.0.1::hislip0," + std::to_string(emu_.hislip_port()) + "::INSTR";
    }
    emu::Emulator emu_{"QDS2014A"};
    std::string vxi11_, hislip_;
};

// While one VXI-11 link holds the lock, every operation of another ends with
// "locked", waiting for it or not (timeout 0: no waitlock); the holder's own
// I/O goes on, and opening with the lock gives up within the open timeout.
TEST_F(DeviceLock, Vxi11OperationsOfAnotherLinkFailWhileLocked) {
    ComPtr<IMessage> holder = Open(vxi11_, kExclusiveLock, 1000);
    ComPtr<IMessage> other = Open(vxi11_, kNoLock, 1000);
    ASSERT_TRUE(holder && other);
    LONG state = kNoLock;
    ASSERT_EQ(holder->get_LockState(&state), S_OK);
    EXPECT_EQ(state, kExclusiveLock);
    using Op = std::function<HRESULT(IMessage*)>;
    const std::pair<const char*, Op> ops[] = {
        {"write", [](IMessage* m) { return Write(m, "*CLS\n"); }},
        {"read", [](IMessage* m) { std::string s; return ReadText(m, &s); }},
        {"trigger", [](IMessage* m) { return m->AssertTrigger(kTriggerProtocolDefault); }},
        {"clear", [](IMessage* m) { return m->Clear(); }},
        {"status byte", [](IMessage* m) { SHORT stb; return m->ReadSTB(&stb); }},
        {"lock", [](IMessage* m) { return Lock(m, 50); }},
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
    HRESULT hr = S_OK;
    EXPECT_FALSE(Open(vxi11_, kExclusiveLock, 50, &hr));
    EXPECT_EQ(hr, E_VISA_RSRC_LOCKED);
}

// However the holder gives the lock up, another session can have it.
TEST_F(DeviceLock, TheLockEndsWithUnlockCloseOrTheConnection) {
    enum End { kUnlock, kNestedUnlock, kClose, kDropConnection, kWaitedFor };
    for (const std::string& resource : {vxi11_, hislip_}) {
        for (End end : {kUnlock, kNestedUnlock, kClose, kDropConnection, kWaitedFor}) {
            SCOPED_TRACE(resource + " way " + std::to_string(end));
            ComPtr<IMessage> other = Open(resource, kNoLock, 1000);
            ComPtr<IMessage> holder = Open(resource, kExclusiveLock, 1000);
            ASSERT_TRUE(other && holder);
            EXPECT_EQ(Lock(other.get(), 0), E_VISA_RSRC_LOCKED);
            HRESULT waited = E_FAIL;
            std::thread waiter;
            switch (end) {
                case kNestedUnlock:  // the first unlock of two keeps the device locked
                    ASSERT_EQ(Lock(holder.get(), 0), S_OK);
                    ASSERT_EQ(holder->UnlockRsrc(), S_OK);
                    EXPECT_EQ(Lock(other.get(), 50), E_VISA_RSRC_LOCKED);
                    [[fallthrough]];
                case kUnlock:
                    ASSERT_EQ(holder->UnlockRsrc(), S_OK);
                    EXPECT_EQ(holder->UnlockRsrc(), E_VISA_SESSION_NOT_LOCKED);
                    break;
                case kClose:
                    holder->Close();
                    break;
                case kDropConnection:  // the server sees the connection end, nothing else
                    emu_.DropConnectionOnNextQuery();
                    Write(holder.get(), "*TST?\n");
                    break;
                case kWaitedFor:  // a request that waits gets the lock once it is given up
                    waiter = std::thread([&] { waited = Lock(other.get(), 20000); });
                    EXPECT_EQ(holder->UnlockRsrc(), S_OK);
                    waiter.join();
                    EXPECT_EQ(waited, S_OK);
                    ASSERT_EQ(other->UnlockRsrc(), S_OK);
                    break;
            }
            // A link ended with its connection may still be on its way out.
            EXPECT_EQ(Lock(other.get(), 2000), S_OK) << ThreadErrorText();
        }
    }
}

// Shared locks, unknown lock types and buses without a device lock.
TEST_F(DeviceLock, WhatIsRefused) {
    const std::string socket = "TCPIP0::127.0.0.1::" + std::to_string(emu_.port()) + "::SOCKET";
    for (auto [resource, mode] : {std::pair{vxi11_, kSharedLock}, {socket, kExclusiveLock}}) {
        HRESULT hr = S_OK;
        EXPECT_FALSE(Open(resource, mode, 1000, &hr));
        EXPECT_EQ(hr, E_VISA_NOT_SUPPORTED) << resource;
    }
    ComPtr<IMessage> msg = Open(vxi11_, kNoLock, 1000);
    ASSERT_TRUE(msg);
    EXPECT_EQ(msg->LockRsrc(kSharedLock, 0, nullptr, nullptr), E_VISA_NOT_SUPPORTED);
    EXPECT_EQ(msg->LockRsrc(7, 0, nullptr, nullptr), E_VISA_INVALID_LOCK_TYPE);
    EXPECT_EQ(Lock(msg.get(), -2), E_INVALIDARG);
    LONG state = kExclusiveLock;
    ASSERT_EQ(msg->get_LockState(&state), S_OK);
    EXPECT_EQ(state, kNoLock);
    msg = Open(socket, kNoLock, 1000);
    ASSERT_TRUE(msg);
    EXPECT_EQ(Lock(msg.get(), 0), E_VISA_NOT_SUPPORTED);
}

}  // namespace
}  // namespace qn::visa::test
