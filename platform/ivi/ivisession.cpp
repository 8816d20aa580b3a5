// The IVI-C session table. Each session is a shared entry found by handle
// under the table mutex; its own state (data pointer, error record, lock
// owner) is guarded by the entry's mutex, so a slow lock holder on one session
// never blocks calls on another.
#include "platform/ivi/ivisession.h"

#include <condition_variable>
#include <cstring>
#include <memory>
#include <mutex>
#include <new>
#include <string>
#include <thread>
#include <unordered_map>

namespace {

struct Session {
    std::mutex m;
    std::condition_variable released;  // the lock became free, or the session was disposed
    void* data = nullptr;
    ViStatus error_code = VI_SUCCESS;
    std::string error_text;
    std::thread::id owner;  // lock holder, default id when free
    unsigned depth = 0;     // re-entry count of the holder
    bool disposed = false;
};

class SessionTable {
  public:
    static SessionTable& Instance() {
        static SessionTable table;
        return table;
    }

    std::shared_ptr<Session> Find(ViSession vi) {
        if (vi == 0) return null_session_;
        std::lock_guard<std::mutex> g(m_);
        auto it = sessions_.find(vi);
        return it == sessions_.end() ? nullptr : it->second;
    }

    ViSession Add(std::shared_ptr<Session> s) {
        std::lock_guard<std::mutex> g(m_);
        // Next free handle in 1..2^31-1, so handles stay positive as ViInt32 too.
        do {
            next_ = next_ >= 0x7FFFFFFFu ? 1 : next_ + 1;
        } while (sessions_.count(next_));
        sessions_.emplace(next_, std::move(s));
        return next_;
    }

    std::shared_ptr<Session> Remove(ViSession vi) {
        std::lock_guard<std::mutex> g(m_);
        auto it = sessions_.find(vi);
        if (it == sessions_.end()) return nullptr;
        std::shared_ptr<Session> s = std::move(it->second);
        sessions_.erase(it);
        return s;
    }

  private:
    std::mutex m_;
    std::unordered_map<ViSession, std::shared_ptr<Session>> sessions_;
    ViSession next_ = 0;
    // Handle 0: only its error record is used.
    std::shared_ptr<Session> null_session_ = std::make_shared<Session>();
};

// A real session (not handle 0), or null.
std::shared_ptr<Session> FindReal(ViSession vi) {
    return vi == 0 ? nullptr : SessionTable::Instance().Find(vi);
}

using Clock = std::chrono::steady_clock;

// Takes the lock of `s`, waiting until `deadline` (Clock::time_point::max() for ever).
ViStatus Acquire(Session& s, Clock::time_point deadline) {
    const std::thread::id me = std::this_thread::get_id();
    std::unique_lock<std::mutex> g(s.m);
    auto available = [&] { return s.disposed || s.depth == 0 || s.owner == me; };
    if (deadline == Clock::time_point::max()) {
        s.released.wait(g, available);
    } else if (!s.released.wait_until(g, deadline, available)) {
        return IVISESSION_ERROR_TIMEOUT;
    }
    if (s.disposed) return IVISESSION_ERROR_INVALID_SESSION;
    s.owner = me;
    ++s.depth;
    return VI_SUCCESS;
}

ViStatus Lock(ViSession vi, Clock::time_point deadline, ViBoolean* caller_has_lock) {
    std::shared_ptr<Session> s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    if (caller_has_lock && *caller_has_lock) return VI_SUCCESS;
    ViStatus status = Acquire(*s, deadline);
    if (status == VI_SUCCESS && caller_has_lock) *caller_has_lock = VI_TRUE;
    return status;
}

}  // namespace

extern "C" {

ViStatus IviSession_New(ViSession* newVi) {
    if (!newVi) return IVISESSION_ERROR_NULL_POINTER;
    *newVi = 0;
    try {
        *newVi = SessionTable::Instance().Add(std::make_shared<Session>());
        return VI_SUCCESS;
    } catch (const std::bad_alloc&) {
        return IVISESSION_ERROR_OUT_OF_MEMORY;
    }
}

ViStatus IviSession_Dispose(ViSession vi) {
    std::shared_ptr<Session> s = vi == 0 ? nullptr : SessionTable::Instance().Remove(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    {
        std::lock_guard<std::mutex> g(s->m);
        s->disposed = true;
    }
    s->released.notify_all();
    return VI_SUCCESS;
}

ViStatus IviSession_SetDataPtr(ViSession vi, void* dataPtr) {
    std::shared_ptr<Session> s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    std::lock_guard<std::mutex> g(s->m);
    s->data = dataPtr;
    return VI_SUCCESS;
}

ViStatus IviSession_GetDataPtr(ViSession vi, void** dataPtr) {
    if (!dataPtr) return IVISESSION_ERROR_NULL_POINTER;
    *dataPtr = nullptr;
    std::shared_ptr<Session> s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    std::lock_guard<std::mutex> g(s->m);
    *dataPtr = s->data;
    return VI_SUCCESS;
}

ViStatus IviSession_Lock(ViSession vi, ViBoolean* callerHasLock) {
    return Lock(vi, Clock::time_point::max(), callerHasLock);
}

ViStatus IviSession_Unlock(ViSession vi, ViBoolean* callerHasLock) {
    std::shared_ptr<Session> s = FindReal(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    if (callerHasLock && !*callerHasLock) return VI_SUCCESS;
    bool now_free = false;
    {
        std::lock_guard<std::mutex> g(s->m);
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
    std::shared_ptr<Session> s = SessionTable::Instance().Find(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    try {
        std::string text = errorDescription ? errorDescription : "";
        std::lock_guard<std::mutex> g(s->m);
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
    std::shared_ptr<Session> s = SessionTable::Instance().Find(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    std::lock_guard<std::mutex> g(s->m);
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
    std::shared_ptr<Session> s = SessionTable::Instance().Find(vi);
    if (!s) return IVISESSION_ERROR_INVALID_SESSION;
    std::lock_guard<std::mutex> g(s->m);
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

}  // namespace qn::ivi
