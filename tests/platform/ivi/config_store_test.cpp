// The configuration store reader: sessions, logical names, modules, typed
// settings, virtual names and every kind of bad input.
#include "platform/ivi/config_store.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

namespace {

using namespace qn::ivi;

const char* kStore = R"(<?xml version="1.0"?>
<IviConfigurationStore version="1">
  <HardwareAsset name="Bench" resourceDescriptor=" TCPIP0::127.0.0.1::INSTR "/>
  <SoftwareModule name="Qn731XX" description="scope driver">
    <DataComponent name="Configurable Initial Settings" type="Structure">
      <DataComponent name=" Model " type="String" value="QDS4032A"/>
      <DataComponent name="Points" type="Integer" value="-2147483648"/>
      <DataComponent name="Gain" type="Real" value="2.5e-3"/>
      <DataComponent name="Fast" type="Boolean" value="TRUE"/>
      <DataComponent name="Nested" type="Structure">
        <DataComponent name="Inner" type="Integer" value="1"/>
      </DataComponent>
      <DataComponent name="Api" type="APIReference" value="IviScope"/>
    </DataComponent>
  </SoftwareModule>
  <DriverSession name="Scope1" hardwareAsset="Bench" softwareModule="Qn731XX"
                 cache="false" interchangeCheck="1" queryInstrStatus="true"
                 rangeCheck="0" recordCoercions="TRUE" simulate="true">
    <DriverSetup>Model=QDS4032A, Trace=false</DriverSetup>
    <VirtualName name="Probe" mapTo="UserChannel2"/>
    <VirtualName name="Ch" mapTo="Channel">
      <Range start="1" end="3" physicalStart="1"/>
      <Range start="10" end="11" physicalStart="5"/>
    </VirtualName>
    <DataComponent name="Configurable Initial Settings" type="Structure">
      <DataComponent name="Model" type="String" value="73122D"/>
    </DataComponent>
  </DriverSession>
  <DriverSession name="Plain"/>
  <LogicalName name="MyScope" session="Scope1"/>
  <LogicalName name="Plain" session="Scope1"/>
</IviConfigurationStore>
)";

ConfigStore LoadOk(std::string_view xml) {
    LoadResult r = ConfigStore::Parse(xml);
    EXPECT_TRUE(r.loaded()) << r.error;
    return r.store;
}

// The six flags in the order cache, interchange check, query status, range
// check, record coercions, simulate.
std::vector<bool> Flags(const SessionFlags& f) {
    return {f.cache,       f.interchange_check, f.query_instr_status,
            f.range_check, f.record_coercions,  f.simulate};
}

TEST(ConfigStore, SessionsCarryAssetFlagsSetupAndModuleOrTheDefaults) {
    ConfigStore store = LoadOk(kStore);
    const DriverSession* s = store.FindSession("Scope1");
    ASSERT_NE(s, nullptr);
    EXPECT_TRUE(s->HasHardwareAsset());
    EXPECT_EQ(s->resource_descriptor, "TCPIP0::127.0.0.1::INSTR");
    EXPECT_EQ(s->software_module, "Qn731XX");
    EXPECT_EQ(s->driver_setup, "Model=QDS4032A, Trace=false");
    // Every flag the opposite of its default, spelt false/1/true/0/TRUE/true.
    EXPECT_EQ(Flags(s->flags), (std::vector<bool>{false, true, true, false, true, true}));
    const DriverSession* plain = nullptr;
    for (const auto& session : store.sessions())
        if (session.name == "Plain") plain = &session;
    ASSERT_NE(plain, nullptr);
    EXPECT_FALSE(plain->HasHardwareAsset());
    EXPECT_TRUE(plain->virtual_name_map.empty());
    EXPECT_TRUE(plain->resource_descriptor.empty());
    EXPECT_EQ(Flags(plain->flags), (std::vector<bool>{true, false, false, true, false, false}));
}

TEST(ConfigStore, LogicalNamesResolveFirstAndNamesAreCaseSensitive) {
    ConfigStore store = LoadOk(kStore);
    ASSERT_NE(store.FindSession("MyScope"), nullptr);
    EXPECT_EQ(store.FindSession("MyScope")->name, "Scope1");
    // "Plain" is both a logical name and a session: the logical name wins.
    EXPECT_EQ(store.FindSession("Plain")->name, "Scope1");
    for (const char* missing : {"myscope", "TCPIP0::127.0.0.1::INSTR", ""})
        EXPECT_EQ(store.FindSession(missing), nullptr) << missing;
    EXPECT_NE(store.FindSoftwareModule("Qn731XX"), nullptr);
    EXPECT_EQ(store.FindSoftwareModule("Other"), nullptr);
}

TEST(ConfigStore, InitialSettingsAreTypedAndIndexedFromOne) {
    ConfigStore store = LoadOk(kStore);
    const SoftwareModule* m = store.FindSoftwareModule("Qn731XX");
    ASSERT_NE(m, nullptr);
    const auto* settings = FindStructure(m->data_components, kConfigurableInitialSettings);
    ASSERT_NE(settings, nullptr);
    ASSERT_EQ(settings->size(), 6u);
    for (int outside : {0, 7, -1}) EXPECT_EQ(DataComponentAt(*settings, outside), nullptr);

    const DataComponent* model = DataComponentAt(*settings, 1);
    EXPECT_EQ(model->name, "Model");  // attribute blanks are trimmed
    EXPECT_EQ(std::get<std::string>(model->value), "QDS4032A");
    EXPECT_EQ(std::get<std::int32_t>(DataComponentAt(*settings, 2)->value), INT32_MIN);
    EXPECT_DOUBLE_EQ(std::get<double>(DataComponentAt(*settings, 3)->value), 2.5e-3);
    EXPECT_TRUE(std::get<bool>(DataComponentAt(*settings, 4)->value));
    const DataComponent* nested = DataComponentAt(*settings, 5);
    EXPECT_EQ(nested->type, DataType::kStructure);
    ASSERT_EQ(nested->children.size(), 1u);
    EXPECT_EQ(DataComponentAt(*settings, 6)->type, DataType::kApiReference);
    EXPECT_EQ(DataTypeName(DataComponentAt(*settings, 6)->type), "APIReference");

    const DriverSession* s = store.FindSession("Scope1");
    const auto* session_settings = FindStructure(s->data_components, kConfigurableInitialSettings);
    ASSERT_NE(session_settings, nullptr);
    EXPECT_EQ(std::get<std::string>(DataComponentAt(*session_settings, 1)->value), "73122D");
    EXPECT_EQ(FindStructure(s->data_components, "Other"), nullptr);
}

TEST(ConfigStore, VirtualNamesExpandWithAndWithoutRanges) {
    ConfigStore store = LoadOk(kStore);
    const VirtualNameMap expected = {
        {"probe", "UserChannel2"}, {"ch1", "Channel1"},  {"ch2", "Channel2"},
        {"ch3", "Channel3"},       {"ch10", "Channel5"}, {"ch11", "Channel6"},
    };
    EXPECT_EQ(store.FindSession("Scope1")->virtual_name_map, expected);
}

struct BadStore {
    const char* name;
    std::string body;      // placed inside <IviConfigurationStore>
    const char* expected;  // part of the error text
};

// A software module holding one data component "a" of type and value.
std::string Component(const char* type, const char* value) {
    return "<SoftwareModule name='m'><DataComponent name='a' type='" + std::string(type) + "'" +
           (value ? " value='" + std::string(value) + "'" : "") + "/></SoftwareModule>";
}
// A session with a virtual name "c" over one range.
std::string Range(const char* start, const char* end, const char* physical) {
    return "<DriverSession name='x'><VirtualName name='c' mapTo='C'><Range start='" +
           std::string(start) + "' end='" + end + "' physicalStart='" + physical +
           "'/></VirtualName></DriverSession>";
}

const BadStore kBadStores[] = {
    {"unknown_element", "<Session name='x'/>", "unexpected <Session>"},
    {"misspelt_flag", "<DriverSession name='x' simualte='1'/>", "unknown attribute \"simualte\""},
    {"bad_flag_value", "<DriverSession name='x' simulate='yes'/>", "\"simulate\" must be"},
    {"session_without_name", "<DriverSession/>", "non-empty \"name\""},
    {"duplicate_session", "<DriverSession name='x'/><DriverSession name='x'/>", "defined twice"},
    {"unknown_asset", "<DriverSession name='x' hardwareAsset='none'/>", "unknown hardware asset"},
    {"unknown_module", "<DriverSession name='x' softwareModule='none'/>",
     "unknown software module"},
    {"dangling_logical_name", "<LogicalName name='a' session='none'/>", "unknown session"},
    {"unknown_type", Component("Text", "1"), "unknown type \"Text\""},
    {"integer_overflow", Component("Integer", "2147483648"), "not a valid Integer"},
    {"integer_junk", Component("Integer", "12abc"), "not a valid Integer"},
    {"real_junk", Component("Real", "1.5V"), "not a valid Real"},
    {"boolean_junk", Component("Boolean", "on"), "not a valid Boolean"},
    {"missing_value", Component("String", nullptr), "needs a \"value\""},
    {"duplicate_component",
     "<SoftwareModule name='m'><DataComponent name='a' type='String' value=''/>"
     "<DataComponent name='a' type='String' value=''/></SoftwareModule>",
     "defined twice"},
    {"range_reversed", Range("4", "1", "1"), "end is below"},
    {"range_one_too_many", Range("0", "100000", "1"), "more than 100000"},
    {"range_negative", Range("-1", "1", "1"), "non-negative"},
    {"range_physical_overflow", Range("0", "9", "2147483639"), "exceed"},
    {"virtual_collision",
     "<DriverSession name='x'><VirtualName name='c1' mapTo='A'/><VirtualName name='C' "
     "mapTo='B'><Range start='1' end='1' physicalStart='1'/></VirtualName></DriverSession>",
     "more than once"},
};

TEST(ConfigStore, SchemaErrorsNameTheProblemAndItsPosition) {
    for (const BadStore& bad : kBadStores) {
        std::string xml = "<IviConfigurationStore>\n" + bad.body + "\n</IviConfigurationStore>";
        LoadResult r = ConfigStore::Parse(xml, "test.xml");
        EXPECT_EQ(r.status, LoadStatus::kError) << bad.name;
        EXPECT_NE(r.error.find(bad.expected), std::string::npos) << bad.name << ": " << r.error;
        EXPECT_EQ(r.error.rfind("test.xml: line 2", 0), 0u) << bad.name << ": " << r.error;
    }
}

// The largest range and the one ending at the largest physical index load.
TEST(ConfigStore, RangesAtTheirLimitsLoad) {
    for (const std::string& range : {Range("1", "100000", "1"), Range("0", "9", "2147483638")}) {
        LoadResult r =
            ConfigStore::Parse("<IviConfigurationStore>" + range + "</IviConfigurationStore>");
        EXPECT_TRUE(r.loaded()) << range << ": " << r.error;
    }
}

TEST(ConfigStore, MalformedXmlCarriesTheParserMessageAndOffset) {
    struct Case {
        std::string xml;
        const char* parser_text;
    };
    for (const Case& c :
         {Case{"<IviConfigurationStore><DriverSession name='x'>", "Start-end tags mismatch"},
          Case{"", "No document element found"},
          Case{"<IviConfigurationStore>\n<a b=></a></IviConfigurationStore>",
               "Error parsing element attribute"},
          Case{std::string("<Ivi\0Store/>", 12), ""},
          Case{"<Other/>", "expected <IviConfigurationStore>"}}) {
        LoadResult r = ConfigStore::Parse(c.xml, "s.xml");
        EXPECT_EQ(r.status, LoadStatus::kError);
        EXPECT_NE(r.error.find(c.parser_text), std::string::npos) << r.error;
        EXPECT_NE(r.error.find("offset"), std::string::npos) << r.error;
    }
}

// A temporary file removed at the end of the test.
class TempFile {
  public:
    explicit TempFile(const std::string& content) {
        char name[] = "/tmp/qn-ivi-store-XXXXXX";
        int fd = mkstemp(name);
        path_ = name;
        if (fd >= 0) close(fd);
        std::ofstream(path_) << content;
    }
    ~TempFile() { std::remove(path_.c_str()); }
    const std::string& path() const { return path_; }

  private:
    std::string path_;
};

TEST(ConfigStore, FilesMissingPresentOrUnreadable) {
    EXPECT_EQ(ConfigStore::Load("/nonexistent/dir/store.xml").status, LoadStatus::kAbsent);
    TempFile good(kStore);
    LoadResult r = ConfigStore::Load(good.path());
    ASSERT_TRUE(r.loaded()) << r.error;
    EXPECT_NE(r.store.FindSession("MyScope"), nullptr);

    LoadResult dir = ConfigStore::Load("/tmp");
    EXPECT_EQ(dir.status, LoadStatus::kError);
    EXPECT_NE(dir.error.find("/tmp"), std::string::npos);

    TempFile bad("<IviConfigurationStore>");
    LoadResult broken = ConfigStore::Load(bad.path());
    EXPECT_EQ(broken.status, LoadStatus::kError);
    EXPECT_EQ(broken.error.rfind(bad.path(), 0), 0u) << broken.error;
}

TEST(ConfigStore, DefaultLocationComesFromTheEnvironment) {
    TempFile good(kStore);
    setenv("IVI_CONFIG_STORE", good.path().c_str(), 1);
    EXPECT_EQ(ConfigStore::ProcessDefaultLocation(), good.path());
    EXPECT_TRUE(ConfigStore::LoadDefault().loaded());
    setenv("IVI_CONFIG_STORE", "", 1);
    EXPECT_EQ(ConfigStore::ProcessDefaultLocation(), "");
    unsetenv("IVI_CONFIG_STORE");
    EXPECT_EQ(ConfigStore::MasterLocation(), "/etc/ivi/IviConfigurationStore.xml");
}

}  // namespace
