// The emulator's HiSLIP server seen from a raw client: the handshake, replies tagged and split
// as the client asked, and out-of-order or broken messages answered with Error (connection
// kept) or FatalError (connection closed).
#include <gtest/gtest.h>

#include <optional>

#include "emulator/emulator.h"
#include "platform/visa/hislip_protocol.h"
#include "tests/emulator/scpi_client.h"

namespace qn::emu::test {
namespace {

using namespace qn::hislip;

struct Message {
    Header h;
    std::string payload;
};

std::optional<Message> Next(ScpiClient& c) {
    const auto raw = c.ReadBytes(kHeaderSize);
    Message m;
    if (!raw || !DecodeHeader(reinterpret_cast<const std::uint8_t*>(raw->data()), &m.h))
        return std::nullopt;
    const auto payload = c.ReadBytes(std::size_t(m.h.length));
    if (!payload) return std::nullopt;
    m.payload = *payload;
    return m;
}

// Opens the synchronous channel; the session id.
std::uint16_t Initialize(ScpiClient& sync) {
    sync.SendRaw(EncodeMessage(kInitialize, 0, 0x0100514Eu, "hislip0"));
    const auto r = Next(sync);
    EXPECT_TRUE(r && r->h.type == kInitializeResponse);
    return r ? std::uint16_t(r->h.parameter & 0xffff) : 0;
}

TEST(EmulatorHislip, BrokenOrOutOfOrderMessagesAreRefused) {
    struct Case {
        const char* what;
        bool initialized;  // sent after a completed Initialize
        std::string bytes;
        std::uint8_t reply_type, reply_control;
        bool closes;
    };
    std::uint8_t giant[kHeaderSize];
    EncodeHeader({kDataEnd, 0, kFirstMessageId, 2u << 20}, giant);
    const Case cases[] = {
        {"bad prologue first", false, "XS" + std::string(14, '\0'), kFatalError, kFatalBadHeader,
         true},
        {"data before Initialize", false, EncodeMessage(kDataEnd, 0, kFirstMessageId, "*IDN?"),
         kFatalError, kFatalBadInitialization, true},
        {"AsyncInitialize of no session", false, EncodeMessage(kAsyncInitialize, 0, 0x7777),
         kFatalError, kFatalBadInitialization, true},
        {"sub-address that is not HiSLIP", false,
         EncodeMessage(kInitialize, 0, 0x0100514Eu, "inst0"), kFatalError, kFatalUnidentified,
         true},
        {"unknown message type", true, EncodeMessage(99, 0, 0, "xyz"), kError,
         kErrorUnrecognizedMessageType, false},
        {"data beyond the server's size", true,
         std::string(reinterpret_cast<const char*>(giant), kHeaderSize), kFatalError,
         kFatalUnidentified, true},
        {"bad prologue later", true, "HT" + std::string(14, '\0'), kFatalError, kFatalBadHeader,
         true},
    };
    Emulator emu("QDS2014A");
    emu.EnableHislip();
    emu.Start();
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        ScpiClient sync(emu.hislip_port());
        if (c.initialized) Initialize(sync);
        sync.SendRaw(c.bytes);
        const auto r = Next(sync);
        ASSERT_TRUE(r);
        EXPECT_EQ(r->h.type, c.reply_type);
        EXPECT_EQ(r->h.control, c.reply_control);
        if (c.closes) {
            EXPECT_TRUE(sync.PeerClosed());
            continue;
        }
        sync.SendRaw(EncodeMessage(kDataEnd, 0, kFirstMessageId, "*OPC?"));
        const auto reply = Next(sync);
        ASSERT_TRUE(reply);
        EXPECT_EQ(reply->h.type, kDataEnd);
        EXPECT_EQ(reply->payload, "1\n");
    }
}

// A reply larger than the client takes comes in Data pieces of that size, then DataEnd, all
// with the id of the DataEnd that asked; the second channel of a session is refused, and the
// asynchronous channel ends with the synchronous one.
TEST(EmulatorHislip, RepliesAreSplitAtTheClientSizeAndTaggedWithTheQueryId) {
    Emulator emu("QDS2014A");
    emu.EnableHislip();
    emu.Start();
    ScpiClient sync(emu.hislip_port()), async(emu.hislip_port()), second(emu.hislip_port());
    const std::uint16_t session = Initialize(sync);
    async.SendRaw(EncodeMessage(kAsyncInitialize, 0, session));
    ASSERT_EQ(Next(async)->h.type, kAsyncInitializeResponse);
    second.SendRaw(EncodeMessage(kAsyncInitialize, 0, session));
    EXPECT_EQ(Next(second)->h.type, kFatalError);
    async.SendRaw(EncodeMessage(kAsyncMaximumMessageSize, 0, 0, EncodeSize(7)));
    const auto size = Next(async);
    ASSERT_TRUE(size);
    std::uint64_t server_max = 0;
    ASSERT_TRUE(DecodeSize(size->payload, &server_max));
    EXPECT_EQ(server_max, 1u << 20);

    const std::uint32_t id = 0x00000004u;
    sync.SendRaw(EncodeMessage(kData, 0, id - 2, "*ID") + EncodeMessage(kDataEnd, 0, id, "N?"));
    std::string reply;
    for (;;) {
        const auto m = Next(sync);
        ASSERT_TRUE(m);
        EXPECT_EQ(m->h.parameter, id);
        ASSERT_TRUE(m->h.type == kData || m->h.type == kDataEnd);
        reply += m->payload;
        if (m->h.type == kDataEnd) {
            EXPECT_LE(m->payload.size(), 7u);
            break;
        }
        EXPECT_EQ(m->payload.size(), 7u);
    }
    EXPECT_EQ(reply.rfind("QUORLEN TECHNOLOGIES,QDS2014A,", 0), 0u) << reply;
    EXPECT_EQ(reply.back(), '\n');
    // The asynchronous channel lives as long as the synchronous one.
    sync.Close();
    EXPECT_TRUE(async.PeerClosed());
}

}  // namespace
}  // namespace qn::emu::test
