// IUnknown, the interface-id trait, the smart pointer ComPtr and the one
// template (ComObject) that implements IUnknown for every class: atomic
// reference count, table-driven QueryInterface and optional aggregation.
#pragma once

#include <atomic>
#include <new>
#include <string>
#include <utility>

#include "platform/com/types.h"

// Declares the interface id of an interface type: place inside the struct.
#define QN_INTERFACE_ID(text) static constexpr GUID kIid = MakeGuid(text)
// The same, with the id taken from a named constant (e.g. IID_IIviDriver).
#define QN_INTERFACE_IID(constant) static constexpr GUID kIid = constant

// The IID of interface I, from its declaration.
template <class I>
inline constexpr GUID iid_of = I::kIid;

struct IUnknown {
    QN_INTERFACE_ID("00000000-0000-0000-c000-000000000046");
    virtual HRESULT QueryInterface(REFIID riid, void** ppv) = 0;
    virtual ULONG AddRef() = 0;
    virtual ULONG Release() = 0;

protected:
    virtual ~IUnknown() = default;
};

struct IClassFactory : IUnknown {
    QN_INTERFACE_ID("00000001-0000-0000-c000-000000000046");
    virtual HRESULT CreateInstance(IUnknown* outer, REFIID riid, void** ppv) = 0;
    virtual HRESULT LockServer(bool lock) = 0;

protected:
    ~IClassFactory() override = default;
};

// Owning interface pointer: one reference, released on destruction.
template <class T>
class ComPtr {
public:
    ComPtr() = default;
    ComPtr(std::nullptr_t) {}
    explicit ComPtr(T* p, bool add_ref = true) : p_(p) {
        if (p_ && add_ref) p_->AddRef();
    }
    ComPtr(const ComPtr& o) : p_(o.p_) {
        if (p_) p_->AddRef();
    }
    ComPtr(ComPtr&& o) noexcept : p_(std::exchange(o.p_, nullptr)) {}
    ~ComPtr() { reset(); }
    ComPtr& operator=(ComPtr o) noexcept {
        std::swap(p_, o.p_);
        return *this;
    }
    void reset() {
        if (T* p = std::exchange(p_, nullptr)) p->Release();
    }
    // Takes over a reference the caller already owns.
    void Attach(T* p) {
        reset();
        p_ = p;
    }
    [[nodiscard]] T* Detach() { return std::exchange(p_, nullptr); }
    // Address for an out-parameter; releases the current pointer first.
    T** Out() {
        reset();
        return &p_;
    }
    void** OutVoid() { return reinterpret_cast<void**>(Out()); }
    T* get() const { return p_; }
    T* operator->() const { return p_; }
    explicit operator bool() const { return p_ != nullptr; }

    // QueryInterface for another interface into a new ComPtr.
    template <class U>
    HRESULT As(ComPtr<U>& out) const {
        if (!p_) return E_POINTER;
        return p_->QueryInterface(iid_of<U>, out.OutVoid());
    }
    // Copies out with an added reference (the COM out-parameter convention).
    HRESULT CopyTo(T** pp) const {
        if (!pp) return E_POINTER;
        *pp = p_;
        if (p_) p_->AddRef();
        return S_OK;
    }

private:
    T* p_ = nullptr;
};

namespace qn::com {

// Process-wide count of live objects and server locks (DllCanUnloadNow).
std::atomic<long>& ModuleLockCount();

// An entry of a QueryInterface table: serve the IID of Itf through the
// base Via of the implementing class (Via derives from Itf). Listing a plain
// interface type I is shorthand for As<I, I>.
template <class Itf, class Via = Itf>
struct As {};

namespace detail {
// A plain interface entry, or a class that implements one interface and
// names it as TiedInterface (served through that class).
template <class E>
struct EntryOf {
    using Itf = E;
    using Via = E;
};
template <class E>
    requires requires { typename E::TiedInterface; }
struct EntryOf<E> {
    using Itf = typename E::TiedInterface;
    using Via = E;
};
template <class I, class V>
struct EntryOf<As<I, V>> {
    using Itf = I;
    using Via = V;
};
// What the object inherits for an entry: the interface itself, or nothing
// (an empty tag) for an As<> entry served through another base.
template <class E>
struct BaseOf {
    using type = E;
};
template <class I, class V>
struct BaseOf<As<I, V>> {
    // An empty base, with a name no derived class will use.
    struct QnAsEntryTag {};
    using type = QnAsEntryTag;
};
}  // namespace detail

// ComObject<Derived, Entries...>: Derived inherits from this, and this
// inherits from every plain interface of Entries. QueryInterface walks the
// entries in order; IID_IUnknown is served by the first entry. The object
// starts with no reference; MakeComObject hands out the first.
//
// Aggregation: when created with an outer unknown, the object's IUnknown
// methods delegate to the outer object, and the outer object holds the
// inner one through InnerUnknown(), the non-delegating unknown.
template <class Derived, class First, class... Rest>
class ComObject : public detail::BaseOf<First>::type, public detail::BaseOf<Rest>::type... {
public:
    HRESULT QueryInterface(REFIID riid, void** ppv) override {
        if (outer_) return outer_->QueryInterface(riid, ppv);
        return InnerQueryInterface(riid, ppv);
    }
    ULONG AddRef() override { return outer_ ? outer_->AddRef() : InnerAddRef(); }
    ULONG Release() override { return outer_ ? outer_->Release() : InnerRelease(); }

    // The non-delegating IUnknown of an aggregated object.
    IUnknown* InnerUnknown() { return &inner_; }
    void SetOuterUnknown(IUnknown* outer) { outer_ = outer; }
    ULONG RefCount() const { return refs_.load(); }

protected:
    ComObject() { ++ModuleLockCount(); }
    virtual ~ComObject() { --ModuleLockCount(); }

    HRESULT InnerQueryInterface(REFIID riid, void** ppv) {
        if (!ppv) return E_POINTER;
        *ppv = nullptr;
        void* found = nullptr;
        if (riid == iid_of<IUnknown>) {
            found = static_cast<IUnknown*>(static_cast<typename detail::EntryOf<First>::Via*>(
                static_cast<Derived*>(this)));
        } else {
            (TryEntry<First>(riid, found) || ... || TryEntry<Rest>(riid, found));
        }
        if (!found) return E_NOINTERFACE;
        *ppv = found;
        AddRef();
        return S_OK;
    }
    ULONG InnerAddRef() { return ++refs_; }
    ULONG InnerRelease() {
        ULONG n = --refs_;
        if (n == 0) delete static_cast<Derived*>(this);
        return n;
    }

private:
    template <class E>
    bool TryEntry(REFIID riid, void*& found) {
        using Itf = typename detail::EntryOf<E>::Itf;
        using Via = typename detail::EntryOf<E>::Via;
        if (riid != iid_of<Itf>) return false;
        found = static_cast<Itf*>(static_cast<Via*>(static_cast<Derived*>(this)));
        return true;
    }

    // The non-delegating unknown handed to an aggregating outer object.
    struct Inner final : IUnknown {
        explicit Inner(ComObject* o) : owner(o) {}
        HRESULT QueryInterface(REFIID riid, void** ppv) override {
            if (!ppv) return E_POINTER;
            if (riid == iid_of<IUnknown>) {
                *ppv = static_cast<IUnknown*>(this);
                AddRef();
                return S_OK;
            }
            return owner->InnerQueryInterface(riid, ppv);
        }
        ULONG AddRef() override { return owner->InnerAddRef(); }
        ULONG Release() override { return owner->InnerRelease(); }
        ComObject* owner;
    };

    std::atomic<ULONG> refs_{0};
    IUnknown* outer_ = nullptr;
    Inner inner_{this};
};

// Creates a ComObject-derived object and returns it holding one reference.
template <class T, class... Args>
ComPtr<T> MakeComObject(Args&&... args) {
    T* p = new T(std::forward<Args>(args)...);
    return ComPtr<T>(p);
}

}  // namespace qn::com
