// What a C session handle's data pointer holds: one counted reference to the
// driver object, and the interfaces and channel items the C functions have
// asked it for, kept so that a call does not ask again.
#pragma once

#include <atomic>
#include <mutex>
#include <string>
#include <string_view>

#include "platform/com/unknown.h"

namespace qn::capi {

class SessionData {
public:
    // `items_cacheable`: the driver object is reachable only through this
    // session, so its channel items stay those of the one Initialize that
    // created them. An object a client holds (attached, or handed out) may be
    // re-initialized through COM and is never cached for items.
    SessionData(IUnknown* driver, bool items_cacheable) : driver_(driver), items_cacheable_(items_cacheable) {}

    SessionData(const SessionData&) = delete;
    SessionData& operator=(const SessionData&) = delete;

    void AddRef() { refs_.fetch_add(1, std::memory_order_relaxed); }
    void Release() {
        if (refs_.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
    }

    IUnknown* Driver() const { return driver_.get(); }

    // The driver's interface `iid` (borrowed: valid while the session data
    // lives), asked for once. `slot` (below kInterfaceSlots) names the
    // interface within the session, so a cached one is found without a lock.
    HRESULT Interface(const IID& iid, std::size_t slot, IUnknown** out);
    static constexpr std::size_t kInterfaceSlots = 64;

    // A channel item cached under (collection, name), or null.
    IUnknown* FindItem(const IID& collection, std::string_view name);
    void StoreItem(const IID& collection, std::string_view name, IUnknown* item);
    // A client got hold of the driver object: stop caching items.
    void Expose();

    // Records taken from the driver's queues (coercion records, interchange
    // warnings) and instrument replies read by Qn731XX_SystemRead that did
    // not fit the caller's buffer: the next call delivers them instead of
    // taking the next one, so asking for the size first loses nothing.
    enum class Queue { kCoercion, kInterchange, kSystemRead };
    static constexpr std::size_t kQueues = 3;
    bool TakePending(Queue q, std::string* text);
    void KeepPending(Queue q, std::string text);

private:
    ~SessionData() {
        for (std::atomic<IUnknown*>& itf : interfaces_)
            if (IUnknown* p = itf.load()) p->Release();
    }

    struct CachedItem {
        const IID* collection = nullptr;
        std::string name;
        ComPtr<IUnknown> item;
    };

    std::atomic<long> refs_{1};
    ComPtr<IUnknown> driver_;
    std::mutex m_;
    std::atomic<IUnknown*> interfaces_[kInterfaceSlots] = {};  // each holds a reference
    static constexpr std::size_t kMaxItems = 256;
    CachedItem items_[kMaxItems];
    std::atomic<std::size_t> item_count_{0};
    std::atomic<bool> items_cacheable_;
    std::string pending_[kQueues];
    bool has_pending_[kQueues] = {};
};

// A session's data for the length of a call: read from a handle (the call
// counts as a reader of the handle's data pointer, which a close waits for),
// or owned (one counted reference).
class SessionRef {
public:
    SessionRef() = default;
    SessionRef(const SessionRef&) = delete;
    SessionRef& operator=(const SessionRef&) = delete;
    ~SessionRef() { reset(nullptr); }
    SessionData* operator->() const { return d_; }
    SessionData* get() const { return d_; }
    // Takes over one reference of `d`.
    void reset(SessionData* d) {
        End();
        d_ = d;
    }
    // `d` as read from a handle by ivi::BeginDataRead, with its reader token.
    void Read(SessionData* d, void* reader) {
        End();
        d_ = d;
        reader_ = reader;
    }

private:
    void End();
    SessionData* d_ = nullptr;
    void* reader_ = nullptr;  // set: d_ is read, not owned
};

}  // namespace qn::capi
