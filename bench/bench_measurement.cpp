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
#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <string>

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

class BareClient {
  public:
    explicit BareClient(std::uint16_t port) {
        fd_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_in a{};
        a.sin_family = AF_INET;
        a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        a.sin_port = htons(port);
        ok_ = fd_ >= 0 && ::connect(fd_, reinterpret_cast<sockaddr*>(&a), sizeof a) == 0;
        int one = 1;
        if (ok_) ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
    }
    ~BareClient() {
        if (fd_ >= 0) ::close(fd_);
    }
    BareClient(const BareClient&) = delete;
    BareClient& operator=(const BareClient&) = delete;

    bool ok() const { return ok_; }
    bool Send(const std::string& s) {
        return ::send(fd_, s.data(), s.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(s.size());
    }
    bool ReadLine(std::string* line) {
        line->clear();
        char buf[256];
        for (;;) {
            ssize_t k = ::recv(fd_, buf, sizeof buf, 0);
            if (k <= 0) return false;
            line->append(buf, static_cast<std::size_t>(k));
            if (line->back() == '\n') return true;
        }
    }

  private:
    int fd_ = -1;
    bool ok_ = false;
};

// Both loopback cases measure the record of one acquisition.
bool Acquire(BareClient& c) {
    std::string reply;
    return c.Send(":DIG;*OPC?\n") && c.ReadLine(&reply);
}

void BM_Measure_BareSocket(benchmark::State& state) {
    BareClient c(TheEmulator().port());
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
    const std::string resource =
        "TCPIP0::127.0.0.1::" + std::to_string(TheEmulator().port()) + "::SOCKET";
    qn::com::Bstr r(resource), o("QueryInstrStatus=false");
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
