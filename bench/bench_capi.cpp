// The C API's attribute access against the same property through the COM
// interface, both in simulation and in one run:
//
// - BM_C_GetTimePerRecord / BM_Com_GetTimePerRecord: a property of the session.
// - BM_C_GetChannelRange / BM_Com_GetChannelRange: a property of a channel; the
//   C call names the channel each time, the COM client holds the channel object.
#include <benchmark/benchmark.h>

#include <cstdlib>

#include "IviScope.h"
#include "Qn731XX.h"
#include "bench/ratio_reporter.h"
#include "platform/com/bstr.h"

namespace {

// A simulated session; `com` also hands its driver object to a COM client.
struct Session {
    ViSession vi = 0;
    ComPtr<IUnknown> driver;
    explicit Session(bool com = false) {
        Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE,
                                "Simulate=true,DriverSetup=Model=QDS2014A", &vi);
        if (!com) return;
        void* p = nullptr;
        Qn731XX_GetNativeIUnknownPtr(vi, &p);
        driver.Attach(static_cast<IUnknown*>(p));
    }
    ~Session() {
        driver.reset();
        Qn731XX_close(vi);
    }
};

void BM_C_GetTimePerRecord(benchmark::State& state) {
    Session s;
    ViReal64 v = 0;
    for (auto _ : state) {
        if (Qn731XX_GetAttributeViReal64(s.vi, "", IVISCOPE_ATTR_HORZ_TIME_PER_RECORD, &v) != 0)
            state.SkipWithError("failed");
        benchmark::DoNotOptimize(v);
    }
}

void BM_Com_GetTimePerRecord(benchmark::State& state) {
    Session s(true);
    ComPtr<IIviScopeAcquisition> acq;
    s.driver.As(acq);
    double v = 0;
    for (auto _ : state) {
        if (acq->get_TimePerRecord(&v) != S_OK) state.SkipWithError("failed");
        benchmark::DoNotOptimize(v);
    }
}

void BM_C_GetChannelRange(benchmark::State& state) {
    Session s;
    ViReal64 v = 0;
    for (auto _ : state) {
        if (Qn731XX_GetAttributeViReal64(s.vi, "Channel2", IVISCOPE_ATTR_VERTICAL_RANGE, &v) != 0)
            state.SkipWithError("failed");
        benchmark::DoNotOptimize(v);
    }
}

void BM_Com_GetChannelRange(benchmark::State& state) {
    Session s(true);
    ComPtr<IIviScopeChannels> channels;
    s.driver.As(channels);
    qn::com::Bstr name("Channel2");
    ComPtr<IIviScopeChannel> channel;
    channels->get_Item(name.get(), channel.Out());
    double v = 0;
    for (auto _ : state) {
        if (channel->get_Range(&v) != S_OK) state.SkipWithError("failed");
        benchmark::DoNotOptimize(v);
    }
}

BENCHMARK(BM_C_GetTimePerRecord)->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Com_GetTimePerRecord)->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_C_GetChannelRange)->Repetitions(9)->ReportAggregatesOnly(true);
BENCHMARK(BM_Com_GetChannelRange)->Repetitions(9)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-bench-store.xml", 1);
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_C_GetTimePerRecord", "BM_Com_GetTimePerRecord", 1.3, 1.3, 0},
         {"BM_C_GetChannelRange", "BM_Com_GetChannelRange", 1.3, 1.3, 0}});
}
