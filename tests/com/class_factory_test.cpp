// Class object, class factory, aggregation and the unload rule of the driver
// module, through its exported entry points.
#include "com/class_factory.h"

#include <gtest/gtest.h>

#include <atomic>

#include "IviDriver.h"
#include "com/exports.h"

namespace {

ComPtr<IClassFactory> Factory() {
    ComPtr<IClassFactory> f;
    EXPECT_EQ(DllGetClassObject(CLSID_Quorlen731XX, iid_of<IClassFactory>, f.OutVoid()), S_OK);
    return f;
}

// A pending error record of the thread is a live object of the COM layer too.
void ClearThreadError() { qn::com::TakeThreadError(nullptr); }

TEST(ClassObject, ServesOnlyTheDriverClass) {
    struct Case {
        GUID clsid;
        IID iid;
        HRESULT expected;
    };
    const Case cases[] = {
        {CLSID_Quorlen731XX, iid_of<IClassFactory>, S_OK},
        {CLSID_Quorlen731XX, iid_of<IUnknown>, S_OK},
        {CLSID_Quorlen731XX, iid_of<IIviDriver>, E_NOINTERFACE},
        {APPID_Quorlen731XX, iid_of<IClassFactory>, CLASS_E_CLASSNOTAVAILABLE},
        {GUID_NULL, iid_of<IClassFactory>, CLASS_E_CLASSNOTAVAILABLE},
    };
    for (const Case& c : cases) {
        void* p = &p;  // must be overwritten on every path
        EXPECT_EQ(DllGetClassObject(c.clsid, c.iid, &p), c.expected);
        if (SUCCEEDED(c.expected)) {
            ASSERT_NE(p, nullptr);
            static_cast<IUnknown*>(p)->Release();
        } else {
            EXPECT_EQ(p, nullptr);
        }
    }
    EXPECT_EQ(DllGetClassObject(CLSID_Quorlen731XX, iid_of<IClassFactory>, nullptr), E_POINTER);
}

TEST(ClassFactory, CreatesTheDriverForItsInterfacesOnly) {
    ComPtr<IClassFactory> f = Factory();
    ASSERT_TRUE(f);
    ComPtr<IIviDriver> driver;
    ASSERT_EQ(f->CreateInstance(nullptr, iid_of<IIviDriver>, driver.OutVoid()), S_OK);
    VARIANT_BOOL initialized = VARIANT_TRUE;
    EXPECT_EQ(driver->get_Initialized(&initialized), S_OK);
    EXPECT_EQ(initialized, VARIANT_FALSE);

    void* p = &p;
    EXPECT_EQ(f->CreateInstance(nullptr, iid_of<IClassFactory>, &p), E_NOINTERFACE);
    EXPECT_EQ(p, nullptr);
    EXPECT_EQ(f->CreateInstance(nullptr, iid_of<IIviDriver>, nullptr), E_POINTER);
}

// An object that aggregates the driver: it answers IUnknown and its own
// interface and hands every other request to the driver's inner unknown.
struct IOuterOnly : IUnknown {
    QN_INTERFACE_ID("0f1e2d3c-4b5a-4968-8776-a5b4c3d2e1f0");
    virtual int Tag() = 0;
};

class Outer final : public IOuterOnly {
  public:
    HRESULT QueryInterface(REFIID riid, void** ppv) override {
        ++queries;
        if (!ppv) return E_POINTER;
        if (riid == iid_of<IUnknown> || riid == iid_of<IOuterOnly>) {
            *ppv = static_cast<IOuterOnly*>(this);
            AddRef();
            return S_OK;
        }
        *ppv = nullptr;
        return inner ? inner->QueryInterface(riid, ppv) : E_NOINTERFACE;
    }
    ULONG AddRef() override { return ++refs; }
    ULONG Release() override { return --refs; }  // lives on the test's stack
    int Tag() override { return 7; }

    IUnknown* inner = nullptr;  // the one reference on the aggregated driver
    std::atomic<ULONG> refs{1};
    int queries = 0;
};

TEST(ClassFactory, AggregatesOnlyThroughTheInnerUnknown) {
    ClearThreadError();
    Outer outer;
    ComPtr<IClassFactory> f = Factory();
    void* p = &p;
    EXPECT_EQ(f->CreateInstance(&outer, iid_of<IIviDriver>, &p), CLASS_E_NOAGGREGATION);
    EXPECT_EQ(p, nullptr);
    ASSERT_EQ(f->CreateInstance(&outer, iid_of<IUnknown>, reinterpret_cast<void**>(&outer.inner)),
              S_OK);
    ASSERT_NE(outer.inner, nullptr);
    EXPECT_NE(outer.inner, static_cast<IUnknown*>(&outer));
    EXPECT_EQ(outer.refs, 1u);

    // The inner unknown reaches the driver's interfaces without asking the outer.
    IIviDriver* driver = nullptr;
    ASSERT_EQ(outer.inner->QueryInterface(iid_of<IIviDriver>, reinterpret_cast<void**>(&driver)),
              S_OK);
    EXPECT_EQ(outer.queries, 0);
    EXPECT_EQ(outer.refs, 2u);  // the interface's reference is the outer object's

    // The driver's interfaces delegate their IUnknown to the outer object.
    IOuterOnly* back = nullptr;
    ASSERT_EQ(driver->QueryInterface(iid_of<IOuterOnly>, reinterpret_cast<void**>(&back)), S_OK);
    EXPECT_EQ(back, &outer);
    EXPECT_EQ(back->Tag(), 7);
    back->Release();
    ComPtr<IIviDriverIdentity> identity;
    EXPECT_EQ(driver->QueryInterface(iid_of<IIviDriverIdentity>, identity.OutVoid()), S_OK);
    EXPECT_EQ(outer.queries, 2);
    identity.reset();
    VARIANT_BOOL initialized = VARIANT_TRUE;
    EXPECT_EQ(driver->get_Initialized(&initialized), S_OK);
    EXPECT_EQ(initialized, VARIANT_FALSE);
    driver->Release();
    EXPECT_EQ(outer.refs, 1u);

    f.reset();
    EXPECT_EQ(DllCanUnloadNow(), S_FALSE);  // the aggregated driver is alive
    EXPECT_EQ(outer.inner->Release(), 0u);
    outer.inner = nullptr;
    ClearThreadError();
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
}

TEST(Module, UnloadsOnlyWithoutObjectsAndServerLocks) {
    ClearThreadError();
    ASSERT_EQ(DllCanUnloadNow(), S_OK);
    ComPtr<IClassFactory> f = Factory();
    EXPECT_EQ(DllCanUnloadNow(), S_FALSE);  // a held factory keeps the module
    EXPECT_EQ(f->LockServer(true), S_OK);
    EXPECT_EQ(f->LockServer(true), S_OK);
    f.reset();
    EXPECT_EQ(DllCanUnloadNow(), S_FALSE);  // server locks outlive the factory
    EXPECT_EQ(qn::server::ServerLockCount(), 2);

    f = Factory();
    EXPECT_EQ(f->LockServer(false), S_OK);
    EXPECT_EQ(f->LockServer(false), S_OK);
    EXPECT_EQ(f->LockServer(false), E_UNEXPECTED);  // unbalanced: the count stays 0
    EXPECT_EQ(qn::server::ServerLockCount(), 0);
    ComPtr<IIviDriver> driver;
    ASSERT_EQ(f->CreateInstance(nullptr, iid_of<IIviDriver>, driver.OutVoid()), S_OK);
    f.reset();
    EXPECT_EQ(DllCanUnloadNow(), S_FALSE);
    driver.reset();
    ClearThreadError();
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
}

}  // namespace
