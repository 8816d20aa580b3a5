// Automatic measurements through the driver:
// - BM_Measure_Simulated: FetchWaveformMeasurement on a simulated session
//   (the whole method frame, tracing off), against a plain virtual call;
// - BM_Measure_Driver: FetchWaveformMeasurement of channel 1's frequency
//   against the emulator on loopback (status check off): display check,
//   source selection, timeout set and restored, the query;
// - BM_Measure_BareSocket: a blocking TCP client sending the same
//   ":MEAS:SOUR CHAN1" and ":MEAS:FREQ?" to the same emulator and reading
//   the reply up to the line feed.
// The emulator serves one client at a time, so each case opens its own
// connection. The ratios of the medians are printed at the end.
#include <benchmark/benchmark.h>

#include <cstdlib>
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

// Both loopback cases measure the record of one acquisition.
bool Acquire(qn::bench::LineClient& c) {
    std::string reply;
    return c.Send(":DIG;*OPC?\n") && c.ReadLine(&reply);
}

void BM_Measure_BareSocket(benchmark::State& state) {
    qn::bench::LineClient c(TheEmulator().port());
    if (!c.ok() || !Acquire(c)) {
        state.SkipWithError("connect failed");
        return;
    }
    const std::string select = ":MEAS:SOUR CHAN1\n", query = ":MEAS:FREQ?\n";
    std::string reply;
    for (auto _ : state) {
        if (!c.Send(select) || !c.Send(query) || !c.ReadLine(&reply)) {
            state.SkipWithError("query failed");
            break;
        }
        benchmark::DoNotOptimize(reply.data());
    }
}

ComPtr<IQuorlen731XXMeasurement> Channel1(qn::Quorlen731XX* driver) {
    ComPtr<IQuorlen731XXMeasurement> m;
    qn::com::Bstr name("UserChannel1");
    static_cast<IQuorlen731XXMeasurements*>(driver)->get_Item(name.get(), m.Out());
    return m;
}

void BM_Measure_Driver(benchmark::State& state) {
    auto driver = qn::com::MakeComObject<qn::Quorlen731XX>();
    qn::com::Bstr r(qn::bench::SocketResource(TheEmulator().port())), o("QueryInstrStatus=false");
    if (FAILED(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get())) ||
        FAILED(qn::Io(*driver.get()).InstrWrite(":DIG"))) {
        state.SkipWithError("Initialize failed");
        return;
    }
    auto m = Channel1(driver.get());
    double v = 0;
    for (auto _ : state) {
        if (!m || FAILED(m->FetchWaveformMeasurement(Quorlen731XXMeasurementFrequency, &v))) {
            state.SkipWithError("measurement failed");
            break;
        }
        benchmark::DoNotOptimize(v);
    }
    driver->Close();
}

struct IPlain {
    virtual ~IPlain() = default;
    virtual HRESULT Measure(Quorlen731XXMeasurementEnum f, double* v) = 0;
};
struct Plain final : IPlain {
    HRESULT Measure(Quorlen731XXMeasurementEnum f, double* v) override {
        *v = static_cast<double>(f) * 0.0;
        return S_OK;
    }
};

void BM_Plain_Measure(benchmark::State& state) {
    Plain plain;
    IPlain* p = &plain;
    double v = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(p);
        p->Measure(Quorlen731XXMeasurementFrequency, &v);
        benchmark::DoNotOptimize(v);
    }
}

void BM_Measure_Simulated(benchmark::State& state) {
    auto driver = qn::com::MakeComObject<qn::Quorlen731XX>();
    qn::com::Bstr r(""), o("Simulate=true,DriverSetup=Model=QDS4032A");
    if (FAILED(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()))) {
        state.SkipWithError("Initialize failed");
        return;
    }
    auto m = Channel1(driver.get());
    double v = 0;
    for (auto _ : state) {
        if (m->FetchWaveformMeasurement(Quorlen731XXMeasurementFrequency, &v) != S_OK)
            state.SkipWithError("measurement failed");
        benchmark::DoNotOptimize(v);
    }
}

BENCHMARK(BM_Measure_BareSocket)->UseRealTime()->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Measure_Driver)->UseRealTime()->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Plain_Measure)->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Measure_Simulated)->Repetitions(9)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-bench-store.xml", 1);
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_Measure_Driver", "BM_Measure_BareSocket", 1.2, 0},
         {"BM_Measure_Simulated", "BM_Plain_Measure", 0, 0, 1000}});
}
