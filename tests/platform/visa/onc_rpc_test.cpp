// The ONC RPC codec: record marking at every split of the stream, bounds on
// lengths read from the wire, call and reply messages.
#include <gtest/gtest.h>

#include "platform/visa/onc_rpc.h"

namespace qn::rpc {
namespace {

std::string U32(std::uint32_t v) {
    XdrWriter w;
    w.U32(v);
    return w.data();
}

// Records come out whole however the stream is cut, fragments joined.
TEST(OncRpc, RecordsSurviveEverySplitOfTheStream) {
    const std::string first(37, 'a'), second = "xyz";
    // The second record in two fragments: "xy" (not last), "z" (last).
    const std::string stream = FrameRecord(first) + U32(2) + "xy" + U32(0x80000001u) + "z" +
                               FrameRecord("");
    for (std::size_t chunk = 1; chunk <= stream.size(); ++chunk) {
        RecordReader reader(64);
        std::vector<std::string> got;
        std::string record;
        for (std::size_t off = 0; off < stream.size(); off += chunk) {
            std::string_view in = std::string_view(stream).substr(off, chunk);
            while (reader.Feed(&in, &record) == RecordReader::Status::kRecord) got.push_back(record);
            EXPECT_TRUE(in.empty());
        }
        EXPECT_EQ(got, (std::vector<std::string>{first, second, ""})) << "chunk " << chunk;
    }
}

// A record longer than the bound is refused from its header, before its
// data is held; fragments that add up past the bound are refused too.
TEST(OncRpc, RecordsPastTheBoundAreRefusedFromTheirHeaders) {
    const std::string cases[] = {
        U32(0x80000000u | 65),                // one fragment, one byte too long
        U32(0xFFFFFFFFu),                     // a giant length
        U32(40) + std::string(40, 'a') + U32(0x80000000u | 25),  // 40 + 25 > 64
    };
    for (const std::string& c : cases) {
        RecordReader reader(64);
        std::string record;
        std::string_view in(c);
        EXPECT_EQ(reader.Feed(&in, &record), RecordReader::Status::kTooLarge);
        std::string_view more("\x80\0\0\0", 4);
        EXPECT_EQ(reader.Feed(&more, &record), RecordReader::Status::kTooLarge);
    }
    RecordReader exact(64);
    std::string record;
    const std::string at_bound = FrameRecord(std::string(64, 'b'));
    std::string_view in(at_bound);
    EXPECT_EQ(exact.Feed(&in, &record), RecordReader::Status::kRecord);
    EXPECT_EQ(record.size(), 64u);
}

TEST(OncRpc, CallsAndRepliesRoundTrip) {
    XdrWriter args;
    args.I32(-5);
    args.Opaque("inst0");
    const std::string call = BuildCall(0xA1B2C3D4u, 0x0607AF, 1, 10, args.data());
    CallHeader h;
    std::string_view parsed;
    ASSERT_TRUE(ParseCall(call, &h, &parsed));
    EXPECT_EQ(h.xid, 0xA1B2C3D4u);
    EXPECT_EQ(h.program, 0x0607AFu);
    EXPECT_EQ(h.procedure, 10u);
    XdrReader r(parsed);
    std::int32_t v = 0;
    std::string_view name;
    ASSERT_TRUE(r.I32(&v) && r.Opaque(&name, 64));
    EXPECT_EQ(v, -5);
    EXPECT_EQ(name, "inst0");
    EXPECT_EQ(r.left(), 0u);

    const std::string reply = BuildReply(7, kSuccess, U32(42));
    std::uint32_t xid = 0;
    AcceptStat stat = kSystemErr;
    std::string_view results;
    ASSERT_EQ(ParseReply(reply, &xid, &stat, &results), ReplyStatus::kAccepted);
    EXPECT_EQ(xid, 7u);
    EXPECT_EQ(stat, kSuccess);
    EXPECT_EQ(results, U32(42));
}

// Every message cut short, and the wrong kinds of message, are refused.
TEST(OncRpc, ShortAndForeignMessagesAreRefused) {
    const std::string reply = BuildReply(7, kSuccess, "");
    for (std::size_t n = 0; n < reply.size(); ++n) {
        std::uint32_t xid = 0;
        AcceptStat stat{};
        std::string_view results;
        EXPECT_EQ(ParseReply(reply.substr(0, n), &xid, &stat, &results), ReplyStatus::kMalformed)
            << n;
    }
    const std::string call = BuildCall(1, 2, 3, 4, "");
    for (std::size_t n = 0; n < call.size(); ++n) {
        CallHeader h;
        std::string_view args;
        EXPECT_FALSE(ParseCall(call.substr(0, n), &h, &args)) << n;
    }
    std::uint32_t xid = 0;
    AcceptStat stat{};
    std::string_view results;
    EXPECT_EQ(ParseReply(call, &xid, &stat, &results), ReplyStatus::kMalformed);  // a call
    EXPECT_EQ(ParseReply(U32(9) + U32(1) + U32(1) + U32(0), &xid, &stat, &results),
              ReplyStatus::kDenied);
    // An opaque item longer than its bound, or than the message, is refused.
    XdrWriter w;
    w.Opaque("abcdef");
    std::string_view out;
    EXPECT_FALSE(XdrReader(w.data()).Opaque(&out, 5));
    EXPECT_TRUE(XdrReader(w.data()).Opaque(&out, 6));
    EXPECT_FALSE(XdrReader(std::string_view(w.data()).substr(0, 11)).Opaque(&out, 6));
    EXPECT_FALSE(XdrReader(U32(0xFFFFFFF0u)).Opaque(&out, ~std::size_t{0}));
}

}  // namespace
}  // namespace qn::rpc
