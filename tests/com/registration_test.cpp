// Registration into a registry file of the test's own: every entry written,
// removed again (the shared keys stay), idempotence, stale entries replaced,
// failures reported; the placeholder processor.
#include "com/registration.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "Quorlen731XXIds.h"
#include "com/exports.h"
#include "platform/com/activation.h"
#include "platform/com/errorinfo.h"
#include "platform/com/registry.h"
#include "tests/com/module_fixture.h"

namespace {

using qn::com::GuidToString;
using qn::com::RegistryTree;
namespace fs = std::filesystem;

const std::string kClsid = GuidToString(CLSID_Quorlen731XX);
const std::string kAppId = GuidToString(APPID_Quorlen731XX);
const std::string kLibId = GuidToString(LIBID_Quorlen731XXLib);
const std::string kCat1 = GuidToString(CATID_Quorlen731XXIviDrivers);
const std::string kCat2 = GuidToString(CATID_Quorlen731XXIviScopeDrivers);
const std::string kClassKey = "HKCR\\CLSID\\" + kClsid;

HRESULT RegisterModule() { return qn::test::CallModule("DllRegisterServer"); }
HRESULT UnregisterModule() { return qn::test::CallModule("DllUnregisterServer"); }

// A key written by registration; a null name means the key alone.
struct Expected {
    std::string key;
    const char* name;
    std::string value;
};

const std::vector<Expected>& ExpectedEntries() {
    static const std::vector<Expected> entries = {
        {"HKCR\\AppID\\" + kAppId, "", "Quorlen731XX"},
        {"HKCR\\AppID\\Quorlen731XX.DLL", "AppID", kAppId},
        {"HKCR\\Quorlen731XX.Quorlen731XX.1", "", "Quorlen731XX Object"},
        {"HKCR\\Quorlen731XX.Quorlen731XX.1\\CLSID", "", kClsid},
        {"HKCR\\Quorlen731XX.Quorlen731XX", "", "Quorlen731XX Object"},
        {"HKCR\\Quorlen731XX.Quorlen731XX\\CLSID", "", kClsid},
        {"HKCR\\Quorlen731XX.Quorlen731XX\\CurVer", "", "Quorlen731XX.Quorlen731XX.1"},
        {kClassKey, "", "Quorlen731XX Object"},
        {kClassKey, "AppID", kAppId},
        {kClassKey + "\\ProgID", "", "Quorlen731XX.Quorlen731XX.1"},
        {kClassKey + "\\VersionIndependentProgID", "", "Quorlen731XX.Quorlen731XX"},
        {kClassKey + "\\Programmable", nullptr, ""},
        {kClassKey + "\\InprocServer32", "ThreadingModel", "Both"},
        {kClassKey + "\\TypeLib", "", kLibId},
        {kClassKey + "\\Implemented Categories\\" + kCat1, nullptr, ""},
        {kClassKey + "\\Implemented Categories\\" + kCat2, nullptr, ""},
        {"HKCR\\TypeLib\\" + kLibId + "\\1.0", "", "Quorlen731XX 1.0 Type Library"},
        {"HKCR\\TypeLib\\" + kLibId + "\\1.0\\FLAGS", "", "0"},
    };
    return entries;
}

// Keys of other software that share the roots with the driver.
const std::vector<Expected>& ForeignEntries() {
    static const std::vector<Expected> entries = {
        {"HKCR\\AppID\\{00000000-1111-2222-3333-444444444444}", "", "Other"},
        {"HKCR\\CLSID\\{00000000-1111-2222-3333-555555555555}\\InprocServer32", "", "/x.so"},
        {"HKCR\\TypeLib\\{00000000-1111-2222-3333-666666666666}\\1.0", "", "Other lib"},
        {"HKCR\\Quorlen731XX.Other", "", "Other"},
    };
    return entries;
}

class Registration : public qn::test::RegistryFileTest {
  protected:
    RegistryTree Load() {
        RegistryTree tree;
        auto status = qn::com::LoadRegistryFile(file_, &tree);
        EXPECT_TRUE(status.ok) << status.error;
        return tree;
    }
    void Write(const std::vector<Expected>& entries) {
        auto status = qn::com::UpdateRegistryFile(file_, [&](RegistryTree& t) {
            for (const Expected& e : entries)
                if (!t.SetValue(e.key, e.name ? e.name : "", e.value)) return false;
            return true;
        });
        ASSERT_TRUE(status.ok) << status.error;
    }
    std::string FileText() {
        std::ostringstream s;
        s << std::ifstream(file_).rdbuf();
        return s.str();
    }
};

void ExpectPresent(const RegistryTree& tree, const std::vector<Expected>& entries) {
    for (const Expected& e : entries) {
        if (e.name)
            EXPECT_EQ(tree.GetValue(e.key, e.name), e.value) << e.key << " " << e.name;
        else
            EXPECT_NE(tree.OpenKey(e.key), nullptr) << e.key;
    }
}

TEST_F(Registration, WritesEveryEntryAndRemovesThemAgain) {
    Write(ForeignEntries());
    ASSERT_EQ(RegisterModule(), S_OK);
    RegistryTree tree = Load();
    ExpectPresent(tree, ExpectedEntries());
    ExpectPresent(tree, ForeignEntries());
    // Both module-path values name the built library by its full path.
    for (const std::string& key :
         {kClassKey + "\\InprocServer32", "HKCR\\TypeLib\\" + kLibId + "\\1.0\\0\\linux64"}) {
        std::optional<std::string> path = tree.GetValue(key);
        ASSERT_TRUE(path) << key;
        EXPECT_TRUE(fs::path(*path).is_absolute()) << *path;
        EXPECT_TRUE(fs::equivalent(*path, QN_DRIVER_MODULE_PATH)) << *path;
    }
    // Nothing beyond the documented subkeys below the class.
    EXPECT_EQ(tree.EnumSubkeys(kClassKey),
              (std::vector<std::string>{"Implemented Categories", "InprocServer32", "ProgID",
                                        "Programmable", "TypeLib", "VersionIndependentProgID"}));

    ASSERT_EQ(UnregisterModule(), S_OK);
    tree = Load();
    for (const std::string& key : std::vector<std::string>{
             kClassKey, "HKCR\\AppID\\" + kAppId, "HKCR\\AppID\\Quorlen731XX.DLL",
             "HKCR\\Quorlen731XX.Quorlen731XX.1", "HKCR\\Quorlen731XX.Quorlen731XX",
             "HKCR\\TypeLib\\" + kLibId}) {
        EXPECT_EQ(tree.OpenKey(key), nullptr) << key;
    }
    EXPECT_NE(tree.OpenKey("HKCR\\AppID"), nullptr);
    ExpectPresent(tree, ForeignEntries());
}

TEST_F(Registration, IsIdempotentAndReplacesStaleEntries) {
    ASSERT_EQ(RegisterModule(), S_OK);
    const std::string once = FileText();
    ASSERT_EQ(RegisterModule(), S_OK);
    EXPECT_EQ(FileText(), once);

    // A registration of an older build left entries that no longer apply.
    Write({{kClassKey + "\\LocalServer32", "", "/old/server"},
           {"HKCR\\Quorlen731XX.Quorlen731XX\\CurVer", "", "Quorlen731XX.Quorlen731XX.0"},
           {kClassKey + "\\InprocServer32", "", "/old/libquorlen731xx.so"}});
    ASSERT_EQ(RegisterModule(), S_OK);
    EXPECT_EQ(FileText(), once);
}

TEST_F(Registration, UnregisteringWhatIsNotThereSucceeds) {
    EXPECT_EQ(UnregisterModule(), S_OK);
    EXPECT_FALSE(fs::exists(file_));
    Write(ForeignEntries());
    EXPECT_EQ(UnregisterModule(), S_OK);
    EXPECT_EQ(UnregisterModule(), S_OK);
    ExpectPresent(Load(), ForeignEntries());
}

TEST_F(Registration, AMalformedStoreFailsWithoutChangingIt) {
    std::ofstream(file_) << "[HKEY_CLASSES_ROOT\\AppID]\nnot a value line\n";
    const std::string before = FileText();
    qn::com::TakeThreadError(nullptr);
    for (HRESULT (*entry)() : {&RegisterModule, &UnregisterModule}) {
        EXPECT_EQ(entry(), SELFREG_E_CLASS);
        qn::com::ErrorRecord error;
        ASSERT_TRUE(qn::com::TakeThreadError(&error));
        EXPECT_NE(error.description.find(file_), std::string::npos) << error.description;
        EXPECT_EQ(FileText(), before);
    }
}

TEST(RegistrationScript, ExpandsPlaceholders) {
    const qn::server::Replacements r = {{"CLSID", "{C}"}, {"Module", "/a''b"}, {"EMPTY", ""}};
    struct Case {
        const char* text;
        std::optional<std::string> expected;
    };
    const Case cases[] = {
        {"", ""},
        {"plain", "plain"},
        {"CLSID\\%CLSID%\\x", "CLSID\\{C}\\x"},
        {"%clsid%%Clsid%", "{C}{C}"},
        {"100%%", "100%"},
        {"[%EMPTY%]", "[]"},
        {"%module%", "/a''b"},
        {"%NOPE%", std::nullopt},
        {"%CLSID", std::nullopt},
        {"50%", std::nullopt},
    };
    for (const Case& c : cases)
        EXPECT_EQ(qn::server::ExpandPlaceholders(c.text, r), c.expected) << c.text;
}

TEST(RegistrationScript, ModuleReplacements) {
    const qn::server::Replacements r = qn::server::ModuleReplacements("/opt/o'neil/libq.so");
    auto get = [&](const char* text) {
        return qn::server::ExpandPlaceholders(text, r).value_or("?");
    };
    EXPECT_EQ(get("%Module%"), "/opt/o''neil/libq.so");
    EXPECT_EQ(get("%Module_Raw%"), "/opt/o'neil/libq.so");
    EXPECT_EQ(get("%MODULETYPE%"), "InprocServer32");
    EXPECT_EQ(get("%MODULEGUID%"), kLibId);
    EXPECT_EQ(get("%APPID%"), kAppId);

    // The quoted form is for script text only: the registered path is the raw one.
    RegistryTree tree;
    std::string error;
    ASSERT_TRUE(qn::server::ApplyRegistration(tree, r, &error)) << error;
    EXPECT_EQ(tree.GetValue(kClassKey + "\\InprocServer32"), "/opt/o'neil/libq.so");
}

TEST(RegistrationScript, AReplacementCannotChangeTheShapeOfAKeyPath) {
    qn::server::Replacements r = qn::server::ModuleReplacements("/lib/q.so");
    for (auto& rep : r)
        if (rep.name == "PROGID") rep.value = "Other\\CLSID";
    RegistryTree tree;
    ASSERT_TRUE(tree.SetValue("HKCR\\Other\\CLSID", "", "{keep}"));
    std::string error;
    EXPECT_FALSE(qn::server::ApplyRegistration(tree, r, &error));
    EXPECT_FALSE(error.empty());
    qn::server::RemoveRegistration(tree, r);
    EXPECT_EQ(tree.GetValue("HKCR\\Other\\CLSID"), "{keep}");
}

}  // namespace
