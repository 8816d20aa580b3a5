// IFormattedIO488 over a socket session: binary blocks in every chunking,
// lying and oversized headers, numbers, lists and block writes.
#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "tests/platform/visa/instrument_ends.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;
using qn::com::Variant;

// A formatted-I/O object over a socket session whose instrument end the
// test drives.
struct Bound {
    explicit Bound(LONG timeout_ms = 2000) {
        msg = end.Open(timeout_ms);
        EXPECT_EQ(CreateFormattedIO488(io.Out()), S_OK);
        EXPECT_EQ(io->put_IO(msg.get()), S_OK);
        EXPECT_EQ(io.As(direct), S_OK);
    }
    // Writes a query, checks that the instrument got it, has it answered and
    // reads the reply through the formatted object.
    std::string Query(const std::string& query, const std::string& reply) {
        EXPECT_EQ(Write(msg.get(), query), S_OK);
        EXPECT_EQ(end.ReceiveLine(), query);
        end.Send(reply);
        Bstr text;
        EXPECT_EQ(io->ReadString(text.Out()), S_OK) << ThreadErrorText();
        return text.utf8();
    }
    SocketEnd end;
    ComPtr<IMessage> msg;
    ComPtr<IFormattedIO488> io;
    ComPtr<IFormattedIO488Direct> direct;
};

// Binary data with line feeds in it: only the declared length may end it.
std::string BinaryData(std::size_t n) {
    std::string d(n, '\0');
    for (std::size_t i = 0; i < n; ++i) d[i] = char(i % 7 == 0 ? '\n' : i * 31);
    return d;
}

std::string Block(const std::string& data) {
    std::string len = std::to_string(data.size());
    return "#" + std::to_string(len.size()) + len + data;
}

TEST(FormattedIOTest, BlockWithEmbeddedLineFeedsAtEveryChunkSize) {
    const std::string data = BinaryData(300);
    const std::size_t kChunks[] = {1, 2, 3, 5, 7, 11, 64, 299, 300, 4096};
    Bound b;
    for (std::size_t chunk : kChunks) {
        b.end.Send(Block(data) + "\n", chunk, 0);
        Variant v;
        ASSERT_EQ(b.io->ReadIEEEBlock(BinaryType_UI1, VARIANT_FALSE, VARIANT_TRUE, &v), S_OK)
            << "chunk " << chunk << ": " << ThreadErrorText();
        ASSERT_EQ(v.vt, VT_ARRAY | VT_UI1);
        ASSERT_EQ(qn::com::SafeArrayCount(v.parray), data.size());
        EXPECT_EQ(std::memcmp(v.parray->pvData, data.data(), data.size()), 0) << chunk;
    }
    // Each trailing line feed was consumed: the next reply is not shifted.
    b.end.Send("1\n");
    Bstr next;
    ASSERT_EQ(b.io->ReadString(next.Out()), S_OK);
    EXPECT_EQ(next.utf8(), "1\n");
}

TEST(FormattedIOTest, WordBlocksHonourByteOrderAndDirectBuffers) {
    const std::string be("\x01\x02\xff\xfe", 4);  // 0x0102, 0xfffe big-endian
    Bound b;
    b.end.Send(Block(be) + "\n" + Block(be) + "\nxx#14" + be + "\n" + Block(be + be) + "\n");
    Variant v;
    ASSERT_EQ(b.io->ReadIEEEBlock(BinaryType_I2, VARIANT_FALSE, VARIANT_TRUE, &v), S_OK);
    ASSERT_EQ(v.vt, VT_ARRAY | VT_I2);
    const SHORT* got = static_cast<SHORT*>(v.parray->pvData);
    EXPECT_EQ(std::vector<SHORT>(got, got + 2), (std::vector<SHORT>{0x0102, -2}));
    b.io->put_InstrumentBigEndian(VARIANT_FALSE);
    ASSERT_EQ(b.io->ReadIEEEBlock(BinaryType_I2, VARIANT_FALSE, VARIANT_TRUE, &v), S_OK);
    EXPECT_EQ(static_cast<SHORT*>(v.parray->pvData)[0], 0x0201);
    b.io->put_InstrumentBigEndian(VARIANT_TRUE);
    // seekToBlock skips what precedes the '#'.
    SHORT words[4] = {};
    LONG actual = 0;
    ASSERT_EQ(
        b.direct->ReadIEEEBlockInto(BinaryType_I2, words, 4, &actual, VARIANT_TRUE, VARIANT_TRUE),
        S_OK);
    EXPECT_EQ(actual, 2);
    EXPECT_EQ(words[1], -2);
    // Too little room: the first elements are kept, the rest read and dropped.
    EXPECT_EQ(
        b.direct->ReadIEEEBlockInto(BinaryType_I2, words, 3, &actual, VARIANT_FALSE, VARIANT_TRUE),
        E_VISA_USER_BUFFER);
    EXPECT_EQ(actual, 3);
    EXPECT_EQ(words[2], 0x0102);
}

// Blocks end where their message ends, with the termination character on
// and off: "#0" data runs to the line feed that ends the message, and a
// definite block whose last data byte is a line feed leaves the real
// terminator to be dropped, so the next reply read is in step.
TEST(FormattedIOTest, BlocksEndWithTheirMessageWithTheTerminationCharacterOnAndOff) {
    struct Case {
        bool term_char;
        std::string reply;
        std::string data;
    };
    const std::string words("\x01\x02\xff\xfe\x00\x09", 6);
    const Case cases[] = {
        {true, "#0" + words + "\n", words},
        {false, "#0" + words + "\n", words},
        {true, "#0\n", ""},
        {false, "#0\n", ""},
        {true, "#16ab\ncd\n\n", "ab\ncd\n"},
        {false, "#16ab\ncd\n\n", "ab\ncd\n"},
        {true, "#11\n\n", "\n"},
    };
    Bound b;
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reply + (c.term_char ? " (term char on)" : " (term char off)"));
        b.msg->put_TerminationCharacterEnabled(c.term_char ? VARIANT_TRUE : VARIANT_FALSE);
        b.end.Send(c.reply + "NEXT\n");
        BYTE data[16] = {};
        LONG actual = -1;
        ASSERT_EQ(b.direct->ReadIEEEBlockInto(BinaryType_UI1, data, 16, &actual, VARIANT_FALSE,
                                              VARIANT_TRUE),
                  S_OK)
            << ThreadErrorText();
        EXPECT_EQ(std::string(reinterpret_cast<char*>(data), std::size_t(actual)), c.data);
        b.msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
        Bstr next;
        ASSERT_EQ(b.io->ReadString(next.Out()), S_OK) << ThreadErrorText();
        EXPECT_EQ(next.utf8(), "NEXT\n");
    }
}

// A sink is asked once, for the whole block; one that refuses still has the
// block read to its end, so the next reply is the next message.
TEST(FormattedIOTest, BlockSinkGetsTheWholeBlockOrRefusesIt) {
    struct Sink final : IBlockSink {
        std::vector<BYTE> memory;
        std::size_t limit = 0;
        std::vector<std::size_t> asked;
        BYTE* Reserve(std::size_t bytes) override {
            asked.push_back(bytes);
            if (bytes > limit) return nullptr;
            memory.resize(bytes);
            return memory.data();
        }
    } sink;
    const std::string be("\x01\x02\xff\xfe\x80\x00", 6);
    Bound b;
    b.end.Send(Block(be) + "\n" + Block(be) + "\n" + Block("") + "\n");
    LONG actual = -1;
    sink.limit = 6;
    ASSERT_EQ(
        b.direct->ReadIEEEBlockToSink(BinaryType_I2, &sink, &actual, VARIANT_FALSE, VARIANT_TRUE),
        S_OK);
    EXPECT_EQ(actual, 3);
    const SHORT* words = reinterpret_cast<const SHORT*>(sink.memory.data());
    EXPECT_EQ(std::vector<SHORT>(words, words + 3), (std::vector<SHORT>{0x0102, -2, -32768}));
    sink.limit = 5;
    EXPECT_EQ(
        b.direct->ReadIEEEBlockToSink(BinaryType_I2, &sink, &actual, VARIANT_FALSE, VARIANT_TRUE),
        E_OUTOFMEMORY);
    EXPECT_EQ(actual, 0);
    EXPECT_EQ(
        b.direct->ReadIEEEBlockToSink(BinaryType_I2, &sink, &actual, VARIANT_FALSE, VARIANT_TRUE),
        S_OK);
    EXPECT_EQ(actual, 0);
    EXPECT_EQ(sink.asked, (std::vector<std::size_t>{6, 6}));  // never for an empty block
    EXPECT_EQ(b.Query("*IDN?\n", "ok\n"), "ok\n");
    EXPECT_EQ(
        b.direct->ReadIEEEBlockToSink(BinaryType_I2, nullptr, &actual, VARIANT_FALSE, VARIANT_TRUE),
        E_POINTER);
}

// Lying, truncated and oversized headers fail cleanly, and the session is
// usable for the next query afterwards; a block of the largest size is read.
TEST(FormattedIOTest, BadBlockHeadersFailAndTheSessionRecovers) {
    struct Case {
        std::string reply;
        HRESULT expected;
    };
    const Case kCases[] = {
        {"#41000" + std::string(1000, 'x') + "\n", S_OK},                   // the bound itself
        {"#41002" + std::string(1002, 'x') + "\n", E_VISA_INVALID_FORMAT},  // beyond the bound
        {"#A123\n", E_VISA_INVALID_FORMAT},
        {"#5123\n", E_VISA_INVALID_FORMAT},    // message ends inside the header
        {"12345\n", E_VISA_INVALID_FORMAT},    // no block at all
        {"#13abcd\n", E_VISA_INVALID_FORMAT},  // 3 bytes for 2-byte elements
    };
    Bound b(500);
    b.direct->put_MaxBlockBytes(1000);
    for (const Case& c : kCases) {
        b.end.Send(c.reply);
        Variant v;
        EXPECT_EQ(b.io->ReadIEEEBlock(BinaryType_I2, VARIANT_FALSE, VARIANT_TRUE, &v), c.expected)
            << c.reply;
        if (FAILED(c.expected)) {
            EXPECT_FALSE(ThreadErrorText().empty());
        }
        EXPECT_EQ(b.Query("*OPC?\n", "1\n"), "1\n") << c.reply;
    }
}

TEST(FormattedIOTest, ConnectionDroppedMidBlock) {
    Bound b(kTimeoutInfinite);
    b.end.Send("#41000" + std::string(10, 'x'));
    b.end.HangUp();
    BYTE buf[1000];
    LONG actual = 0;
    EXPECT_EQ(b.direct->ReadIEEEBlockInto(BinaryType_UI1, buf, 1000, &actual, VARIANT_FALSE,
                                          VARIANT_TRUE),
              E_VISA_CONNECTION_LOST);
    EXPECT_EQ(actual, 10);
}

TEST(FormattedIOTest, NumbersAndListsOfEachType) {
    Bound b;
    b.end.Send("-1.2345678901234567E+01;-32768,32768\n1, 2 ,3\n1.5,ABC,#H10\n\n2.7V\n");
    Variant v;
    ASSERT_EQ(b.io->ReadNumber(ASCIIType_R8, VARIANT_FALSE, &v), S_OK);
    EXPECT_EQ(v.vt, VT_R8);
    EXPECT_EQ(v.dblVal, -12.345678901234567);  // every digit
    ASSERT_EQ(b.io->ReadNumber(ASCIIType_I2, VARIANT_FALSE, &v), S_OK);
    EXPECT_EQ(v.vt, VT_I2);
    EXPECT_EQ(v.iVal, -32768);  // the smallest, and the largest + 1 overflows
    EXPECT_EQ(b.io->ReadNumber(ASCIIType_I2, VARIANT_TRUE, &v), DISP_E_OVERFLOW);
    ASSERT_EQ(b.io->ReadList(ASCIIType_I4, nullptr, &v), S_OK);
    ASSERT_EQ(v.vt, VT_ARRAY | VT_I4);
    ASSERT_EQ(qn::com::SafeArrayCount(v.parray), 3u);
    EXPECT_EQ(static_cast<LONG*>(v.parray->pvData)[2], 3);
    ASSERT_EQ(b.io->ReadList(ASCIIType_Any, nullptr, &v), S_OK);
    ASSERT_EQ(v.vt, VT_ARRAY | VT_VARIANT);
    auto* items = static_cast<VARIANT*>(v.parray->pvData);
    EXPECT_EQ(items[0].vt, VT_R8);
    EXPECT_EQ(items[1].vt, VT_BSTR);
    EXPECT_EQ(qn::com::BstrToUtf8(items[1].bstrVal), "ABC");
    EXPECT_DOUBLE_EQ(items[2].dblVal, 16.0);
    // An empty reply holds no number.
    EXPECT_EQ(b.io->ReadNumber(ASCIIType_R8, VARIANT_TRUE, &v), E_VISA_INVALID_FORMAT);
    // A unit after the number is left for the flush.
    ASSERT_EQ(b.io->ReadNumber(ASCIIType_I4, VARIANT_TRUE, &v), S_OK);
    EXPECT_EQ(v.lVal, 2);
    EXPECT_EQ(b.io->ReadNumber(99, VARIANT_TRUE, &v), E_INVALIDARG);
}

TEST(FormattedIOTest, WritesAreBufferedAndByteExact) {
    Bound b;
    ASSERT_EQ(b.io->WriteString(Bstr(":TIM:SCAL ").get(), VARIANT_FALSE), S_OK);
    ASSERT_EQ(
        b.io->WriteNumber(Variant::Double(-1.23456789012345e-05), ASCIIType_R8, VARIANT_FALSE),
        S_OK);
    ASSERT_EQ(b.io->WriteString(Bstr("\n").get(), VARIANT_TRUE), S_OK);
    EXPECT_EQ(b.end.ReceiveLine(), ":TIM:SCAL -1.23456789012345e-05\n");
    ASSERT_EQ(b.io->WriteString(Bstr(":CHAN1:OFFS ").get(), VARIANT_FALSE), S_OK);
    ASSERT_EQ(b.io->WriteNumber(Variant::Double(-2.6), ASCIIType_I4, VARIANT_FALSE), S_OK);
    ASSERT_EQ(b.io->WriteString(Bstr("\n").get(), VARIANT_TRUE), S_OK);
    EXPECT_EQ(b.end.ReceiveLine(), ":CHAN1:OFFS -3\n");
    EXPECT_EQ(b.io->WriteNumber(Variant::Double(32768), ASCIIType_I2, VARIANT_TRUE),
              DISP_E_OVERFLOW);

    Variant list;
    list.vt = VT_ARRAY | VT_R8;
    list.parray = SafeArrayCreateVector(VT_R8, 0, 3);
    double values[3] = {1, 2.5, -3};
    std::memcpy(list.parray->pvData, values, sizeof values);
    ASSERT_EQ(b.io->WriteString(Bstr("VALS ").get(), VARIANT_FALSE), S_OK);
    ASSERT_EQ(b.io->WriteList(&list, ASCIIType_R8, nullptr, VARIANT_FALSE), S_OK);
    ASSERT_EQ(b.io->WriteString(Bstr("\n").get(), VARIANT_TRUE), S_OK);
    EXPECT_EQ(b.end.ReceiveLine(), "VALS 1,2.5,-3\n");

    Variant words;
    words.vt = VT_ARRAY | VT_I2;
    words.parray = SafeArrayCreateVector(VT_I2, 0, 2);
    SHORT w[2] = {0x0102, -2};
    std::memcpy(words.parray->pvData, w, sizeof w);
    ASSERT_EQ(b.io->WriteIEEEBlock(Bstr(":WMEM ").get(), words, VARIANT_FALSE), S_OK);
    ASSERT_EQ(b.io->WriteString(Bstr("\n").get(), VARIANT_TRUE), S_OK);
    EXPECT_EQ(b.end.ReceiveLine(), std::string(":WMEM #14\x01\x02\xff\xfe\n", 14));
}

// A reply that timed out half-read must not prefix the next one.
TEST(FormattedIOTest, TimedOutReplyDoesNotLeakIntoTheNext) {
    Bound b(150);
    b.end.Send("abc");
    Bstr text;
    EXPECT_EQ(b.io->ReadString(text.Out()), E_VISA_TIMEOUT);
    b.end.Send("def\n");
    EXPECT_EQ(b.Query("B?\n", "good\n"), "good\n");
}

TEST(FormattedIOTest, UnboundObjectAndArguments) {
    ComPtr<IFormattedIO488> io;
    ASSERT_EQ(CreateFormattedIO488(io.Out()), S_OK);
    BSTR s = nullptr;
    EXPECT_EQ(io->ReadString(&s), E_VISA_INVALID_OBJECT);
    EXPECT_EQ(io->FlushWrite(VARIANT_TRUE), E_VISA_INVALID_OBJECT);
    EXPECT_EQ(io->SetBufferSize(IO_IN_BUF, 4), E_INVALIDARG);
    EXPECT_EQ(io->SetBufferSize(64, 4096), E_INVALIDARG);
    EXPECT_EQ(io->SetBufferSize(IO_IN_BUF | IO_OUT_BUF, 4096), S_OK);
    ComPtr<IFormattedIO488Direct> direct;
    ASSERT_EQ(io.As(direct), S_OK);
    EXPECT_EQ(direct->put_MaxBlockBytes(-1), E_INVALIDARG);
    LONGLONG bound = 0;
    direct->get_MaxBlockBytes(&bound);
    EXPECT_EQ(bound, kDefaultMaxBlockBytes);
    EXPECT_EQ(io->ReadIEEEBlock(BinaryType_UI1, VARIANT_FALSE, VARIANT_FALSE, nullptr), E_POINTER);
    EXPECT_EQ(io->ReadIEEEBlock(ASCIIType_BSTR, VARIANT_FALSE, VARIANT_FALSE, nullptr), E_POINTER);
}

}  // namespace
}  // namespace qn::visa::test
