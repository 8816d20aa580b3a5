// Every documented member of the driver's interfaces is a row of its member
// table. The test walks the tables and fails on an interface without rows
// and on any documented member that is missing.
#include <gtest/gtest.h>

#include <filesystem>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <string_view>
#include <vector>

#include "Quorlen731XX.h"

namespace qn::test {
namespace {

struct Row {
    std::string_view interface_name, member;
};

constexpr Row kRows[] = {
#define QN_PROPERTY(Itf, Name, ...) {#Itf, #Name},
#define QN_NAVIGATION(Itf, Name, Target) {#Itf, #Name},
#define QN_METHOD(Itf, Name, ...) {#Itf, #Name},
#define QN_METHOD0(Itf, Name, ...) {#Itf, #Name},
#include "members/IIviScope.def"
#include "members/IIviScopeAcquisition.def"
#include "members/IIviScopeChannel.def"
#include "members/IIviScopeChannels.def"
#include "members/IIviScopeMeasurement.def"
#include "members/IIviScopeMeasurements.def"
#include "members/IIviScopeReferenceLevel.def"
#include "members/IIviScopeTrigger.def"
#include "members/IIviScopeTriggerAcLine.def"
#include "members/IIviScopeTriggerEdge.def"
#include "members/IIviScopeTriggerGlitch.def"
#include "members/IIviScopeTriggerRunt.def"
#include "members/IIviScopeTriggerTv.def"
#include "members/IIviScopeTriggerWidth.def"
#include "members/IQuorlen731XX.def"
#include "members/IQuorlen731XXAcquisition.def"
#include "members/IQuorlen731XXChannel.def"
#include "members/IQuorlen731XXChannels.def"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "members/IQuorlen731XXCursors.def"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "members/IQuorlen731XXDisplay.def"
#include "members/IQuorlen731XXExternal.def"
#include "members/IQuorlen731XXMeasurement.def"
#include "members/IQuorlen731XXMeasurements.def"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "members/IQuorlen731XXSetupMemory.def"
#include "members/IQuorlen731XXStatus.def"
#include "members/IQuorlen731XXSystem.def"
#include "members/IQuorlen731XXTrigger.def"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "members/IQuorlen731XXTriggerState.def"
#include "members/IQuorlen731XXTriggerTv.def"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "QnEndMembers.h"
};

// The interfaces that have a member table: one file each in include/members.
std::vector<std::string> Interfaces() {
    std::vector<std::string> names;
    for (const auto& f : std::filesystem::directory_iterator(QN_MEMBERS_DIR))
        if (f.path().extension() == ".def") names.push_back(f.path().stem().string());
    return names;
}

// The documented members of interfaces, by name (properties once, whatever
// their access), written from the interface documentation rather than from
// the tables.
const std::map<std::string_view, std::string_view>& Documented() {
    static const std::map<std::string_view, std::string_view> m = {
        {"IQuorlen731XX",
         "Acquisition Channels ConfigurableMeasurement Cursors DigitalChannels Display External "
         "Measurements MultiWaveformMeasurement ReferenceLevel SetupMemory Status System Trigger"},
        {"IQuorlen731XXSystem",
         "Date Time SerialNumber TimeoutMilliseconds TraceEnabled AsyncEventsEnabled IO "
         "WaitForOperationComplete SaveState RecallState PutState GetState GetScreenBitmap "
         "EnableLocalControls DisableLocalControls"},
        {"IQuorlen731XXSetupMemory", "Fetch Download"},
        {"IQuorlen731XXDisplay", "LabelEnabled Persistence PersistTime Erase Configure"},
        {"IQuorlen731XXCursors",
         "Enabled X1Position X2Position Y1Position Y2Position X1Y1Source X2Y2Source"},
        {"IQuorlen731XXExternal", "ProbeAttenuation ProbeSense Units"},
        {"IQuorlen731XXMeasurement",
         "FetchWaveformMeasurement ReadWaveformMeasurement FunctionName"},
        {"IIviScopeMeasurement", "FetchWaveformMeasurement ReadWaveformMeasurement"},
        {"IQuorlen731XXConfigurableMeasurement",
         "TimeAtEdgeOccurrence TimeAtEdgeSlope TimeAtValueOccurrence TimeAtValueSlope "
         "TimeAtValueValue ValueAtTimeTime"},
        {"IQuorlen731XXReferenceLevel", "High Mid Low Configure"},
        {"IIviScopeReferenceLevel", "High Mid Low Configure"},
        {"IQuorlen731XXMultiWaveformMeasurement",
         "Source2 DelayOccurence1 DelayOccurence2 DelaySlope1 DelaySlope2 ConfigureDelay "
         "ResetActivity ReadActivity"},
        {"IQuorlen731XXTrigger",
         "Type Source Level Coupling Holdoff Modifier Continuous Configure AcLine Edge Glitch "
         "Runt TV State Pattern Width"},
        {"IIviScopeTrigger",
         "Type Source Level Coupling Holdoff Modifier Continuous Configure AcLine Edge Glitch "
         "Runt TV Width"},
        {"IQuorlen731XXTriggerEdge", "Slope Configure"},
        {"IIviScopeTriggerEdge", "Slope Configure"},
        {"IQuorlen731XXTriggerAcLine", "Slope"},
        {"IIviScopeTriggerAcLine", "Slope"},
        {"IQuorlen731XXTriggerGlitch", "condition polarity Width Configure"},
        {"IIviScopeTriggerGlitch", "condition polarity Width Configure"},
        {"IQuorlen731XXTriggerWidth", "condition polarity ThresholdLow ThresholdHigh Configure"},
        {"IIviScopeTriggerWidth", "condition polarity ThresholdLow ThresholdHigh Configure"},
        {"IQuorlen731XXTriggerRunt", "polarity ThresholdHigh ThresholdLow Configure"},
        {"IIviScopeTriggerRunt", "polarity ThresholdHigh ThresholdLow Configure"},
        {"IQuorlen731XXTriggerTv", "Event LineNumber polarity SignalFormat Configure"},
        {"IIviScopeTriggerTv", "Event LineNumber polarity SignalFormat Configure"},
        {"IQuorlen731XXTriggerPattern",
         "AnalogMask AnalogPattern DigitalMask DigitalPattern condition Configure"},
        {"IQuorlen731XXTriggerState",
         "AnalogMask AnalogPattern DigitalMask DigitalPattern ClockSlope ClockSource Configure"},
    };
    return m;
}

TEST(MemberCoverage, DocumentedMembersOfInterfacesWithRowsAreAllRows) {
    std::map<std::string, std::set<std::string_view>, std::less<>> rows;
    // A property whose value is an interface is written as its getter method.
    for (const Row& r : kRows) {
        std::string_view member = r.member;
        if (member.starts_with("get_") || member.starts_with("put_")) member.remove_prefix(4);
        rows[std::string(r.interface_name)].insert(member);
    }
    // Every table is included above, and has rows.
    const std::vector<std::string> interfaces = Interfaces();
    EXPECT_GE(interfaces.size(), 40u);
    for (const std::string& itf : interfaces) EXPECT_TRUE(rows.count(itf)) << itf << ": no rows";
    EXPECT_EQ(rows.size(), interfaces.size());
    for (const auto& [itf, members] : Documented()) {
        const auto found = rows.find(itf);
        ASSERT_NE(found, rows.end()) << itf << " has no table";
        std::istringstream words{std::string(members)};
        for (std::string member; words >> member;)
            EXPECT_TRUE(found->second.count(member)) << itf << "." << member << " has no row";
    }
}

}  // namespace
}  // namespace qn::test
