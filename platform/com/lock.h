// A re-entrant critical section: the same thread may enter it again.
#pragma once

#include <mutex>

namespace qn::com {

class CriticalSection {
public:
    void Enter() { m_.lock(); }
    void Leave() { m_.unlock(); }
    bool TryEnter() { return m_.try_lock(); }
    // BasicLockable, for std::lock_guard / std::unique_lock.
    void lock() { m_.lock(); }
    void unlock() { m_.unlock(); }

private:
    std::recursive_mutex m_;
};

}  // namespace qn::com
