#include "platform/visa/resource_name.h"

#include <gtest/gtest.h>

namespace qn::visa {
namespace {

struct Good {
    const char* text;
    int type;
    unsigned board;
    const char* cls;
    const char* host;
    int port;
    const char* device;
    const char* canonical;
};

constexpr Good kGood[] = {
    {"TCPIP0::192.168.1.5::5025::SOCKET", 6, 0, "SOCKET", "192.168.1.5", 5025, "",
     "TCPIP0::192.168.1.5::5025::SOCKET"},
    {"tcpip3::Scope-A::65535::socket", 6, 3, "SOCKET", "Scope-A", 65535, "",
     "TCPIP3::Scope-A::65535::SOCKET"},
    {"TCPIP::[::1]::5025::SOCKET", 6, 0, "SOCKET", "::1", 5025, "", "TCPIP0::[::1]::5025::SOCKET"},
    {"TCPIP::host", 6, 0, "INSTR", "host", 0, "inst0", "TCPIP0::host::inst0::INSTR"},
    {"TCPIP0::host::INSTR", 6, 0, "INSTR", "host", 0, "inst0", "TCPIP0::host::inst0::INSTR"},
    {"TCPIP0::host::hislip0::instr", 6, 0, "INSTR", "host", 0, "hislip0",
     "TCPIP0::host::hislip0::INSTR"},
    {"TCPIP0::127.0.0.1:65535::inst0::INSTR", 6, 0, "INSTR", "127.0.0.1", 65535, "inst0",
     "TCPIP0::127.0.0.1:65535::inst0::INSTR"},
    {"TCPIP::[::1]:1::INSTR", 6, 0, "INSTR", "::1", 1, "inst0", "TCPIP0::[::1]:1::inst0::INSTR"},
    {"  TCPIP0::host::5025::SOCKET\t", 6, 0, "SOCKET", "host", 5025, "",
     "TCPIP0::host::5025::SOCKET"},
    {"ASRL1::INSTR", 4, 1, "INSTR", "", 0, "", "ASRL1::INSTR"},
    {"asrl2", 4, 2, "INSTR", "", 0, "", "ASRL2::INSTR"},
    {"ASRL/dev/ttyUSB0::INSTR", 4, 0, "INSTR", "", 0, "", "ASRL/dev/ttyUSB0::INSTR"},
    {"USB0::0x0957::0x1796::MY123::INSTR", 7, 0, "INSTR", "", 0, "",
     "USB0::0x0957::0x1796::MY123::INSTR"},
    {"usb::2391::6038::MY123::0", 7, 0, "INSTR", "", 0, "",
     "USB0::0x0957::0x1796::MY123::0::INSTR"},
    {"GPIB0::7::INSTR", 1, 0, "INSTR", "", 0, "", "GPIB0::7::INSTR"},
    {"GPIB1::30::30", 1, 1, "INSTR", "", 0, "", "GPIB1::30::30::INSTR"},
};

TEST(ResourceNameTest, AcceptedFormsParseAndPrintCanonically) {
    for (const Good& g : kGood) {
        std::string error;
        auto r = ParseResourceName(g.text, &error);
        ASSERT_TRUE(r) << g.text << ": " << error;
        EXPECT_EQ(r->interface_type, g.type) << g.text;
        EXPECT_EQ(r->board, g.board) << g.text;
        EXPECT_EQ(r->resource_class, g.cls) << g.text;
        EXPECT_EQ(r->host, g.host) << g.text;
        EXPECT_EQ(r->port, g.port) << g.text;
        EXPECT_EQ(r->device_name, g.device) << g.text;
        EXPECT_EQ(r->Canonical(), g.canonical) << g.text;
        auto again = ParseResourceName(r->Canonical());
        ASSERT_TRUE(again) << r->Canonical();
        EXPECT_EQ(again->Canonical(), r->Canonical());
    }
}

TEST(ResourceNameTest, PartsOfSerialUsbAndGpibResources) {
    auto usb = ParseResourceName("USB0::0x0957::0xFFFF::MY123::255::INSTR");
    ASSERT_TRUE(usb);
    EXPECT_EQ(usb->vendor_id, 0x0957);
    EXPECT_EQ(usb->product_id, 0xFFFF);
    EXPECT_EQ(usb->serial_number, "MY123");
    EXPECT_EQ(usb->usb_interface, 255);
    auto gpib = ParseResourceName("GPIB0::7::3::INSTR");
    ASSERT_TRUE(gpib);
    EXPECT_EQ(gpib->primary_address, 7);
    EXPECT_EQ(gpib->secondary_address, 3);
    auto asrl = ParseResourceName("ASRL/dev/ttyS1");
    ASSERT_TRUE(asrl);
    EXPECT_EQ(asrl->device_path, "/dev/ttyS1");
}

TEST(ResourceNameTest, MalformedStringsAreRefusedWithAReason) {
    const char* kBad[] = {
        "",
        "::",
        "TCPIP",
        "TCPIP0",
        "TCPIPx::host::INSTR",
        "TCPIP0::::5025::SOCKET",
        "TCPIP0::host::SOCKET",
        "TCPIP0::host::0::SOCKET",
        "TCPIP0::host::65536::SOCKET",
        "TCPIP0::host::50a::SOCKET",
        "TCPIP0::host::-1::SOCKET",
        "TCPIP0::host::5025::extra::SOCKET",
        "TCPIP0::host::a::b::INSTR",
        "TCPIP0::host:0::INSTR",
        "TCPIP0::host:65536::inst0::INSTR",
        "TCPIP0::host:x::INSTR",
        "TCPIP0:::5::INSTR",
        "TCPIP0::[::1]:::INSTR",
        "TCPIP0::ho st::INSTR",
        "TCPIP0::[::1::5025::SOCKET",
        "TCPIP0::]::5025::SOCKET",
        "TCPIP0::[]::5025::SOCKET",
        "TCPIP99999999999::host::INSTR",
        "ASRL1::2::INSTR",
        "ASRL::SOCKET",
        "ASRLx::INSTR",
        "USB0::0x0957::0x1796::INSTR",
        "USB0::0x10000::0x1796::SN::INSTR",
        "USB0::0xZZ::0x1796::SN::INSTR",
        "USB0::1::2::SN::256::INSTR",
        "GPIB0::31::INSTR",
        "GPIB0::INSTR",
        "GPIB0::7::31::INSTR",
        "GPIB0::7::1::2::INSTR",
        "VXI0::1::INSTR",
        "MyScope",
        "TCPIP0::host::5025::SOCKET::",
        "USB0::1::2::SN:::INSTR",  // serial ending in a colon
        "TCPIP0:::host::5025::SOCKET",
    };
    for (const char* text : kBad) {
        std::string error;
        EXPECT_FALSE(ParseResourceName(text, &error)) << text;
        EXPECT_FALSE(error.empty()) << text;
    }
}

TEST(ResourceNameTest, EmbeddedNulAndControlBytesAreRefused) {
    using namespace std::string_view_literals;
    EXPECT_FALSE(ParseResourceName("TCPIP0::ho\0st::5025::SOCKET"sv));
    EXPECT_FALSE(ParseResourceName("TCPIP0::host\n::5025::SOCKET"sv));
}

}  // namespace
}  // namespace qn::visa
