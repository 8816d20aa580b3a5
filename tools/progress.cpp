#include "tools/progress.h"

#include <unistd.h>

namespace qn::tools {

namespace {
// Operations shorter than this show nothing.
constexpr auto kQuietStart = std::chrono::milliseconds(300);
constexpr auto kRedraw = std::chrono::milliseconds(100);
}  // namespace

Progress::Progress(std::string label, std::FILE* to)
    : Progress(std::move(label), to, ::isatty(::fileno(to)) == 1) {}

Progress::Progress(std::string label, std::FILE* to, bool enabled)
    : label_(std::move(label)), to_(to) {
    if (enabled) thread_ = std::thread([this] { Run(); });
}

Progress::~Progress() {
    if (!thread_.joinable()) return;
    {
        std::lock_guard lock(mutex_);
        stop_ = true;
    }
    stop_cv_.notify_one();
    thread_.join();
}

void Progress::Run() {
    const auto start = std::chrono::steady_clock::now();
    std::unique_lock lock(mutex_);
    if (stop_cv_.wait_for(lock, kQuietStart, [this] { return stop_; })) return;
    do {
        const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
        std::fprintf(to_, "\r%s... %.1f s", label_.c_str(), elapsed.count());
        std::fflush(to_);
    } while (!stop_cv_.wait_for(lock, kRedraw, [this] { return stop_; }));
    // Clears the line so the command's own output starts at its beginning.
    std::fprintf(to_, "\r\033[K");
    std::fflush(to_);
}

}  // namespace qn::tools
