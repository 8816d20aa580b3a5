#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <map>
#include <pugixml.hpp>
#include <thread>
#include <vector>

#include "services/tracer.h"

namespace fs = std::filesystem;

namespace qn {
namespace {

// Two sessions on two threads tracing into the same file share its document:
// every record of both ends up in the file, whatever the interleaving, and
// names the thread that made the call.
TEST(TracerThreads, SessionsOnTwoThreadsShareOneFile) {
    char tmpl[] = "/tmp/qn_trace_mt_XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    const std::string path = (fs::path(tmpl) / "shared.xml").string();
    constexpr int kCalls = 200;
    pid_t tids[2] = {0, 0};
    auto session = [&](int n) {
        tids[n] = gettid();
        CTraceOwner t;
        t.SetTraceName(path);
        t.SetSaveInterval(0);  // every call saves, so saves race with appends
        t.SetEnabled(true);
        if (FAILED(t.StartSessionTracing())) return;
        for (LONG i = 0; i < kCalls; ++i) {
            const TraceParam p[] = {TraceParam::Long("val", TraceDirection::In, &i)};
            CMethodTrace trace(&t, "IQuorlen731XXAcquisition", "put_NumberOfAverages", p);
        }
        t.SaveOnClose();
    };
    std::vector<std::thread> threads;
    for (int i = 0; i < 2; ++i) threads.emplace_back(session, i);
    for (auto& th : threads) th.join();

    pugi::xml_document d;
    ASSERT_TRUE(d.load_file(path.c_str()));
    auto methods = d.child("TraceRecords").children("Method");
    EXPECT_EQ(std::distance(methods.begin(), methods.end()), 2 * kCalls);
    std::map<int, int> calls_per_thread;
    for (pugi::xml_node m : methods) ++calls_per_thread[m.attribute("Thread").as_int()];
    EXPECT_EQ(calls_per_thread, (std::map<int, int>{{tids[0], kCalls}, {tids[1], kCalls}}));
    EXPECT_EQ(calls_per_thread.count(getpid()), 0u);
    fs::remove_all(tmpl);
}

}  // namespace
}  // namespace qn
