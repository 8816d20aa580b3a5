// A minimal in-process server for the activation tests: one class whose
// ITestValue::Value answers 42, and the DllGetClassObject/DllCanUnloadNow exports.
#include "tests/platform/com/test_module.h"

#include <atomic>

namespace {

std::atomic<long> g_objects{0};

class TestObject final : public qn::com::ComObject<TestObject, ITestValue> {
  public:
    TestObject() { ++g_objects; }
    ~TestObject() override { --g_objects; }
    int Value() override { return 42; }
};

class Factory final : public qn::com::ComObject<Factory, IClassFactory> {
  public:
    HRESULT CreateInstance(IUnknown* outer, REFIID riid, void** ppv) override {
        if (!ppv) return E_POINTER;
        *ppv = nullptr;
        if (outer) return CLASS_E_NOAGGREGATION;
        auto obj = qn::com::MakeComObject<TestObject>();
        return obj->QueryInterface(riid, ppv);
    }
    HRESULT LockServer(bool) override { return S_OK; }
};

}  // namespace

extern "C" __attribute__((visibility("default"))) HRESULT DllGetClassObject(REFCLSID clsid,
                                                                            REFIID riid,
                                                                            void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    if (!(clsid == kTestModuleClsid)) return CLASS_E_CLASSNOTAVAILABLE;
    auto factory = qn::com::MakeComObject<Factory>();
    return factory->QueryInterface(riid, ppv);
}

extern "C" __attribute__((visibility("default"))) HRESULT DllCanUnloadNow() {
    return g_objects.load() == 0 ? S_OK : S_FALSE;
}
