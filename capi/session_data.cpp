#include "capi/session_data.h"

#include "platform/ivi/ivisession.h"

namespace qn::capi {

HRESULT SessionData::Interface(const IID& iid, std::size_t slot, IUnknown** out) {
    if (slot >= kInterfaceSlots) return E_UNEXPECTED;
    if (IUnknown* cached = interfaces_[slot].load(std::memory_order_acquire)) {
        *out = cached;
        return S_OK;
    }
    IUnknown* itf = nullptr;
    HRESULT hr = driver_->QueryInterface(iid, reinterpret_cast<void**>(&itf));
    if (FAILED(hr)) return hr;
    IUnknown* expected = nullptr;
    if (!interfaces_[slot].compare_exchange_strong(expected, itf, std::memory_order_acq_rel)) {
        itf->Release();  // another thread stored it first
        itf = expected;
    }
    *out = itf;
    return S_OK;
}

void SessionRef::End() {
    if (reader_)
        ivi::EndDataRead(reader_);
    else if (d_)
        d_->Release();
    d_ = nullptr;
    reader_ = nullptr;
}

// Read without a lock: entries below the published count are complete and
// never change or go away while the session data lives.
IUnknown* SessionData::FindItem(const IID& collection, std::string_view name) {
    if (!items_cacheable_.load(std::memory_order_acquire)) return nullptr;
    const std::size_t n = item_count_.load(std::memory_order_acquire);
    for (std::size_t i = 0; i < n; ++i) {
        const CachedItem& c = items_[i];
        if ((c.collection == &collection || *c.collection == collection) && c.name == name)
            return c.item.get();
    }
    return nullptr;
}

void SessionData::StoreItem(const IID& collection, std::string_view name, IUnknown* item) {
    std::lock_guard<std::mutex> g(m_);
    // A session has a few dozen items at most; the bound keeps a client that
    // names items in ever new spellings from growing the cache.
    const std::size_t n = item_count_.load(std::memory_order_relaxed);
    if (!items_cacheable_.load(std::memory_order_relaxed) || n >= kMaxItems) return;
    items_[n] = {&collection, std::string(name), ComPtr<IUnknown>(item)};
    item_count_.store(n + 1, std::memory_order_release);
}

// The items stay alive until the session data goes (a call may be using one);
// they are just no longer found.
void SessionData::Expose() { items_cacheable_.store(false, std::memory_order_release); }

bool SessionData::TakePending(Queue q, std::string* text) {
    std::lock_guard<std::mutex> g(m_);
    const auto i = static_cast<std::size_t>(q);
    if (!has_pending_[i]) return false;
    *text = std::move(pending_[i]);
    has_pending_[i] = false;
    return true;
}

void SessionData::KeepPending(Queue q, std::string text) {
    std::lock_guard<std::mutex> g(m_);
    const auto i = static_cast<std::size_t>(q);
    pending_[i] = std::move(text);
    has_pending_[i] = true;
}

}  // namespace qn::capi
