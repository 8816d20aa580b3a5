// Coercion log: a bounded first-in first-out queue of coercion records.
#pragma once

#include <cstddef>
#include <deque>
#include <string>

namespace qn {

class CCoercionLogManager {
  public:
    static constexpr std::size_t kDefaultMaxRecords = 100;

    explicit CCoercionLogManager(std::size_t maxRecords = kDefaultMaxRecords)
        : max_(maxRecords ? maxRecords : 1) {}

    // Appends a record; a full queue drops its oldest record first.
    void AddCoercionRecord(std::string text) {
        if (records_.size() >= max_) records_.pop_front();
        records_.push_back(std::move(text));
    }
    // Removes and returns the oldest record; "" when the queue is empty.
    std::string GetNext() {
        if (records_.empty()) return {};
        std::string r = std::move(records_.front());
        records_.pop_front();
        return r;
    }
    std::size_t size() const { return records_.size(); }
    void Clear() { records_.clear(); }

  private:
    std::size_t max_;
    std::deque<std::string> records_;
};

}  // namespace qn
