// What only raw-socket sessions do, against a scripted loopback peer: the
// status byte by a common query, byte arrays, the session's properties, and
// opens that fail (message_transport_test.cpp has what all transports share).
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

#include "platform/visa/serial.h"
#include "platform/visa/visa.h"
#include "tests/platform/visa/loopback_peer.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;

HRESULT OpenResource(const std::string& resource, LONG open_timeout, ComPtr<IVisaSession>* out) {
    ComPtr<IResourceManager> rm;
    EXPECT_EQ(CreateResourceManager(rm.Out()), S_OK);
    return rm->Open(Bstr(resource).get(), kNoLock, open_timeout, nullptr, out->Out());
}

// The largest status byte and the first number above it; a reply that is no number.
TEST(SocketSessionTest, StatusByteByCommonQuery) {
    const std::pair<const char*, HRESULT> kReplies[] = {{"+72", S_OK},
                                                        {"255", S_OK},
                                                        {"256", E_VISA_INVALID_FORMAT},
                                                        {"ON", E_VISA_INVALID_FORMAT}};
    LoopbackPeer peer;
    for (auto [reply, hr] : kReplies) peer.Expect("*STB?\n").Send(reply + std::string("\n"));
    peer.Start();
    auto msg = OpenMessage(peer.Resource());
    ASSERT_TRUE(msg);
    for (auto [reply, hr] : kReplies) {
        SHORT stb = -1;
        EXPECT_EQ(msg->ReadSTB(&stb), hr) << reply;
        EXPECT_EQ(stb, hr == S_OK ? std::atoi(reply) : -1) << reply;
    }
    msg.reset();
    EXPECT_EQ(peer.Finish(), "");
}

TEST(SocketSessionTest, ByteArraysWithCountsAndDirectCalls) {
    LoopbackPeer peer;
    peer.Expect(std::string("A\0B", 3)).Expect("AB").Send("xyz\n").Send("0123456789");
    peer.Start();
    auto msg = OpenMessage(peer.Resource());
    ASSERT_TRUE(msg);
    qn::com::SafeArray bytes = qn::com::SafeArray::Vector(VT_UI1, 3);
    std::memcpy(bytes.data<BYTE>(), "A\0B", 3);
    SAFEARRAY* sa = bytes.get();
    LONG written = 0;
    ASSERT_EQ(msg->Write(&sa, -1, &written), S_OK);
    EXPECT_EQ(written, 3);
    EXPECT_EQ(msg->Write(&sa, 4, &written), E_INVALIDARG);
    EXPECT_EQ(msg->Write(&sa, -2, &written), E_INVALIDARG);
    ComPtr<IMessageDirect> direct;
    ASSERT_EQ(msg.As(direct), S_OK);
    ASSERT_EQ(direct->WriteFrom(reinterpret_cast<const BYTE*>("AB"), 2, &written), S_OK);
    qn::com::SafeArray got;
    ASSERT_EQ(msg->Read(100, got.Out()), S_OK);
    ASSERT_EQ(got.size(), 4u);
    EXPECT_EQ(std::string(got.data<char>(), 4), "xyz\n");
    BYTE buf[16];
    LONG actual = 0, end = -1;
    ASSERT_EQ(direct->ReadInto(buf, 10, kReadIgnoreTermChar, &actual, &end), S_OK);
    EXPECT_EQ(actual, 10);
    EXPECT_EQ(end, kReadEndCount);
    EXPECT_EQ(msg->Read(-1, got.Out()), E_INVALIDARG);
    direct.reset();
    msg.reset();
    EXPECT_EQ(peer.Finish(), "");
}

TEST(SocketSessionTest, SessionPropertiesAndClose) {
    LoopbackPeer peer;
    peer.Start();
    auto msg = OpenMessage(peer.Resource());
    ASSERT_TRUE(msg);
    SHORT type = 0;
    msg->get_HardwareInterfaceType(&type);
    EXPECT_EQ(type, kInterfaceTcpip);
    Bstr cls, name;
    msg->get_ResourceClass(cls.Out());
    msg->get_ResourceName(name.Out());
    EXPECT_EQ(cls.utf8(), "SOCKET");
    EXPECT_EQ(name.utf8(), peer.Resource());
    EXPECT_EQ(msg->put_Timeout(-2), E_VISA_ATTRIBUTE_STATE);
    EXPECT_EQ(msg->put_Timeout(kTimeoutInfinite), S_OK);
    VARIANT_BOOL send_end = VARIANT_FALSE;
    msg->get_SendEndEnabled(&send_end);
    EXPECT_EQ(send_end, VARIANT_TRUE);
    ComPtr<IRegister> reg;
    ComPtr<ISerial> serial;
    EXPECT_EQ(msg.As(reg), E_NOINTERFACE);
    EXPECT_EQ(msg.As(serial), E_NOINTERFACE);  // line settings are for serial sessions only
    ASSERT_EQ(msg->Close(), S_OK);
    EXPECT_EQ(Write(msg.get(), "X\n"), E_VISA_INVALID_OBJECT);
    msg.reset();
    EXPECT_EQ(peer.Finish(), "");
}

struct OpenCase {
    std::string resource;
    HRESULT expected;
    const char* text;  // in the thread's error description
};

TEST(SocketSessionTest, OpenFailuresAreCleanAndExplained) {
    // A port where nothing listens: bind one, then close it.
    std::uint16_t port = 0;
    ::close(ListenLoopback(&port));
    const std::string closed_port = std::to_string(port);
    const OpenCase kCases[] = {
        {"TCPIP0::127.0.0.1::" + closed_port + "::SOCKET", E_VISA_RESOURCE_NOT_FOUND, "connect"},
        {"TCPIP0::127.0.0.1:" + closed_port + "::inst0::INSTR", E_VISA_RESOURCE_NOT_FOUND,
         "connect"},
        {"TCPIP0::127.0.0.1::hislip0," + closed_port + "::INSTR", E_VISA_RESOURCE_NOT_FOUND,
         "connect"},
        {"TCPIP0::127.0.0.1::hislip0,65536::INSTR", E_VISA_INVALID_RESOURCE_NAME, "port"},
        {"GPIB0::7::INSTR", E_VISA_RESOURCE_NOT_FOUND, "no transport"},
        {"TCPIP0::host::99999::SOCKET", E_VISA_INVALID_RESOURCE_NAME, "port"},
        {"garbage", E_VISA_INVALID_RESOURCE_NAME, "unrecognised"},
    };
    for (const OpenCase& c : kCases) {
        ComPtr<IVisaSession> session;
        EXPECT_EQ(OpenResource(c.resource, 2000, &session), c.expected) << c.resource;
        EXPECT_FALSE(session);
        EXPECT_NE(ThreadErrorText().find(c.text), std::string::npos) << c.resource;
    }
}

// A listener whose accept queue is full never completes a handshake: the
// open must give up by its open timeout.
TEST(SocketSessionTest, ConnectionThatNeverCompletesTimesOut) {
    std::uint16_t port = 0;
    const int lfd = ListenLoopback(&port, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    a.sin_port = htons(port);
    std::vector<int> fillers;
    for (int i = 0; i < 4; ++i) {
        int f = ::socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK, 0);
        ::connect(f, reinterpret_cast<sockaddr*>(&a), sizeof a);
        fillers.push_back(f);
    }
    ComPtr<IVisaSession> session;
    EXPECT_EQ(OpenResource(SocketResource(port), 300, &session), E_VISA_RESOURCE_NOT_FOUND);
    EXPECT_NE(ThreadErrorText().find("timed out"), std::string::npos);
    for (int f : fillers) ::close(f);
    ::close(lfd);
}

}  // namespace
}  // namespace qn::visa::test
