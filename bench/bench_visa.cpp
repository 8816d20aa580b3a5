// VISA layer against bare sockets, with a minimal loopback instrument:
// - "*IDN?" round trip through IMessage::WriteString + ReadString vs a bare
//   socket write + read of the same bytes;
// - definite-length block reads (2,000,000 and 16,000,000 bytes) through
//   IFormattedIO488::ReadIEEEBlock (SAFEARRAY), through the direct path
//   IFormattedIO488Direct::ReadIEEEBlockInto, and through a bare socket
//   reading into a reused buffer.
// Compare the medians of the same size: the ratio is VISA time / bare time.
#include <benchmark/benchmark.h>

#include <cstring>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "bench/loopback.h"
#include "platform/visa/visa.h"

namespace {

const char kIdn[] = "QUORLEN,731XX,SN000001,1.3.20\n";

// The instrument: answers "*IDN?" and "BLK? <bytes>" on every connection.
class Server {
  public:
    Server() {
        fd_ = qn::bench::ListenLoopback(&port_);
        std::thread([this] { AcceptLoop(); }).detach();
    }
    std::uint16_t port() const { return port_; }
    std::string Resource() const { return qn::bench::SocketResource(port_); }

  private:
    void AcceptLoop() {
        for (;;) {
            int c = ::accept4(fd_, nullptr, nullptr, SOCK_CLOEXEC);
            if (c < 0) continue;
            int one = 1;
            ::setsockopt(c, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            std::thread([this, c] { Serve(c); }).detach();
        }
    }
    const std::string& BlockReply(std::size_t n) {
        std::lock_guard<std::mutex> lock(m_);
        std::string& r = blocks_[n];
        if (r.empty()) {
            char head[16];
            std::snprintf(head, sizeof head, "#9%09zu", n);
            r = head;
            for (std::size_t i = 0; i < n; ++i) r += char(i * 7);  // line feeds included
            r += '\n';
        }
        return r;
    }
    void Serve(int c) {
        std::string in;
        char buf[4096];
        for (;;) {
            std::size_t nl;
            while ((nl = in.find('\n')) == std::string::npos) {
                ssize_t k = ::recv(c, buf, sizeof buf, 0);
                if (k <= 0) {
                    ::close(c);
                    return;
                }
                in.append(buf, std::size_t(k));
            }
            std::string line = in.substr(0, nl);
            in.erase(0, nl + 1);
            if (line == "*IDN?") {
                qn::bench::SendAll(c, kIdn, sizeof kIdn - 1);
            } else if (line.rfind("BLK? ", 0) == 0) {
                const std::string& r = BlockReply(std::stoul(line.substr(5)));
                qn::bench::SendAll(c, r.data(), r.size());
            }
        }
    }

    int fd_ = -1;
    std::uint16_t port_ = 0;
    std::mutex m_;
    std::map<std::size_t, std::string> blocks_;
};

Server& TheServer() {
    static Server s;
    return s;
}

// The bare block read: "#9<len><data>\n" into dst (room for len bytes), the
// header through a small buffer and the data straight into the destination;
// returns len.
std::size_t ReadBlock(int fd, char* dst) {
    char head[4096];
    std::size_t have = 0;
    while (have < 11) have += std::size_t(::recv(fd, head + have, sizeof head - have, 0));
    std::size_t len = std::stoul(std::string(head + 2, 9));
    std::size_t extra = std::min(have - 11, len + 1);
    std::memcpy(dst, head + 11, std::min(extra, len));
    std::size_t got = extra;
    while (got < len) got += std::size_t(::recv(fd, dst + got, len - got, 0));
    if (got == len) {
        char nl;
        ::recv(fd, &nl, 1, 0);
    }
    return len;
}

ComPtr<IMessage> OpenSession() {
    ComPtr<IResourceManager> rm;
    qn::visa::CreateResourceManager(rm.Out());
    ComPtr<IVisaSession> s;
    rm->Open(qn::com::Bstr(TheServer().Resource()).get(), 0, 2000, nullptr, s.Out());
    ComPtr<IMessage> msg;
    s.As(msg);
    msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
    msg->put_Timeout(10000);
    return msg;
}

void BM_Idn_BareSocket(benchmark::State& state) {
    qn::bench::LineClient c(TheServer().port());
    std::string line;
    for (auto _ : state) {
        c.Send("*IDN?\n");
        benchmark::DoNotOptimize(c.ReadLine(&line));
    }
}

void BM_Idn_IMessage(benchmark::State& state) {
    auto msg = OpenSession();
    qn::com::Bstr query("*IDN?\n");
    for (auto _ : state) {
        LONG written = 0;
        msg->WriteString(query.get(), &written);
        qn::com::Bstr reply;
        if (FAILED(msg->ReadString(1024, reply.Out()))) state.SkipWithError("read failed");
    }
}

void BM_Block_BareSocket(benchmark::State& state) {
    qn::bench::LineClient c(TheServer().port());
    const std::string query = "BLK? " + std::to_string(state.range(0)) + "\n";
    std::vector<char> dst(std::size_t(state.range(0)));
    for (auto _ : state) {
        c.Send(query);
        benchmark::DoNotOptimize(ReadBlock(c.fd(), dst.data()));
    }
    state.SetBytesProcessed(state.iterations() * state.range(0));
}

void BM_Block_FormattedSafeArray(benchmark::State& state) {
    auto msg = OpenSession();
    ComPtr<IFormattedIO488> io;
    qn::visa::CreateFormattedIO488(io.Out());
    io->put_IO(msg.get());
    const qn::com::Bstr query("BLK? " + std::to_string(state.range(0)) + "\n");
    for (auto _ : state) {
        LONG written = 0;
        msg->WriteString(query.get(), &written);
        qn::com::Variant v;
        if (FAILED(io->ReadIEEEBlock(qn::visa::BinaryType_UI1, VARIANT_FALSE, VARIANT_TRUE, &v)))
            state.SkipWithError("block read failed");
    }
    state.SetBytesProcessed(state.iterations() * state.range(0));
}

void BM_Block_FormattedDirect(benchmark::State& state) {
    auto msg = OpenSession();
    ComPtr<IFormattedIO488> io;
    qn::visa::CreateFormattedIO488(io.Out());
    io->put_IO(msg.get());
    ComPtr<IFormattedIO488Direct> direct;
    io.As(direct);
    const qn::com::Bstr query("BLK? " + std::to_string(state.range(0)) + "\n");
    std::vector<BYTE> dst(std::size_t(state.range(0)));
    for (auto _ : state) {
        LONG written = 0, actual = 0;
        msg->WriteString(query.get(), &written);
        if (FAILED(direct->ReadIEEEBlockInto(qn::visa::BinaryType_UI1, dst.data(), LONG(dst.size()),
                                             &actual, VARIANT_FALSE, VARIANT_TRUE)))
            state.SkipWithError("block read failed");
    }
    state.SetBytesProcessed(state.iterations() * state.range(0));
}

void Sizes(benchmark::internal::Benchmark* b) {
    b->Arg(2000000)->Arg(16000000)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
}

BENCHMARK(BM_Idn_BareSocket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Idn_IMessage)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_BareSocket)->Apply(Sizes);
BENCHMARK(BM_Block_FormattedSafeArray)->Apply(Sizes);
BENCHMARK(BM_Block_FormattedDirect)->Apply(Sizes);

}  // namespace

BENCHMARK_MAIN();
