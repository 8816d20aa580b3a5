// The "*IDN?" round trip through the driver against a bare socket client,
// both talking to the same in-process emulator on loopback:
// - BM_Query_Driver: CDriverIOManager::InstrQuery on an initialized root
//   object (status check off, tracing off): I/O manager, provider, VISA
//   session, raw-socket transport;
// - BM_Query_BareSocket: a blocking TCP socket writing "*IDN?\n" and reading
//   up to the line feed.
// The emulator serves one client at a time, so each case opens its own
// connection and closes it before the next case runs. Wall time is the
// latency a program sees; CPU time is the calling thread's own work (the
// emulator's thread is not counted). The ratios of the medians are printed
// at the end.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <memory>
#include <string>

#include "bench/loopback.h"
#include "bench/ratio_reporter.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "io/io_manager.h"

namespace {

constexpr const char* kModel = "QDS4032A";

qn::emu::Emulator& TheEmulator() {
    static qn::emu::Emulator emu(kModel);
    static const std::uint16_t port = emu.Start();
    (void)port;
    return emu;
}

void BM_Query_BareSocket(benchmark::State& state) {
    TheEmulator().ClearReceivedMessages();
    qn::bench::LineClient c(TheEmulator().port());
    if (!c.ok()) {
        state.SkipWithError("connect failed");
        return;
    }
    static const char kQuery[] = "*IDN?\n";
    std::string reply;
    for (auto _ : state) {
        if (!c.Send(kQuery) || !c.ReadLine(&reply)) {
            state.SkipWithError("query failed");
            break;
        }
        benchmark::DoNotOptimize(reply.data());
    }
}

void BM_Query_Driver(benchmark::State& state) {
    TheEmulator().ClearReceivedMessages();
    auto driver = qn::com::MakeComObject<qn::Quorlen731XX>();
    qn::com::Bstr r(qn::bench::SocketResource(TheEmulator().port())), o("QueryInstrStatus=false");
    if (FAILED(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()))) {
        state.SkipWithError("Initialize failed");
        return;
    }
    std::string reply;
    for (auto _ : state) {
        if (FAILED(qn::Io(*driver.get()).InstrQuery("*IDN?", &reply, 256))) {
            state.SkipWithError("query failed");
            break;
        }
        benchmark::DoNotOptimize(reply.data());
    }
    driver->Close();
}

BENCHMARK(BM_Query_BareSocket)->UseRealTime()->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Query_Driver)->UseRealTime()->Repetitions(9)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    // No configuration store: the resource string is used as it is.
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-bench-store.xml", 1);
    return qn::bench::RunWithRatios(argc, argv,
                                    {{"BM_Query_Driver", "BM_Query_BareSocket", 1.15, 1.5}});
}
