// Console output of Google Benchmark, followed by the ratio of the medians of
// pairs of cases measured in the same run (subject / baseline), for wall and
// CPU time. Benchmark programs that compare the driver with a baseline use
// RunWithRatios as their main; the repetitions of the cases are interleaved
// unless the command line says otherwise, so that a slow spell of the shared
// machine falls on both sides of a pair.
#pragma once

#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace qn::bench {

struct RatioPair {
    std::string subject;   // case name: function name, "/args" when it has arguments
    std::string baseline;  // case name of the baseline
    double real_goal = 0;  // the wall-time ratio aimed for (0: none)
    double cpu_goal = 0;   // the CPU-time ratio aimed for (0: none)
    double max_ns = 0;     // the subject's wall time per iteration aimed for (0: none)
};

class RatioReporter : public benchmark::ConsoleReporter {
  public:
    explicit RatioReporter(std::vector<RatioPair> pairs)
        : ConsoleReporter(::isatty(1) ? OO_ColorTabular : OO_Tabular), pairs_(std::move(pairs)) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& r : runs) {
            if (r.run_type != Run::RT_Aggregate || r.aggregate_name != "median") continue;
            std::string name = r.run_name.function_name;
            if (!r.run_name.args.empty()) name += "/" + r.run_name.args;
            medians_[name] = {ToNs(r.GetAdjustedRealTime(), r.time_unit),
                              ToNs(r.GetAdjustedCPUTime(), r.time_unit)};
        }
        ConsoleReporter::ReportRuns(runs);
    }

    void Finalize() override {
        ConsoleReporter::Finalize();
        std::FILE* out = stdout;
        std::fprintf(out,
                     "\nMedians side by side (ns per iteration) and ratios subject/baseline:\n");
        for (const RatioPair& p : pairs_) {
            auto s = medians_.find(p.subject), b = medians_.find(p.baseline);
            if (s == medians_.end() || b == medians_.end()) {
                std::fprintf(out, "  %s vs %s: not measured in this run\n", p.subject.c_str(),
                             p.baseline.c_str());
                continue;
            }
            std::fprintf(out, "  %s vs %s\n", p.subject.c_str(), p.baseline.c_str());
            Line(out, "wall", s->second.first, b->second.first, p.real_goal);
            Line(out, "cpu ", s->second.second, b->second.second, p.cpu_goal);
            if (p.max_ns > 0)
                std::fprintf(out, "    %s wall %.1f ns per call (goal < %.0f ns: %s)\n",
                             p.subject.c_str(), s->second.first, p.max_ns,
                             s->second.first < p.max_ns ? "met" : "MISSED");
        }
        std::fflush(out);
    }

  private:
    static double ToNs(double v, benchmark::TimeUnit u) {
        switch (u) {
            case benchmark::kSecond:
                return v * 1e9;
            case benchmark::kMillisecond:
                return v * 1e6;
            case benchmark::kMicrosecond:
                return v * 1e3;
            default:
                return v;
        }
    }
    static void Line(std::FILE* out, const char* what, double subject, double baseline,
                     double goal) {
        const double ratio = baseline > 0 ? subject / baseline : 0.0;
        std::fprintf(out, "    %s %12.1f ns vs %12.1f ns  ratio %6.3f", what, subject, baseline,
                     ratio);
        if (goal > 0)
            std::fprintf(out, "  (goal <= %.2f: %s)", goal, ratio <= goal ? "met" : "MISSED");
        std::fprintf(out, "\n");
    }

    std::vector<RatioPair> pairs_;
    std::map<std::string, std::pair<double, double>> medians_;  // name -> (wall, cpu) in ns
};

// Runs the registered benchmarks with a RatioReporter; repetitions are
// interleaved unless the command line sets the interleaving itself.
inline int RunWithRatios(int argc, char** argv, std::vector<RatioPair> pairs) {
    std::vector<char*> args(argv, argv + argc);
    static char interleave[] = "--benchmark_enable_random_interleaving=true";
    bool given = false;
    for (int i = 1; i < argc; ++i)
        given = given || std::strncmp(argv[i], "--benchmark_enable_random_interleaving", 38) == 0;
    if (!given) args.insert(args.begin() + 1, interleave);
    int n = static_cast<int>(args.size());
    args.push_back(nullptr);
    benchmark::Initialize(&n, args.data());
    if (benchmark::ReportUnrecognizedArguments(n, args.data())) return 1;
    RatioReporter reporter(std::move(pairs));
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    return 0;
}

}  // namespace qn::bench
