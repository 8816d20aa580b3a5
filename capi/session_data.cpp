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

IUnknown* SessionData::FindItem(const IID& collection, std::string_view name) {
    std::lock_guard<std::mutex> g(m_);
    for (const CachedItem& c : items_)
        if (*c.collection == collection && c.name == name) return c.item.get();
    return nullptr;
}

void SessionData::StoreItem(const IID& collection, std::string_view name, IUnknown* item) {
    std::lock_guard<std::mutex> g(m_);
    // A session has a few dozen items at most; the bound keeps a client that
    // names items in ever new spellings from growing the cache.
    if (!items_cacheable_ || items_.size() >= 256) return;
    items_.push_back({&collection, std::string(name), ComPtr<IUnknown>(item)});
}

void SessionData::Expose() {
    std::lock_guard<std::mutex> g(m_);
    items_cacheable_ = false;
    items_.clear();
}

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
