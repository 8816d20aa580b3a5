// The HiSLIP message codec: the byte layout of each message the client and
// the emulator exchange, both ways, and headers that are not HiSLIP.
#include "platform/visa/hislip_protocol.h"

#include <gtest/gtest.h>

namespace qn::hislip {
namespace {

std::string Bytes(std::initializer_list<int> v) {
    std::string s;
    for (int b : v) s += char(b);
    return s;
}

TEST(HislipCodec, MessagesHaveTheProtocolLayout) {
    struct Case {
        const char* what;
        std::uint8_t type, control;
        std::uint32_t parameter;
        std::string payload;
        std::string header;  // the 16 bytes expected before the payload
    };
    const Case cases[] = {
        {"Initialize: version 1.0, vendor QN, sub-address", kInitialize, 0, 0x0100514Eu, "hislip0",
         Bytes({'H', 'S', 0, 0, 0x01, 0x00, 'Q', 'N', 0, 0, 0, 0, 0, 0, 0, 7})},
        {"InitializeResponse: overlapped, session 0x1234", kInitializeResponse, kOverlapMode,
         0x01001234u, "", Bytes({'H', 'S', 1, 1, 0x01, 0x00, 0x12, 0x34, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"Data with RMT-delivered, first message id", kData, kRmtDelivered, kFirstMessageId,
         "*IDN?", Bytes({'H', 'S', 6, 1, 0xFF, 0xFF, 0xFF, 0x00, 0, 0, 0, 0, 0, 0, 0, 5})},
        {"DataEnd, id after a wrap", kDataEnd, 0, 0x00000002u, "\n",
         Bytes({'H', 'S', 7, 0, 0, 0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 1})},
        {"AsyncInitialize with the session id", kAsyncInitialize, 0, 0x00001234u, "",
         Bytes({'H', 'S', 17, 0, 0, 0, 0x12, 0x34, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"AsyncMaximumMessageSize: 8-byte size", kAsyncMaximumMessageSize, 0, 0,
         EncodeSize(0x0102030405060708ull),
         Bytes({'H', 'S', 15, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 8})},
        {"AsyncStatusQuery names the last id sent", kAsyncStatusQuery, kRmtDelivered,
         kFirstMessageId - kMessageIdStep, "",
         Bytes({'H', 'S', 21, 1, 0xFF, 0xFF, 0xFE, 0xFE, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"AsyncStatusResponse: status byte in the control code", kAsyncStatusResponse, 0x50, 0, "",
         Bytes({'H', 'S', 22, 0x50, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"AsyncDeviceClear", kAsyncDeviceClear, 0, 0, "",
         Bytes({'H', 'S', 19, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"DeviceClearComplete", kDeviceClearComplete, 0, 0, "",
         Bytes({'H', 'S', 8, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0})},
        {"FatalError with its text", kFatalError, kFatalBadHeader, 0, "bad",
         Bytes({'H', 'S', 2, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 3})},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        const std::string m = EncodeMessage(c.type, c.control, c.parameter, c.payload);
        ASSERT_EQ(m.size(), kHeaderSize + c.payload.size());
        EXPECT_EQ(m.substr(0, kHeaderSize), c.header);
        EXPECT_EQ(m.substr(kHeaderSize), c.payload);
        Header h;
        ASSERT_TRUE(DecodeHeader(reinterpret_cast<const std::uint8_t*>(m.data()), &h));
        EXPECT_EQ(h.type, c.type);
        EXPECT_EQ(h.control, c.control);
        EXPECT_EQ(h.parameter, c.parameter);
        EXPECT_EQ(h.length, c.payload.size());
    }
    std::uint64_t size = 0;
    ASSERT_TRUE(DecodeSize(EncodeSize(0x0102030405060708ull), &size));
    EXPECT_EQ(size, 0x0102030405060708ull);
    EXPECT_EQ(EncodeSize(0x0102030405060708ull), Bytes({1, 2, 3, 4, 5, 6, 7, 8}));
    EXPECT_FALSE(DecodeSize(std::string(7, '\0'), &size));
    EXPECT_FALSE(DecodeSize(std::string(9, '\0'), &size));
}

// Every byte of a 64-bit length is read, and anything but "HS" is refused
// without touching the result.
TEST(HislipCodec, DecodesFullLengthsAndRefusesOtherPrologues) {
    std::uint8_t raw[kHeaderSize];
    EncodeHeader({kDataEnd, 0, 0x89ABCDEFu, 0xFEDCBA9876543210ull}, raw);
    Header h;
    ASSERT_TRUE(DecodeHeader(raw, &h));
    EXPECT_EQ(h.length, 0xFEDCBA9876543210ull);
    EXPECT_EQ(h.parameter, 0x89ABCDEFu);
    for (const char* prologue : {"hs", "SH", "HT", "\0S"}) {
        SCOPED_TRACE(prologue);
        raw[0] = std::uint8_t(prologue[0]);
        raw[1] = std::uint8_t(prologue[1]);
        Header untouched{kError, 9, 9, 9};
        EXPECT_FALSE(DecodeHeader(raw, &untouched));
        EXPECT_EQ(untouched.type, kError);
        EXPECT_EQ(untouched.length, 9u);
    }
    EXPECT_EQ(MessageTypeName(kAsyncStatusQuery), "AsyncStatusQuery");
    EXPECT_EQ(MessageTypeName(kAsyncLockInfoResponse), "AsyncLockInfoResponse");
    EXPECT_EQ(MessageTypeName(200), "type 200");
}

}  // namespace
}  // namespace qn::hislip
