// The IVI-C session table: a fixed array of slots that live as long as the
// process. A handle names its slot in its low bits and the slot's
// generation in the others, so finding a session is a load and a compare,
// without any lock; a disposed handle no longer matches its slot. Each slot
// keeps a count of the readers of its data pointer, so that a caller who
// replaces the pointer knows when nobody can still be holding the old one.
// The lock owner and the error record are guarded by the slot's mutex, so a
// slow lock holder on one session never blocks calls on another.
#include "platform/ivi/ivisession.h"

#include <atomic>
#include <condition_variable>
#include <cstring>
#include <memory>
#include <mutex>
#include <new>
#include <string>
#include <thread>

namespace {

constexpr unsigned kSlotBits = 12;
constexpr ViSession kSlots = ViSession{1} << kSlotBits;  // sessions open at once
constexpr ViSession kSlotMask = kSlots - 1;
// Generations 1 .. kMaxGeneration keep every handle nonzero and below 2^31,
// so it stays positive as a ViInt32 too.
constexpr ViSession kMaxGeneration = (ViSession{1} << (31 - kSlotBits)) - 1;

struct Slot {
    std::atomic<ViSession> handle{0};  // the live handle, 0 when free
    std::atomic<bool> claimed{false};  // taken from New until Dispose has finished
    ViSession generation = 0;          // written only by the claimer
    std::atomic<void*> data{nullptr};
    std::atomic<unsigned> readers{0};  // data-pointer readers in progress

    std::mutex m;
    std::condition_variable released;  // the lock became free, or the session ended
    ViStatus error_code = VI_SUCCESS;
    std::string error_text;
    std::thread::id owner;  // lock holder, default id when free
    unsigned depth = 0;     // re-entry count of the holder
};

class SessionTable {
  public:
    static SessionTable& Instance() {
        static SessionTable table;
        return table;
    }

    // The slot of a live handle (or of handle 0), else null. The slot stays
    // valid memory for ever; callers re-check the handle under the slot's
    // mutex where a late dispose matters.
    Slot* Find(ViSession vi) {
        if (vi == 0) return &null_session_;
        Slot& s = slots_[vi & kSlotMask];
        return s.handle.load(std::memory_order_acquire) == vi ? &s : nullptr;
    }

    // Claims a free slot, starting after the last one claimed so that a handle
    // comes back only after every slot has cycled through its generations.
    ViSession Add() {
        const ViSession start = next_.fetch_add(1, std::memory_order_relaxed);
        for (ViSession i = 0; i < kSlots; ++i) {
            Slot& s = slots_[(start + i) & kSlotMask];
            bool expected = false;
            if (!s.claimed.compare_exchange_strong(expected, true, std::memory_order_acquire))
                continue;
            s.generation = s.generation >= kMaxGeneration ? 1 : s.generation + 1;
            const ViSession vi = (s.generation << kSlotBits) | ((start + i) & kSlotMask);
            {
                std::lock_guard<std::mutex> g(s.m);
                s.error_code = VI_SUCCESS;
                s.error_text.clear();
                s.owner = std::thread::id();
                s.depth = 0;
                s.data.store(nullptr, std::memory_order_relaxed);
                s.handle.store(vi, std::memory_order_release);
            }
            return vi;
        }
        return 0;
    }

  private:
    std::unique_ptr<Slot[]> slots_ = std::make_unique<Slot[]>(kSlots);
    std::atomic<ViSession> next_{0};
    // Handle 0: only its error record is used.
    Slot null_session_;
};

// A real session (not handle 0), or null.
Slot* FindReal(ViSession vi) { return vi == 0 ? nullptr : SessionTable::Instance().Find(vi); }

// Counts the caller as a reader of the data pointer of live session `vi`;
// null (nothing counted) when `vi` is not live. Counted first, checked
// second: a dispose or replace that has not seen this reader has not happened
// yet, and one that has waits for LeaveReader.
Slot* EnterReader(ViSession vi) {
    Slot* s = FindReal(vi);
    if (!s) return nullptr;
    s->readers.fetch_add(1, std::memory_order_seq_cst);
    if (s->handle.load(std::memory_order_seq_cst) == vi) return s;
    s->readers.fetch_sub(1, std::memory_order_release);
    return nullptr;
}

void LeaveReader(Slot* s) { s->readers.fetch_sub(1, std::memory_order_release); }

// Waits until no reader that may have seen an earlier data pointer is left
// (a reader may be inside a long instrument operation: after a short spin
// the wait sleeps).
void WaitForReaders(Slot& s) {
    for (int spins = 0; s.readers.load(std::memory_order_seq_cst) != 0; ++spins) {
        if (spins < 1000)
            std::this_thread::yield();
        else
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
}

// Reads the data pointer of `vi`.
ViStatus ReadData(ViSession vi, void** data) {
    *data = nullptr;
    Slot* s = EnterReader(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    *data = s->data.load(std::memory_order_seq_cst);
    LeaveReader(s);
    return VI_SUCCESS;
}

using Clock = std::chrono::steady_clock;

// Takes the lock of session `vi` in `s`, waiting until `deadline`
// (Clock::time_point::max() for ever).
ViStatus Acquire(Slot& s, ViSession vi, Clock::time_point deadline) {
    const std::thread::id me = std::this_thread::get_id();
    std::unique_lock<std::mutex> g(s.m);
    auto ended = [&] { return s.handle.load(std::memory_order_relaxed) != vi; };
    auto available = [&] { return ended() || s.depth == 0 || s.owner == me; };
    if (deadline == Clock::time_point::max()) {
        s.released.wait(g, available);
    } else if (!s.released.wait_until(g, deadline, available)) {
        return IVISESSION_ERROR_TIMEOUT;
    }
    if (ended()) return IVISESSION_ERROR_INVALID_SESSION;
    s.owner = me;
    ++s.depth;
    return VI_SUCCESS;
}

ViStatus Lock(ViSession vi, Clock::time_point deadline, ViBoolean* caller_has_lock) {
    Slot* s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    if (caller_has_lock && *caller_has_lock) return VI_SUCCESS;
    ViStatus status = Acquire(*s, vi, deadline);
    if (status == VI_SUCCESS && caller_has_lock) *caller_has_lock = VI_TRUE;
    return status;
}

// The slot of `vi` with its mutex held, or an unlocked guard when the
// session does not exist (any more).
std::unique_lock<std::mutex> LockRecord(ViSession vi, Slot** out) {
    *out = nullptr;
    Slot* s = SessionTable::Instance().Find(vi);
    if (!s) return {};
    std::unique_lock<std::mutex> g(s->m);
    if (vi != 0 && s->handle.load(std::memory_order_relaxed) != vi) return {};
    *out = s;
    return g;
}

}  // namespace

extern "C" {

ViStatus IviSession_New(ViSession* newVi) {
    if (!newVi) return IVISESSION_ERROR_NULL_POINTER;
    *newVi = SessionTable::Instance().Add();
    return *newVi != 0 ? VI_SUCCESS : IVISESSION_ERROR_OUT_OF_MEMORY;
}

ViStatus IviSession_Dispose(ViSession vi) {
    Slot* s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    {
        std::lock_guard<std::mutex> g(s->m);
        ViSession expected = vi;
        if (!s->handle.compare_exchange_strong(expected, 0, std::memory_order_seq_cst))
            return IVISESSION_ERROR_INVALID_SESSION;  // another dispose won
        s->data.store(nullptr, std::memory_order_seq_cst);
        s->owner = std::thread::id();
        s->depth = 0;
        s->error_code = VI_SUCCESS;
        s->error_text.clear();
    }
    s->released.notify_all();
    // A reader that matched the handle before it was cleared finishes before
    // the slot can carry another session.
    WaitForReaders(*s);
    s->claimed.store(false, std::memory_order_release);
    return VI_SUCCESS;
}

ViStatus IviSession_SetDataPtr(ViSession vi, void* dataPtr) {
    void* previous = nullptr;
    return qn::ivi::ExchangeDataPtr(vi, dataPtr, &previous);
}

ViStatus IviSession_GetDataPtr(ViSession vi, void** dataPtr) {
    if (!dataPtr) return IVISESSION_ERROR_NULL_POINTER;
    return ReadData(vi, dataPtr);
}

ViStatus IviSession_Lock(ViSession vi, ViBoolean* callerHasLock) {
    return Lock(vi, Clock::time_point::max(), callerHasLock);
}

ViStatus IviSession_Unlock(ViSession vi, ViBoolean* callerHasLock) {
    Slot* s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    if (callerHasLock && !*callerHasLock) return VI_SUCCESS;
    bool now_free = false;
    {
        std::lock_guard<std::mutex> g(s->m);
        if (s->handle.load(std::memory_order_relaxed) != vi) return IVISESSION_ERROR_INVALID_SESSION;
        if (s->depth == 0 || s->owner != std::this_thread::get_id())
            return IVISESSION_ERROR_NOT_LOCKED;
        if (--s->depth == 0) {
            s->owner = std::thread::id();
            now_free = true;
        }
    }
    if (now_free) s->released.notify_one();
    if (callerHasLock) *callerHasLock = VI_FALSE;
    return VI_SUCCESS;
}

ViStatus IviSession_SetError(ViSession vi, ViStatus errorCode, ViConstString errorDescription) {
    try {
        std::string text = errorDescription ? errorDescription : "";
        Slot* s = nullptr;
        std::unique_lock<std::mutex> g = LockRecord(vi, &s);
        if (!s) return IVISESSION_ERROR_INVALID_SESSION;
        s->error_code = errorCode;
        s->error_text = std::move(text);
        return VI_SUCCESS;
    } catch (const std::bad_alloc&) {
        return IVISESSION_ERROR_OUT_OF_MEMORY;
    }
}

ViStatus IviSession_GetError(ViSession vi, ViStatus* errorCode, ViInt32 bufferSize,
                             ViChar description[]) {
    if (bufferSize < 0) return IVISESSION_ERROR_INVALID_VALUE;
    Slot* s = nullptr;
    std::unique_lock<std::mutex> g = LockRecord(vi, &s);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    if (errorCode) *errorCode = s->error_code;
    const std::size_t n = s->error_text.size();
    // The needed size, capped so that it stays a positive ViStatus.
    const ViStatus needed = n + 1 > 0x7FFFFFFF ? 0x7FFFFFFF : ViStatus(n + 1);
    if (!description || bufferSize == 0) return needed;
    const auto size = static_cast<std::size_t>(bufferSize);
    if (n + 1 > size) {
        std::memcpy(description, s->error_text.data(), size - 1);
        description[size - 1] = '\0';
        return needed;
    }
    std::memcpy(description, s->error_text.c_str(), n + 1);
    s->error_code = VI_SUCCESS;
    s->error_text.clear();
    return VI_SUCCESS;
}

ViStatus IviSession_ClearError(ViSession vi) {
    Slot* s = nullptr;
    std::unique_lock<std::mutex> g = LockRecord(vi, &s);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    s->error_code = VI_SUCCESS;
    s->error_text.clear();
    return VI_SUCCESS;
}

}  // extern "C"

namespace qn::ivi {

ViStatus LockSessionFor(ViSession vi, std::chrono::milliseconds timeout, ViBoolean* callerHasLock) {
    // Beyond a year the wait is as good as endless; this also keeps now() + timeout finite.
    if (timeout >= std::chrono::hours(24 * 365))
        return Lock(vi, Clock::time_point::max(), callerHasLock);
    if (timeout.count() < 0) timeout = std::chrono::milliseconds(0);
    return Lock(vi, Clock::now() + timeout, callerHasLock);
}

ViStatus BeginDataRead(ViSession vi, void** dataPtr, void** reader) {
    *dataPtr = nullptr;
    *reader = nullptr;
    Slot* s = EnterReader(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    void* p = s->data.load(std::memory_order_seq_cst);
    if (!p) {  // being closed
        LeaveReader(s);
        return IVISESSION_ERROR_INVALID_SESSION;
    }
    *dataPtr = p;
    *reader = s;
    return VI_SUCCESS;
}

void EndDataRead(void* reader) {
    if (reader) LeaveReader(static_cast<Slot*>(reader));
}

ViStatus ExchangeDataPtr(ViSession vi, void* dataPtr, void** previous) {
    if (!previous) return IVISESSION_ERROR_NULL_POINTER;
    *previous = nullptr;
    Slot* s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    {
        std::lock_guard<std::mutex> g(s->m);
        if (s->handle.load(std::memory_order_relaxed) != vi) return IVISESSION_ERROR_INVALID_SESSION;
        *previous = s->data.exchange(dataPtr, std::memory_order_seq_cst);
    }
    WaitForReaders(*s);
    return VI_SUCCESS;
}

}  // namespace qn::ivi
