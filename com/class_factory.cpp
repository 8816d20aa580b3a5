#include "com/class_factory.h"

#include <atomic>
#include <new>

#include "Quorlen731XXErrors.h"
#include "core/root_factory.h"

namespace qn::server {

namespace {

std::atomic<long>& ServerLocks() {
    static std::atomic<long> locks{0};
    return locks;
}

}  // namespace

HRESULT ClassFactory::CreateInstance(IUnknown* outer, REFIID riid, void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    // An aggregating client must hold the inner unknown; any other interface
    // would delegate to an outer object that does not know about it yet.
    if (outer && !(riid == iid_of<IUnknown>)) return CLASS_E_NOAGGREGATION;
    try {
        HRESULT hr = CreateQuorlen731XX(outer, riid, ppv);
        if (FAILED(hr)) *ppv = nullptr;
        return hr;
    } catch (const std::bad_alloc&) {
        return E_IVI_OUT_OF_MEMORY;
    } catch (...) {
        return E_UNEXPECTED;
    }
}

HRESULT ClassFactory::LockServer(bool lock) {
    std::atomic<long>& locks = ServerLocks();
    if (lock) {
        ++locks;
        return S_OK;
    }
    long current = locks.load();
    do {
        if (current <= 0) return E_UNEXPECTED;
    } while (!locks.compare_exchange_weak(current, current - 1));
    return S_OK;
}

long ServerLockCount() {
    return ServerLocks().load();
}

}  // namespace qn::server
