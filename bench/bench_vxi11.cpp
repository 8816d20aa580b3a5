// VXI-11 against the raw socket (cases in transport_bench.h), side by side in
// one run; the ratios are VXI-11 time / raw-socket time of the same case.
// With QN_BENCH_VXI11_RESOURCE set, the VXI-11 "*IDN?" case talks to that
// resource instead (bench/vxi11_pyvisa.py uses it to time this client and
// pyvisa-py against one server).
#include <cstdlib>

#include "bench/loopback.h"
#include "bench/ratio_reporter.h"
#include "bench/transport_bench.h"

namespace {

using namespace qn::bench;

std::string Vxi11Resource() {
    if (const char* r = std::getenv("QN_BENCH_VXI11_RESOURCE")) return r;
    return "TCPIP0::127.0.0.1:" + std::to_string(TheEmulator().vxi11_port()) + "::inst0::INSTR";
}

std::string Socket() {
    return SocketResource(TheEmulator().port());
}

void BM_Idn_Socket(benchmark::State& s) {
    IdnCase(s, Socket(), true);
}
void BM_Idn_Vxi11(benchmark::State& s) {
    IdnCase(s, Vxi11Resource(), false);
}
void BM_Block_Socket(benchmark::State& s) {
    BlockCase(s, Socket(), true);
}
void BM_Block_Vxi11(benchmark::State& s) {
    BlockCase(s, Vxi11Resource(), false);
}

BENCHMARK(BM_Idn_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Idn_Vxi11)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Vxi11)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_Idn_Vxi11", "BM_Idn_Socket"}, {"BM_Block_Vxi11", "BM_Block_Socket", 1.5}});
}
