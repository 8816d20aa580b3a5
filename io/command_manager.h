// CInstrumentCommandManager: the command stack of a driver object. The method
// frame pushes a member's formatted command before its body runs and pops it
// afterwards; the I/O manager's command operations send the top entry.
#pragma once

#include <string>
#include <vector>

namespace qn {

class CInstrumentCommandManager {
public:
    void PushCommand(std::string cmd) { stack_.push_back(std::move(cmd)); }
    void PopCommand() {
        if (!stack_.empty()) stack_.pop_back();
    }
    // The current command; empty when the stack is empty.
    const std::string& CurrentCommand() const {
        static const std::string kEmpty;
        return stack_.empty() ? kEmpty : stack_.back();
    }
    std::size_t Depth() const { return stack_.size(); }

private:
    std::vector<std::string> stack_;
};

}  // namespace qn
