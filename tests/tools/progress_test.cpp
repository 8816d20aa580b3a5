// The progress line of long qn731xx operations: drawn only when enabled (on a
// terminal), redrawn by its own thread, and cleared when the operation ends.
#include <gtest/gtest.h>

#include <chrono>
#include <cstdio>
#include <string>
#include <thread>

#include "tools/progress.h"

namespace qn::tools {
namespace {

std::string Contents(std::FILE* f) {
    std::fflush(f);
    std::rewind(f);
    std::string text;
    for (int c; (c = std::fgetc(f)) != EOF;) text += char(c);
    return text;
}

TEST(Progress, DrawsOnlyWhenEnabledAndClearsItsLineAtTheEnd) {
    for (bool enabled : {false, true}) {
        SCOPED_TRACE(enabled);
        std::FILE* f = std::tmpfile();
        ASSERT_NE(f, nullptr);
        {
            Progress progress("fetching Channel1", f, enabled);
            // Waits (10 s at most) for the first drawing, or lets a disabled
            // one have the time it would have needed.
            for (int i = 0; i < 1000 && (enabled ? std::ftell(f) == 0 : i < 50); ++i)
                std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        const std::string text = Contents(f);
        std::fclose(f);
        if (!enabled) {
            EXPECT_EQ(text, "");
            continue;
        }
        EXPECT_EQ(text.rfind("\rfetching Channel1... ", 0), 0u) << text;
        ASSERT_GE(text.size(), 4u);
        EXPECT_EQ(text.substr(text.size() - 4), "\r\033[K") << text;
    }
}

}  // namespace
}  // namespace qn::tools
