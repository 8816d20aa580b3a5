// Cost of method tracing per call: the same call with tracing recording
// (save interval one minute, so the document grows in memory) and with
// tracing off, plus the simulated property read the method frame makes
// (attribute-store lookup, then the simulation value).
#include <benchmark/benchmark.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <string>

#include "platform/com/bstr.h"
#include "services/cache.h"
#include "services/simulation.h"
#include "services/tracer.h"

namespace {

constexpr int kCalls = 100000;

// A property put and a get with an out-value, described as the frame does.
void Call(qn::CTraceOwner* tracer, double value, LONG* count) {
    const qn::TraceParam params[] = {
        qn::TraceParam::Double("val", qn::TraceDirection::In, &value),
        qn::TraceParam::Long("count", qn::TraceDirection::Out, count),
    };
    qn::CMethodTrace trace(tracer, "IQuorlen731XXChannel", "put_Range", params);
    *count = static_cast<LONG>(value);
    benchmark::DoNotOptimize(count);
}

void Run(benchmark::State& state, bool recording) {
    namespace fs = std::filesystem;
    char tmpl[] = "/tmp/qn_bench_trace_XXXXXX";
    if (!mkdtemp(tmpl)) {
        state.SkipWithError("no temporary directory");
        return;
    }
    fs::path dir(tmpl);
    {
        qn::CTraceOwner tracer;
        tracer.SetTraceName((dir / "bench.xml").string());
        tracer.SetSaveInterval(1);
        // A limit above what the calls produce, so every call is recorded
        // (at the default limit the trace turns full after a few thousand).
        tracer.SetSizeLimit(2000000000);
        if (recording) {
            tracer.SetEnabled(true);
            if (FAILED(tracer.StartSessionTracing())) state.SkipWithError("trace did not start");
        }
        LONG count = 0;
        double v = 0.0;
        for (auto _ : state) Call(&tracer, v += 1.0, &count);
    }
    fs::remove_all(dir);
}

void BM_CallTracingOff(benchmark::State& state) {
    Run(state, false);
}
void BM_CallTraced(benchmark::State& state) {
    Run(state, true);
}
BENCHMARK(BM_CallTracingOff)->Iterations(kCalls)->Unit(benchmark::kNanosecond);
BENCHMARK(BM_CallTraced)->Iterations(kCalls)->Unit(benchmark::kNanosecond);

constexpr qn::SimValue kRangeSim = qn::SimValue::Double(40);

// What the frame does for a simulated get: the cache entry of the key, and
// the row's simulation value when the entry is not valid.
void BM_SimulatedGet(benchmark::State& state) {
    qn::CCacheManager cache;
    const bool written = state.range(0) != 0;
    if (written) cache.GetCacheEntry<double>("IQuorlen731XXChannel.Range")->Set(2.5);
    for (auto _ : state) {
        double v = 0.0;
        auto* e = cache.GetCacheEntry<double>("IQuorlen731XXChannel.Range");
        if (!e->Get(&v)) v = kRangeSim.real;
        benchmark::DoNotOptimize(v);
    }
}
BENCHMARK(BM_SimulatedGet)->Arg(0)->Arg(1);

}  // namespace

BENCHMARK_MAIN();
