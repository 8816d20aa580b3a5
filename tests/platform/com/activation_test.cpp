// CoCreateInstance through a temporary registry file and a module loaded with
// dlopen, ProgID lookup, GUID text and the in-process class table.
#include "platform/com/activation.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "platform/com/bstr.h"
#include "platform/com/errorinfo.h"
#include "platform/com/registry.h"
#include "tests/platform/com/test_module.h"

namespace {

using qn::com::RegistryTree;

TEST(GuidText, FormatsAndParsesBothWays) {
    constexpr GUID g = MakeGuid("0123abcd-4567-89ef-0a1b-2c3d4e5f6789");
    EXPECT_EQ(qn::com::GuidToString(g), "{0123ABCD-4567-89EF-0A1B-2C3D4E5F6789}");
    EXPECT_EQ(qn::com::GuidFromString("{0123abcd-4567-89EF-0a1b-2c3d4e5f6789}"), g);
    for (const char* bad :
         {"", "{}", "0123abcd-4567-89ef-0a1b-2c3d4e5f6789", "{0123abcd-4567-89ef-0a1b-2c3d4e5f678}",
          "{0123abcd-4567-89ef-0a1b+2c3d4e5f6789}", "{0123abcd-4567-89ef-0a1b-2c3d4e5f678g}",
          "{0123abcd-4567-89ef-0a1b-2c3d4e5f6789"}) {
        EXPECT_EQ(qn::com::GuidFromString(bad), std::nullopt) << bad;
    }
    OLECHAR buf[39];
    EXPECT_EQ(StringFromGUID2(g, buf, 39), 39);
    EXPECT_EQ(std::u16string(buf), u"{0123ABCD-4567-89EF-0A1B-2C3D4E5F6789}");
    EXPECT_EQ(StringFromGUID2(g, buf, 38), 0);
    CLSID back{};
    EXPECT_EQ(CLSIDFromString(buf, &back), S_OK);
    EXPECT_EQ(back, g);
    EXPECT_EQ(CLSIDFromString(u"{0123ABCD-4567-89EF-0A1B-2C3D4E5F67}", &back), CO_E_CLASSSTRING);
    EXPECT_EQ(CLSIDFromString(nullptr, &back), S_OK);
    EXPECT_EQ(back, GUID_NULL);
}

// Each test gets its own registry file through QN_REGISTRY_FILE.
class Activation : public ::testing::Test {
  protected:
    void SetUp() override {
        char dir[] = "/tmp/qn-activation-XXXXXX";
        ASSERT_NE(mkdtemp(dir), nullptr);
        dir_ = dir;
        setenv("QN_REGISTRY_FILE", (dir_ + "/registry").c_str(), 1);
    }
    void TearDown() override {
        unsetenv("QN_REGISTRY_FILE");
        std::system(("rm -rf '" + dir_ + "'").c_str());
    }
    void Register(const std::string& module) {
        const std::string clsid = qn::com::GuidToString(kTestModuleClsid);
        auto status =
            qn::com::UpdateRegistryFile(qn::com::RegistryFilePath(), [&](RegistryTree& t) {
                return t.SetValue("HKCR\\CLSID\\" + clsid + "\\InprocServer32", "", module) &&
                       t.SetValue("HKCR\\Test.Value.1\\CLSID", "", clsid) &&
                       t.SetValue("HKCR\\Test.Value\\CurVer", "", "Test.Value.1") &&
                       t.SetValue("HKCR\\Test.Loop\\CurVer", "", "Test.Loop2") &&
                       t.SetValue("HKCR\\Test.Loop2\\CurVer", "", "Test.Loop");
            });
        ASSERT_TRUE(status.ok) << status.error;
    }
    std::string dir_;
};

TEST_F(Activation, CreatesTheRegisteredClassFromItsModule) {
    Register(QN_TEST_MODULE_PATH);
    ComPtr<ITestValue> value;
    ASSERT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<ITestValue>,
                               value.OutVoid()),
              S_OK);
    EXPECT_EQ(value->Value(), 42);
    CoFreeUnusedLibraries();  // an object is alive: the module must stay loaded
    EXPECT_EQ(value->Value(), 42);
    value.reset();
    CoFreeUnusedLibraries();
    ASSERT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_INPROC_SERVER, iid_of<IUnknown>,
                               reinterpret_cast<void**>(value.Out())),
              S_OK);  // reloaded after the unload
}

TEST_F(Activation, ProgIdsResolveThroughCurVer) {
    Register(QN_TEST_MODULE_PATH);
    CLSID clsid{};
    for (const char16_t* id : {u"Test.Value.1", u"test.value"}) {
        clsid = GUID_NULL;
        EXPECT_EQ(CLSIDFromProgID(id, &clsid), S_OK);
        EXPECT_EQ(clsid, kTestModuleClsid);
    }
    clsid = GUID_NULL;
    EXPECT_EQ(CLSIDFromString(u"Test.Value", &clsid), S_OK);
    EXPECT_EQ(clsid, kTestModuleClsid);
    EXPECT_EQ(CLSIDFromProgID(u"Test.Loop", &clsid), CO_E_CLASSSTRING);
    EXPECT_EQ(CLSIDFromProgID(u"No.Such.Class", &clsid), CO_E_CLASSSTRING);
    EXPECT_EQ(clsid, GUID_NULL);
}

TEST_F(Activation, FailuresAreReportedWithTheirReason) {
    void* p = reinterpret_cast<void*>(1);
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<IUnknown>, &p),
              REGDB_E_CLASSNOTREG);
    EXPECT_EQ(p, nullptr);
    qn::com::TakeThreadError(nullptr);

    Register(dir_ + "/missing.so");
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<IUnknown>, &p),
              CO_E_DLLNOTFOUND);
    qn::com::ErrorRecord rec;
    ASSERT_TRUE(qn::com::TakeThreadError(&rec));
    EXPECT_NE(rec.description.find("missing.so"), std::string::npos) << rec.description;

    Register(QN_TEST_MODULE_PATH);
    EXPECT_EQ(
        CoCreateInstance(kTestModuleClsid, nullptr, 0x4 /* local server */, iid_of<IUnknown>, &p),
        REGDB_E_CLASSNOTREG);
    IUnknown* outer = reinterpret_cast<IUnknown*>(&p);  // never called: refused before use
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, outer, CLSCTX_ALL, iid_of<ITestValue>, &p),
              CLASS_E_NOAGGREGATION);
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<IUnknown>, nullptr),
              E_POINTER);
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<IClassFactory>, &p),
              E_NOINTERFACE);
    EXPECT_EQ(p, nullptr);
}

TEST_F(Activation, MalformedRegistryFileIsNotACrash) {
    std::FILE* f = std::fopen(qn::com::RegistryFilePath().c_str(), "w");
    ASSERT_NE(f, nullptr);
    std::fputs("[HKCR\\CLSID]\n@=\"unterminated\n", f);
    std::fclose(f);
    void* p = nullptr;
    EXPECT_EQ(CoCreateInstance(kTestModuleClsid, nullptr, CLSCTX_ALL, iid_of<IUnknown>, &p),
              REGDB_E_CLASSNOTREG);
    qn::com::ErrorRecord rec;
    ASSERT_TRUE(qn::com::TakeThreadError(&rec));
    EXPECT_NE(rec.description.find("line 2"), std::string::npos) << rec.description;
    CLSID clsid{};
    EXPECT_EQ(CLSIDFromProgID(u"Test.Value", &clsid), CO_E_CLASSSTRING);
}

// A built-in class: no registry entry, no module.
class BuiltIn final : public qn::com::ComObject<BuiltIn, ITestValue> {
  public:
    int Value() override { return 7; }
};
class BuiltInFactory final : public qn::com::ComObject<BuiltInFactory, IClassFactory> {
  public:
    HRESULT CreateInstance(IUnknown*, REFIID riid, void** ppv) override {
        return qn::com::MakeComObject<BuiltIn>()->QueryInterface(riid, ppv);
    }
    HRESULT LockServer(bool) override { return S_OK; }
};

TEST_F(Activation, InProcessClassTableNeedsNoRegistry) {
    constexpr CLSID kBuiltIn = MakeGuid("5e1f0c2a-7b3d-4e59-9a61-0d2c4b8e7f99");
    auto factory = qn::com::MakeComObject<BuiltInFactory>();
    ASSERT_EQ(qn::com::RegisterClassFactory(kBuiltIn, factory.get()), S_OK);
    EXPECT_EQ(factory->RefCount(), 2u);
    ComPtr<ITestValue> value;
    ASSERT_EQ(CoCreateInstance(kBuiltIn, nullptr, CLSCTX_ALL, iid_of<ITestValue>, value.OutVoid()),
              S_OK);
    EXPECT_EQ(value->Value(), 7);
    EXPECT_EQ(qn::com::RevokeClassFactory(kBuiltIn), S_OK);
    EXPECT_EQ(factory->RefCount(), 1u);
    EXPECT_EQ(qn::com::RevokeClassFactory(kBuiltIn), S_FALSE);
    void* p = nullptr;
    EXPECT_EQ(CoCreateInstance(kBuiltIn, nullptr, CLSCTX_ALL, iid_of<ITestValue>, &p),
              REGDB_E_CLASSNOTREG);
    EXPECT_EQ(qn::com::RegisterClassFactory(kBuiltIn, nullptr), E_INVALIDARG);
}

TEST(CoInitialize, CountsPerThread) {
    EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK);
    EXPECT_EQ(CoInitialize(nullptr), S_FALSE);
    CoUninitialize();
    CoUninitialize();
    CoUninitialize();  // one too many is harmless
    EXPECT_EQ(CoInitialize(nullptr), S_OK);
    CoUninitialize();
}

}  // namespace
