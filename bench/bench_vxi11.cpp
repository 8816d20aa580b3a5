// VXI-11 against the raw socket, both served by the emulator in this process:
// - "*IDN?" round trip through IMessage (WriteString + ReadString);
// - a 2,000,000-byte definite-length block through
//   IFormattedIO488Direct::ReadIEEEBlockInto into a reused buffer.
// The ratios are VXI-11 time / raw-socket time of the same case. With
// QN_BENCH_VXI11_RESOURCE set, the VXI-11 "*IDN?" case talks to that resource
// instead (bench/vxi11_pyvisa.py uses it to time this client and pyvisa-py
// against one server).
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "bench/loopback.h"
#include "bench/ratio_reporter.h"
#include "emulator/emulator.h"
#include "platform/visa/visa.h"

namespace {

constexpr std::size_t kBlockBytes = 2000000;

qn::emu::Emulator& TheEmulator() {
    static qn::emu::Emulator* emu = [] {
        auto* e = new qn::emu::Emulator("QDS4032A");
        e->EnableVxi11();
        e->Start();
        std::string block = "#7" + std::to_string(kBlockBytes);
        for (std::size_t i = 0; i < kBlockBytes; ++i) block += char(i * 7);  // line feeds too
        e->ServeWaveformData(std::move(block));
        e->SetLogLimit(16);
        return e;
    }();
    return *emu;
}

std::string Resource(bool vxi11) {
    if (vxi11) {
        if (const char* r = std::getenv("QN_BENCH_VXI11_RESOURCE")) return r;
        return "TCPIP0::127.0.0.1:" + std::to_string(TheEmulator().vxi11_port()) +
               "::inst0::INSTR";
    }
    return qn::bench::SocketResource(TheEmulator().port());
}

ComPtr<IMessage> Open(bool vxi11) {
    ComPtr<IResourceManager> rm;
    qn::visa::CreateResourceManager(rm.Out());
    ComPtr<IVisaSession> s;
    rm->Open(qn::com::Bstr(Resource(vxi11)).get(), qn::visa::kNoLock, 2000, nullptr, s.Out());
    ComPtr<IMessage> msg;
    if (s) s.As(msg);
    // Sockets end messages at the line feed; VXI-11 at END.
    if (msg && !vxi11) msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
    return msg;
}

void Idn(benchmark::State& state, bool vxi11) {
    auto msg = Open(vxi11);
    if (!msg) return state.SkipWithError("open failed");
    qn::com::Bstr query("*IDN?\n");
    for (auto _ : state) {
        LONG written = 0;
        msg->WriteString(query.get(), &written);
        qn::com::Bstr reply;
        if (FAILED(msg->ReadString(1024, reply.Out()))) state.SkipWithError("read failed");
    }
}

void Block(benchmark::State& state, bool vxi11) {
    auto msg = Open(vxi11);
    if (!msg) return state.SkipWithError("open failed");
    ComPtr<IFormattedIO488> io;
    qn::visa::CreateFormattedIO488(io.Out());
    io->put_IO(msg.get());
    ComPtr<IFormattedIO488Direct> direct;
    io.As(direct);
    const qn::com::Bstr query(":WAV:DATA?\n");
    std::vector<BYTE> dst(kBlockBytes);
    for (auto _ : state) {
        LONG written = 0, actual = 0;
        msg->WriteString(query.get(), &written);
        if (FAILED(direct->ReadIEEEBlockInto(qn::visa::BinaryType_UI1, dst.data(),
                                             LONG(dst.size()), &actual, VARIANT_FALSE,
                                             VARIANT_TRUE)))
            state.SkipWithError("block read failed");
    }
    state.SetBytesProcessed(state.iterations() * std::int64_t(kBlockBytes));
}

void BM_Idn_Socket(benchmark::State& s) { Idn(s, false); }
void BM_Idn_Vxi11(benchmark::State& s) { Idn(s, true); }
void BM_Block_Socket(benchmark::State& s) { Block(s, false); }
void BM_Block_Vxi11(benchmark::State& s) { Block(s, true); }

BENCHMARK(BM_Idn_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Idn_Vxi11)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Vxi11)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    return qn::bench::RunWithRatios(argc, argv,
                                    {{"BM_Idn_Vxi11", "BM_Idn_Socket"},
                                     {"BM_Block_Vxi11", "BM_Block_Socket", 1.5}});
}
