// Waveform transfer benchmarks, each measured side by side with its baseline:
//
// - BM_ConvertWords: raw 16-bit words to doubles with the invalid-point check,
//   against BM_CopyDoubles, a plain memcpy of as many doubles.
// - BM_Fetch_Driver: IQuorlen731XXMeasurement::FetchWaveform of a prepared
//   record served from the emulator's memory over loopback, against
//   BM_Fetch_BareSocket: a blocking socket that sends ":WAV:DATA?", reads the
//   same block and converts it with the same formula.
#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>
#include <memory>
#include <string>
#include <vector>

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

// A word block of n points as the instrument sends it (big-endian).
std::string WordBlock(std::size_t n) {
    const std::vector<std::int16_t> raw = RawRecord(n);
    std::string payload(2 * n, '\0');
    for (std::size_t i = 0; i < n; ++i) {
        const auto w = static_cast<std::uint16_t>(raw[i]);
        payload[2 * i] = static_cast<char>(w >> 8);
        payload[2 * i + 1] = static_cast<char>(w & 0xFF);
    }
    const std::string len = std::to_string(payload.size());
    return "#" + std::to_string(len.size()) + len + payload;
}

std::unique_ptr<qn::emu::Emulator> StartEmulator(std::size_t points) {
    auto emu = std::make_unique<qn::emu::Emulator>("QDS4032A");
    emu->Start();
    emu->ServeWaveformData(WordBlock(points));
    return emu;
}

void BM_Fetch_Driver(benchmark::State& state) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    auto emu = StartEmulator(static_cast<std::size_t>(state.range(0)));
    auto driver = qn::com::MakeComObject<qn::Quorlen731XX>();
    qn::com::Bstr r("TCPIP0::127.0.0.1::" + std::to_string(emu->port()) + "::SOCKET"), o("");
    if (FAILED(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get())) ||
        FAILED(qn::Io(*driver.get()).SetIOTimeout(20000))) {
        state.SkipWithError("cannot open the session");
        return;
    }
    ComPtr<IQuorlen731XXMeasurement> m;
    qn::com::Bstr name("Channel1");
    static_cast<IQuorlen731XXMeasurements*>(driver.get())->get_Item(name.get(), m.Out());
    for (auto _ : state) {
        SAFEARRAY* a = nullptr;
        double x0 = 0, dx = 0;
        if (FAILED(m->FetchWaveform(&a, &x0, &dx))) {
            state.SkipWithError("fetch failed");
            break;
        }
        qn::com::SafeArray owner(a);
        benchmark::DoNotOptimize(owner.data<double>());
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    driver->Close();
}

// The least a client can do: one query, one block, one conversion.
class BareClient {
public:
    explicit BareClient(std::uint16_t port) {
        fd_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_in a{};
        a.sin_family = AF_INET;
        a.sin_port = htons(port);
        a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        int one = 1;
        ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        ok_ = ::connect(fd_, reinterpret_cast<sockaddr*>(&a), sizeof a) == 0;
    }
    ~BareClient() { ::close(fd_); }
    BareClient(const BareClient&) = delete;
    BareClient& operator=(const BareClient&) = delete;
    bool ok() const { return ok_; }

    bool ReadExactly(void* buf, std::size_t n) {
        auto* p = static_cast<char*>(buf);
        while (n > 0) {
            const ssize_t got = ::recv(fd_, p, n, 0);
            if (got <= 0) return false;
            p += got;
            n -= static_cast<std::size_t>(got);
        }
        return true;
    }
    // Fetches and converts one record; false on any protocol surprise.
    bool Fetch(const qn::WaveformScaling& s, std::vector<double>* out) {
        static const char kQuery[] = ":WAV:DATA?\n";
        if (::send(fd_, kQuery, sizeof kQuery - 1, 0) != sizeof kQuery - 1) return false;
        char head[2];
        if (!ReadExactly(head, 2) || head[0] != '#' || head[1] < '1' || head[1] > '9') return false;
        char digits[10] = {};
        if (!ReadExactly(digits, std::size_t(head[1] - '0'))) return false;
        const std::size_t bytes = std::strtoul(digits, nullptr, 10);
        std::vector<std::int16_t> raw(bytes / 2);
        char end;
        if (!ReadExactly(raw.data(), bytes) || !ReadExactly(&end, 1)) return false;
        for (auto& w : raw) w = static_cast<std::int16_t>(__builtin_bswap16(static_cast<std::uint16_t>(w)));
        out->resize(raw.size());
        qn::ConvertWords(raw.data(), raw.size(), s, out->data());
        return true;
    }

private:
    int fd_ = -1;
    bool ok_ = false;
};

void BM_Fetch_BareSocket(benchmark::State& state) {
    auto emu = StartEmulator(static_cast<std::size_t>(state.range(0)));
    BareClient client(emu->port());
    if (!client.ok()) {
        state.SkipWithError("cannot connect");
        return;
    }
    const qn::WaveformScaling s{0, 0, 0.25, 1.25e-4, 0};
    for (auto _ : state) {
        std::vector<double> out;  // a new result per fetch, as the driver returns
        if (!client.Fetch(s, &out)) {
            state.SkipWithError("fetch failed");
            break;
        }
        benchmark::DoNotOptimize(out.data());
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

BENCHMARK(BM_ConvertWords)->Arg(1 << 20)->Repetitions(kRepetitions)->ReportAggregatesOnly(true);
BENCHMARK(BM_CopyDoubles)->Arg(1 << 20)->Repetitions(kRepetitions)->ReportAggregatesOnly(true);
BENCHMARK(BM_Fetch_Driver)->Arg(1000000)->Arg(8000000)->Repetitions(kRepetitions)->ReportAggregatesOnly(true)
    ->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_Fetch_BareSocket)->Arg(1000000)->Arg(8000000)->Repetitions(kRepetitions)->ReportAggregatesOnly(true)
    ->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

int main(int argc, char** argv) {
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_ConvertWords/1048576", "BM_CopyDoubles/1048576", 2.5, 2.5},
         {"BM_Fetch_Driver/1000000", "BM_Fetch_BareSocket/1000000", 1.3, 0},
         {"BM_Fetch_Driver/8000000", "BM_Fetch_BareSocket/8000000", 1.2, 0}});
}
