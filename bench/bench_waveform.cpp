// Waveform transfer benchmarks, each measured side by side with its baseline:
//
// - BM_ConvertWords: raw 16-bit words to doubles with the invalid-point check,
//   against BM_CopyDoubles, a plain memcpy of as many doubles.
// - BM_Fetch_DriverLoop: IQuorlen731XXMeasurement::FetchWaveform in a loop
//   with its output array passed back in, against the independent block
//   server, beside BM_Wire_BareReader (the bare reader into a reused buffer:
//   the limit of the wire) and BM_Wire_BareReaderConvert (the same plus the
//   conversion into a reused array: the limit of a fetch);
// - BM_Fetch_CApi: Qn731XX_FetchWaveform in a loop into the caller's reused
//   array, against the same block server and beside the same bare reader;
// - BM_Fetch_DriverFirst: the first fetch of a new session into a new array,
//   with the peak memory it added;
// - BM_Fetch_DriverEmulator: the loop against the emulator serving the same
//   prepared record;
// - BM_Fetch_Sessions: 1, 2 and 8 sessions in as many threads, each against
//   an emulator of its own (items per second is the aggregate throughput).
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>
#include <memory>
#include <string>
#include <vector>

#include "Qn731XX.h"
#include "bench/block_server.h"
#include "bench/ratio_reporter.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "io/io_manager.h"
#include "scope/waveform_scaling.h"

namespace {

constexpr int kRepetitions = 7;

std::vector<std::int16_t> RawRecord(std::size_t n) {
    std::vector<std::int16_t> raw(n);
    for (std::size_t i = 0; i < n; ++i) raw[i] = static_cast<std::int16_t>((i * 7919) % 60000 - 30000);
    return raw;
}

void BM_ConvertWords(benchmark::State& state) {
    const std::size_t n = static_cast<std::size_t>(state.range(0));
    const std::vector<std::int16_t> raw = RawRecord(n);
    std::vector<double> out(n);
    const qn::WaveformScaling s{0, 0, 0.25, 1.25e-4, 0};
    for (auto _ : state) {
        benchmark::DoNotOptimize(qn::ConvertWords(raw.data(), n, s, out.data()));
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * static_cast<long>(n));
}

void BM_CopyDoubles(benchmark::State& state) {
    const std::size_t n = static_cast<std::size_t>(state.range(0));
    const std::vector<double> in(n, 1.5);
    std::vector<double> out(n);
    for (auto _ : state) {
        std::memcpy(out.data(), in.data(), n * sizeof(double));
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * static_cast<long>(n));
}

// A word block of n points as the instrument sends it (big-endian), with
// the message's final line feed.
std::string WordBlock(std::size_t n) {
    const std::vector<std::int16_t> raw = RawRecord(n);
    std::string payload(2 * n, '\0');
    for (std::size_t i = 0; i < n; ++i) {
        const auto w = static_cast<std::uint16_t>(raw[i]);
        payload[2 * i] = static_cast<char>(w >> 8);
        payload[2 * i + 1] = static_cast<char>(w & 0xFF);
    }
    const std::string len = std::to_string(payload.size());
    return "#" + std::to_string(len.size()) + len + payload + "\n";
}

// One instrument per record size and kind, started on first use and kept for
// the whole run: the emulator serving a prepared record, and the block server
// (taught its small replies by an emulator of its own).
struct Peers {
    std::unique_ptr<qn::emu::Emulator> emulator;
    std::unique_ptr<qn::emu::Emulator> teacher;
    std::unique_ptr<qn::bench::BlockServer> server;
};

Peers& PeersFor(std::size_t points) {
    static std::map<std::size_t, Peers> all;
    static std::mutex m;
    std::lock_guard<std::mutex> lock(m);
    Peers& p = all[points];
    if (!p.server) {
        const std::string block = WordBlock(points);
        p.emulator = std::make_unique<qn::emu::Emulator>("QDS4032A");
        p.emulator->Start();
        p.emulator->ServeWaveformData(block.substr(0, block.size() - 1));
        p.teacher = std::make_unique<qn::emu::Emulator>("QDS4032A");
        p.teacher->Start();
        p.server = std::make_unique<qn::bench::BlockServer>(block, p.teacher->port());
    }
    return p;
}

// A driver session on `resource` and its Channel1 measurement.
struct DriverSession {
    ComPtr<qn::Quorlen731XX> driver;
    ComPtr<IQuorlen731XXMeasurement> measurement;

    explicit DriverSession(const std::string& resource) {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        driver = qn::com::MakeComObject<qn::Quorlen731XX>();
        qn::com::Bstr r(resource), o("");
        if (FAILED(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get())) ||
            FAILED(qn::Io(*driver.get()).SetIOTimeout(20000)))
            return;
        qn::com::Bstr name("Channel1");
        static_cast<IQuorlen731XXMeasurements*>(driver.get())->get_Item(name.get(),
                                                                         measurement.Out());
    }
    ~DriverSession() { driver->Close(); }
};

// Peak resident memory is reset (Linux: clear_refs 5) before a measured step
// and read afterwards (VmHWM), in bytes.
void ResetPeakMemory() {
    if (std::FILE* f = std::fopen("/proc/self/clear_refs", "w")) {
        std::fputs("5", f);
        std::fclose(f);
    }
}
double MemoryKb(const char* key) {
    double kb = 0;
    if (std::FILE* f = std::fopen("/proc/self/status", "r")) {
        char line[256];
        while (std::fgets(line, sizeof line, f))
            if (std::strncmp(line, key, std::strlen(key)) == 0) kb = std::atof(line + std::strlen(key));
        std::fclose(f);
    }
    return kb;
}

const qn::WaveformScaling kScaling{0, 0, 0.25, 1.25e-4, 0};

// The limit of the wire: the bare reader into its reused buffer.
void BM_Wire_BareReader(benchmark::State& state) {
    const auto points = static_cast<std::size_t>(state.range(0));
    qn::bench::BareReader reader(PeersFor(points).server->port());
    for (auto _ : state) {
        std::size_t bytes = 0;
        const std::uint8_t* data = reader.Fetch(&bytes);
        if (!data || bytes != 2 * points) {
            state.SkipWithError("fetch failed");
            break;
        }
        benchmark::DoNotOptimize(data);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

// The limit of a fetch: the bare reader, then the byte order and the
// conversion into a reused array of doubles.
void BM_Wire_BareReaderConvert(benchmark::State& state) {
    const auto points = static_cast<std::size_t>(state.range(0));
    qn::bench::BareReader reader(PeersFor(points).server->port());
    std::vector<std::int16_t> words(points);
    std::vector<double> out(points);
    for (auto _ : state) {
        std::size_t bytes = 0;
        const std::uint8_t* data = reader.Fetch(&bytes);
        if (!data || bytes != 2 * points) {
            state.SkipWithError("fetch failed");
            break;
        }
        for (std::size_t i = 0; i < points; ++i)
            words[i] = static_cast<std::int16_t>(data[2 * i] << 8 | data[2 * i + 1]);
        qn::ConvertWords(words.data(), points, kScaling, out.data());
        benchmark::DoNotOptimize(out.data());
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

// FetchWaveform of `points` in a loop, the output array passed back in each time.
void FetchLoop(benchmark::State& state, const std::string& resource, std::size_t points) {
    DriverSession s(resource);
    if (!s.measurement) {
        state.SkipWithError("cannot open the session");
        return;
    }
    qn::com::SafeArray array;
    for (auto _ : state) {
        SAFEARRAY* a = array.Detach();
        double x0 = 0, dx = 0;
        const HRESULT hr = s.measurement->FetchWaveform(&a, &x0, &dx);
        array = qn::com::SafeArray(a);
        if (FAILED(hr) || array.size() != points) {
            state.SkipWithError("fetch failed");
            break;
        }
        benchmark::DoNotOptimize(array.data<double>());
    }
    state.SetItemsProcessed(state.iterations() * static_cast<long>(points));
}

// Qn731XX_FetchWaveform in a loop into the caller's array, reused.
void BM_Fetch_CApi(benchmark::State& state) {
    const auto points = static_cast<ViInt32>(state.range(0));
    const std::string resource = PeersFor(std::size_t(points)).server->Resource();
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    ViSession vi = 0;
    if (Qn731XX_InitWithOptions(const_cast<ViChar*>(resource.c_str()), VI_FALSE, VI_FALSE, "",
                                &vi) < 0 ||
        Qn731XX_SetAttributeViInt32(vi, "", QN731XX_ATTR_SYSTEM_TIMEOUT_MILLISECONDS, 20000) < 0) {
        state.SkipWithError("cannot open the session");
        Qn731XX_close(vi);
        return;
    }
    std::vector<ViReal64> array(static_cast<std::size_t>(points));
    for (auto _ : state) {
        ViInt32 actual = 0;
        ViReal64 x0 = 0, dx = 0;
        if (Qn731XX_FetchWaveform(vi, "Channel1", points, array.data(), &actual, &x0, &dx) < 0 ||
            actual != points) {
            state.SkipWithError("fetch failed");
            break;
        }
        benchmark::DoNotOptimize(array.data());
    }
    Qn731XX_close(vi);
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

void BM_Fetch_DriverLoop(benchmark::State& state) {
    const auto points = static_cast<std::size_t>(state.range(0));
    FetchLoop(state, PeersFor(points).server->Resource(), points);
}

// The same loop against the emulator serving the prepared record from memory.
void BM_Fetch_DriverEmulator(benchmark::State& state) {
    const auto points = static_cast<std::size_t>(state.range(0));
    FetchLoop(state, qn::bench::SocketResource(PeersFor(points).emulator->port()), points);
}

// The first FetchWaveform of a new session into a new array: receive buffer
// and output pages are fresh. Reports the peak memory the call added, as a
// fraction of the raw block plus the output array.
void BM_Fetch_DriverFirst(benchmark::State& state) {
    const auto points = static_cast<std::size_t>(state.range(0));
    const std::string resource = PeersFor(points).server->Resource();
    double peak_ratio = 0;
    for (auto _ : state) {
        state.PauseTiming();
        auto s = std::make_unique<DriverSession>(resource);
        if (!s->measurement) {
            state.SkipWithError("cannot open the session");
            break;
        }
        ResetPeakMemory();
        const double before = MemoryKb("VmRSS:");
        state.ResumeTiming();
        SAFEARRAY* a = nullptr;
        double x0 = 0, dx = 0;
        const HRESULT hr = s->measurement->FetchWaveform(&a, &x0, &dx);
        state.PauseTiming();
        const double added = (MemoryKb("VmHWM:") - before) * 1024;
        peak_ratio = std::max(peak_ratio, added / double(points * (2 + 8)));
        qn::com::SafeArray owner(a);
        if (FAILED(hr)) state.SkipWithError("fetch failed");
        s.reset();
        state.ResumeTiming();
    }
    state.counters["peak_vs_block_plus_output"] = peak_ratio;
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

// Eight sessions in eight threads, each against an emulator of its own,
// fetching 1,000,000 points in a loop: throughput grows with the threads
// until the machine's cores are busy, when no lock is shared between sessions.
void BM_Fetch_Sessions(benchmark::State& state) {
    static std::vector<std::unique_ptr<qn::emu::Emulator>> emulators;
    static std::once_flag once;
    constexpr std::size_t kPoints = 1000000;
    std::call_once(once, [] {
        const std::string block = WordBlock(kPoints);
        for (int i = 0; i < 8; ++i) {
            emulators.push_back(std::make_unique<qn::emu::Emulator>("QDS4032A"));
            emulators.back()->Start();
            emulators.back()->ServeWaveformData(block.substr(0, block.size() - 1));
        }
    });
    const auto& emu = *emulators[std::size_t(state.thread_index())];
    // The sessions have no argument: their record size is fixed.
    FetchLoop(state, qn::bench::SocketResource(emu.port()), kPoints);
}

BENCHMARK(BM_ConvertWords)->Arg(1 << 20)->Repetitions(kRepetitions)->ReportAggregatesOnly(true);
BENCHMARK(BM_CopyDoubles)->Arg(1 << 20)->Repetitions(kRepetitions)->ReportAggregatesOnly(true);
#define QN_FETCH_BENCH(name)                                                              \
    BENCHMARK(name)->Arg(1000000)->Arg(8000000)->Repetitions(kRepetitions)                \
        ->ReportAggregatesOnly(true)->Unit(benchmark::kMillisecond)->UseRealTime()
QN_FETCH_BENCH(BM_Wire_BareReader);
QN_FETCH_BENCH(BM_Wire_BareReaderConvert);
QN_FETCH_BENCH(BM_Fetch_DriverLoop);
QN_FETCH_BENCH(BM_Fetch_CApi);
QN_FETCH_BENCH(BM_Fetch_DriverEmulator);
QN_FETCH_BENCH(BM_Fetch_DriverFirst)->Iterations(5);
BENCHMARK(BM_Fetch_Sessions)->Threads(1)->Threads(2)->Threads(8)->Repetitions(3)
    ->ReportAggregatesOnly(true)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

int main(int argc, char** argv) {
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_ConvertWords/1048576", "BM_CopyDoubles/1048576", 2.5, 2.5},
         {"BM_Fetch_DriverLoop/1000000", "BM_Wire_BareReader/1000000", 1.5, 0},
         {"BM_Fetch_DriverLoop/8000000", "BM_Wire_BareReader/8000000", 2.0, 0},
         {"BM_Fetch_CApi/8000000", "BM_Wire_BareReader/8000000", 2.0, 0},
         {"BM_Fetch_DriverFirst/8000000", "BM_Wire_BareReader/8000000", 4.0, 0},
         {"BM_Fetch_DriverLoop/1000000", "BM_Wire_BareReaderConvert/1000000", 0, 0},
         {"BM_Fetch_DriverLoop/8000000", "BM_Wire_BareReaderConvert/8000000", 0, 0},
         {"BM_Fetch_DriverEmulator/8000000", "BM_Fetch_DriverLoop/8000000", 1.2, 0}});
}
