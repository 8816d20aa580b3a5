// A traced session against the emulator leaves a well-formed trace file with
// one Method element per call, interface calls and I/O operations alike.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <pugixml.hpp>

#include "Quorlen731XX.h"
#include "core/root.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

TEST(TraceOnEmulator, EveryCallLeavesAMethodElement) {
    auto dir = std::filesystem::temp_directory_path() / ("qn-trace-" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    const std::string file = (dir / "session.xml").string();

    {
        EmulatedDriver session;
        const std::string options = "QueryInstrStatus=true,DriverSetup=Trace=true,TraceName=" +
                                    (dir / "session").string() + ",TraceArray=true";
        ASSERT_EQ(session.Open("QDS2014A", options.c_str()), S_OK);
        ComPtr<Quorlen731XX>& driver = session.driver;
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
        // Close writes the file while its own record is still open: only its
        // record has no end.
        bool closing = std::string(m.attribute("Name").value()) == "Close";
        EXPECT_TRUE(m.attribute("StartTime") && m.attribute("Thread"));
        EXPECT_NE(closing, bool(m.attribute("EndTime"))) << m.attribute("Name").value();
        EXPECT_NE(closing, bool(m.attribute("ExecutionTime"))) << m.attribute("Name").value();
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
