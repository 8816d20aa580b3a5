// Call-context stack: one record (component, interface, member) per interface
// call in progress on an object. Records point at the static names of the
// member tables, so pushing allocates nothing once the stack has grown.
#pragma once

#include <string_view>
#include <vector>

namespace qn {

struct CallContext {
    std::string_view component;
    std::string_view interfaceName;
    std::string_view member;
};

class CCallContextManager {
  public:
    CCallContextManager() { stack_.reserve(16); }

    // Top record, or null when no call is in progress.
    const CallContext* Current() const { return stack_.empty() ? nullptr : &stack_.back(); }
    void Push(const CallContext& c) { stack_.push_back(c); }
    // Removes and returns the top record; an empty record when none.
    CallContext Pop() {
        if (stack_.empty()) return {};
        CallContext c = stack_.back();
        stack_.pop_back();
        return c;
    }
    std::string_view ContextText() const { return {}; }
    std::size_t Depth() const { return stack_.size(); }

  private:
    std::vector<CallContext> stack_;
};

// Pushes a record for the life of a scope, popped on every path out.
class CallContextScope {
  public:
    CallContextScope(CCallContextManager& m, const CallContext& c) : m_(m) { m_.Push(c); }
    ~CallContextScope() { m_.Pop(); }
    CallContextScope(const CallContextScope&) = delete;
    CallContextScope& operator=(const CallContextScope&) = delete;

  private:
    CCallContextManager& m_;
};

}  // namespace qn
