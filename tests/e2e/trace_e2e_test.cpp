// A traced session against the emulator leaves a well-formed trace file with
// one Method element per call, interface calls and I/O operations alike.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <pugixml.hpp>

#include "Quorlen731XX.h"
#include "core/root.h"
#include "emulator/emulator.h"

namespace qn::test {
namespace {

TEST(TraceOnEmulator, EveryCallLeavesAMethodElement) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    auto dir = std::filesystem::temp_directory_path() / ("qn-trace-" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    const std::string file = (dir / "session.xml").string();

    emu::Emulator emu("QDS2014A");
    std::uint16_t port = emu.Start();
    {
        ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
        com::Bstr r("TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET");
        com::Bstr o("QueryInstrStatus=true,DriverSetup=Trace=true,TraceName=" +
                    (dir / "session").string() + ",TraceArray=true");
        ASSERT_EQ(driver->Initialize(r.get(), VARIANT_TRUE, VARIANT_FALSE, o.get()), S_OK);
        LONG code = 0;
        com::Bstr msg;
        ASSERT_EQ(driver->ErrorQuery(&code, msg.Out()), S_OK);
        // A value with XML special characters is escaped by the document.
        ComPtr<IIviScopeAcquisition> acq;
        ASSERT_EQ(ComPtr<IIviDriver>(driver.get()).As(acq), S_OK);
        ASSERT_EQ(acq->put_TimePerRecord(0.002), S_OK);
        ASSERT_EQ(driver->Close(), S_OK);
    }
    pugi::xml_document doc;
    pugi::xml_parse_result parsed = doc.load_file(file.c_str());
    ASSERT_TRUE(parsed) << parsed.description();
    pugi::xml_node records = doc.child("TraceRecords");
    ASSERT_TRUE(records);
    int calls = 0, io = 0;
    bool saw_put = false;
    for (pugi::xml_node m : records.children("Method")) {
        // Close writes the file while its own record is still open.
        bool closing = std::string(m.attribute("Name").value()) == "Close";
        EXPECT_TRUE(m.attribute("StartTime") && m.attribute("Thread"));
        EXPECT_TRUE(closing || m.attribute("EndTime")) << m.attribute("Name").value();
        std::string itf = m.attribute("Interface").value();
        (itf == "CDriverIOManager" ? io : calls)++;
        if (std::string(m.attribute("Name").value()) == "put_TimePerRecord" &&
            itf == "IIviScopeAcquisition") {
            saw_put = true;
            EXPECT_STREQ(m.child("Parameter").attribute("Name").value(), "val");
            EXPECT_STREQ(m.child("Parameter").attribute("Value").value(), "0.002");
        }
    }
    EXPECT_TRUE(saw_put);
    EXPECT_GE(calls, 3);  // ErrorQuery, the put (and its forward), Close
    EXPECT_GE(io, 3);     // the instrument queries made for those calls
    std::filesystem::remove_all(dir);
}

}  // namespace
}  // namespace qn::test
