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
#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <memory>
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
    bool Send(const char* s, std::size_t n) {
        return ::send(fd_, s, n, MSG_NOSIGNAL) == static_cast<ssize_t>(n);
    }
    // Appends to `line` up to and including the line feed; false on EOF/error.
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

void BM_Query_BareSocket(benchmark::State& state) {
    TheEmulator().ClearReceivedMessages();
    BareClient c(TheEmulator().port());
    if (!c.ok()) {
        state.SkipWithError("connect failed");
        return;
    }
    static const char kQuery[] = "*IDN?\n";
    std::string reply;
    for (auto _ : state) {
        if (!c.Send(kQuery, sizeof kQuery - 1) || !c.ReadLine(&reply)) {
            state.SkipWithError("query failed");
            break;
        }
        benchmark::DoNotOptimize(reply.data());
    }
}

void BM_Query_Driver(benchmark::State& state) {
    TheEmulator().ClearReceivedMessages();
    auto driver = qn::com::MakeComObject<qn::Quorlen731XX>();
    const std::string resource =
        "TCPIP0::127.0.0.1::" + std::to_string(TheEmulator().port()) + "::SOCKET";
    qn::com::Bstr r(resource), o("QueryInstrStatus=false");
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
