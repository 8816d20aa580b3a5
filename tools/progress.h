// Progress of a long operation (waiting for a trigger, a fetch over a slow
// link) on a terminal: after a short delay, "LABEL... N.N s" is redrawn on
// stderr until the operation ends, then the line is cleared. Nothing is
// written when stderr is not a terminal, so piped output stays clean.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <mutex>
#include <string>
#include <thread>

namespace qn::tools {

class Progress {
public:
    // Shows progress on `to` when it is a terminal.
    explicit Progress(std::string label, std::FILE* to = stderr);
    // Shows progress on `to` when `enabled`.
    Progress(std::string label, std::FILE* to, bool enabled);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

private:
    void Run();

    std::string label_;
    std::FILE* to_;
    std::mutex mutex_;
    std::condition_variable stop_cv_;
    bool stop_ = false;
    std::thread thread_;
};

}  // namespace qn::tools
