// A point in time by which an I/O operation must be complete, or none.
#pragma once

#include <chrono>
#include <climits>

#include "platform/com/types.h"

namespace qn::visa {

class Deadline {
  public:
    using Clock = std::chrono::steady_clock;

    // From a VISA timeout in milliseconds: negative means no deadline.
    static Deadline FromTimeout(LONG ms) {
        Deadline d;
        if (ms >= 0) {
            d.infinite_ = false;
            d.at_ = Clock::now() + std::chrono::milliseconds(ms);
        }
        return d;
    }
    static Deadline Infinite() { return Deadline(); }

    bool infinite() const { return infinite_; }
    bool Expired() const { return !infinite_ && Clock::now() >= at_; }

    // Milliseconds left for poll(): -1 when infinite, rounded up so that a
    // wait never ends before the deadline, 0 once it has passed.
    int PollMs() const {
        if (infinite_) return -1;
        auto left = at_ - Clock::now();
        if (left <= Clock::duration::zero()) return 0;
        auto ms = std::chrono::ceil<std::chrono::milliseconds>(left).count();
        return ms > INT_MAX ? INT_MAX : int(ms);
    }

  private:
    bool infinite_ = true;
    Clock::time_point at_{};
};

}  // namespace qn::visa
