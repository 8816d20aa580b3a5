// ComObject: table-driven QueryInterface, identity, reference counting and aggregation.
#include "platform/com/unknown.h"

#include <gtest/gtest.h>

#include <tuple>

namespace {

using qn::com::As;
using qn::com::ComObject;
using qn::com::MakeComObject;

struct IAlpha : IUnknown {
    QN_INTERFACE_ID("a1a1a1a1-0000-0000-0000-000000000001");
    virtual int Alpha() = 0;
};
struct IBeta : IUnknown {
    QN_INTERFACE_ID("b2b2b2b2-0000-0000-0000-000000000002");
    virtual int Beta() = 0;
};
// Served through IBeta's vtable (an interface that extends another one).
struct IBetaEx : IBeta {
    QN_INTERFACE_ID("b2b2b2b2-0000-0000-0000-000000000003");
    virtual int BetaEx() = 0;
};
struct IUnlisted : IUnknown {
    QN_INTERFACE_ID("cccccccc-0000-0000-0000-000000000004");
};

class Widget : public ComObject<Widget, IAlpha, IBetaEx, As<IBeta, IBetaEx>> {
  public:
    explicit Widget(bool* destroyed = nullptr) : destroyed_(destroyed) {}
    ~Widget() override {
        if (destroyed_) *destroyed_ = true;
    }
    int Alpha() override { return 1; }
    int Beta() override { return 2; }
    int BetaEx() override { return 3; }

  private:
    bool* destroyed_;
};

TEST(ComObject, QueryInterfaceServesListedInterfacesWithOneIdentity) {
    ComPtr<Widget> w = MakeComObject<Widget>();
    ComPtr<IAlpha> a;
    ComPtr<IBeta> b;
    ComPtr<IBetaEx> bx;
    ASSERT_EQ(w.As(a) | w.As(b) | w.As(bx), S_OK);
    EXPECT_EQ(std::make_tuple(a->Alpha(), b->Beta(), bx->BetaEx(), w->RefCount()),
              std::make_tuple(1, 2, 3, ULONG{4}));
    // IUnknown from any interface is the same pointer.
    ComPtr<IUnknown> u1, u2, u3;
    ASSERT_EQ(a.As(u1) | b.As(u2) | bx.As(u3), S_OK);
    EXPECT_EQ(u1.get(), u2.get());
    EXPECT_EQ(u1.get(), u3.get());
    EXPECT_EQ(static_cast<void*>(b.get()), static_cast<void*>(bx.get()));
    // A miss clears the out pointer and takes no reference; a null out is refused.
    void* p = reinterpret_cast<void*>(0x1234);
    EXPECT_EQ(w->QueryInterface(iid_of<IUnlisted>, &p), E_NOINTERFACE);
    EXPECT_EQ(p, nullptr);
    EXPECT_EQ(w->QueryInterface(iid_of<IAlpha>, nullptr), E_POINTER);
    EXPECT_EQ(w->RefCount(), 7u);
    ComPtr<IAlpha> empty;
    EXPECT_EQ(empty.As(b), E_POINTER);
}

TEST(ComObject, LastReleaseDestroysAndModuleCountFollowsObjects) {
    long before = qn::com::ModuleLockCount().load();
    bool destroyed = false;
    {
        ComPtr<Widget> w = MakeComObject<Widget>(&destroyed);
        EXPECT_EQ(qn::com::ModuleLockCount().load(), before + 1);
        ComPtr<Widget> second = w;
        w.reset();
        EXPECT_FALSE(destroyed);
        // CopyTo adds a reference, Attach adopts one, Detach hands it back.
        IAlpha* raw = nullptr;
        w = second;
        ComPtr<IAlpha> a;
        ASSERT_EQ(w.As(a), S_OK);
        ASSERT_EQ(a.CopyTo(&raw), S_OK);
        ComPtr<IAlpha> adopted;
        adopted.Attach(raw);
        EXPECT_EQ(w->RefCount(), 4u);
        EXPECT_EQ(adopted.Detach(), raw);
        raw->Release();
        EXPECT_EQ(w->RefCount(), 3u);
        EXPECT_EQ(a.CopyTo(nullptr), E_POINTER);
    }
    EXPECT_TRUE(destroyed);
    EXPECT_EQ(qn::com::ModuleLockCount().load(), before);
}

// An outer object that aggregates a Widget and adds IUnlisted of its own.
class Outer : public ComObject<Outer, IUnlisted> {
  public:
    explicit Outer(bool* inner_destroyed) {
        inner_ = new Widget(inner_destroyed);
        inner_->SetOuterUnknown(this);
        inner_unknown_ = inner_->InnerUnknown();
        inner_unknown_->AddRef();
    }
    ~Outer() override { inner_unknown_->Release(); }
    HRESULT QueryInterface(REFIID riid, void** ppv) override {
        HRESULT hr = InnerQueryInterface(riid, ppv);
        if (hr == E_NOINTERFACE) hr = inner_unknown_->QueryInterface(riid, ppv);
        return hr;
    }
    IUnknown* inner_unknown() const { return inner_unknown_; }
    Widget* inner() const { return inner_; }

  private:
    Widget* inner_;
    IUnknown* inner_unknown_;
};

TEST(ComObject, AggregatedObjectDelegatesToItsOuterUnknown) {
    bool inner_destroyed = false;
    {
        ComPtr<Outer> outer = MakeComObject<Outer>(&inner_destroyed);
        ComPtr<IAlpha> alpha;
        ASSERT_EQ(outer.As(alpha), S_OK);  // found on the inner object
        EXPECT_EQ(alpha->Alpha(), 1);
        EXPECT_EQ(outer->RefCount(), 2u);  // the inner interface counts on the outer
        EXPECT_EQ(outer->inner()->RefCount(), 1u);
        // IUnknown through the inner object's interface is the outer identity, and the
        // outer object's own interfaces are reachable from the inner one.
        ComPtr<IUnknown> id_from_inner, id_from_outer;
        ASSERT_EQ(alpha.As(id_from_inner) | outer.As(id_from_outer), S_OK);
        EXPECT_EQ(id_from_inner.get(), id_from_outer.get());
        ComPtr<IUnlisted> unlisted;
        EXPECT_EQ(alpha.As(unlisted), S_OK);
        // The non-delegating unknown answers IUnknown with itself.
        void* p = nullptr;
        ASSERT_EQ(outer->inner_unknown()->QueryInterface(iid_of<IUnknown>, &p), S_OK);
        EXPECT_EQ(p, outer->inner_unknown());
        static_cast<IUnknown*>(p)->Release();
        EXPECT_EQ(outer->inner_unknown()->QueryInterface(iid_of<IAlpha>, nullptr), E_POINTER);
        EXPECT_FALSE(inner_destroyed);
    }
    EXPECT_TRUE(inner_destroyed);
}

}  // namespace
