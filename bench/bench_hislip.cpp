// HiSLIP against the raw socket (cases in transport_bench.h), side by side in
// one run; the ratios are HiSLIP time / raw-socket time of the same case.
#include "bench/loopback.h"
#include "bench/ratio_reporter.h"
#include "bench/transport_bench.h"

namespace {

using namespace qn::bench;

std::string HislipResource() {
    return "TCPIP0::127.0.0.1::hislip0," + std::to_string(TheEmulator().hislip_port()) + "::INSTR";
}

std::string Socket() {
    return SocketResource(TheEmulator().port());
}

void BM_Idn_Socket(benchmark::State& s) {
    IdnCase(s, Socket(), true);
}
void BM_Idn_Hislip(benchmark::State& s) {
    IdnCase(s, HislipResource(), false);
}
void BM_Block_Socket(benchmark::State& s) {
    BlockCase(s, Socket(), true);
}
void BM_Block_Hislip(benchmark::State& s) {
    BlockCase(s, HislipResource(), false);
}

BENCHMARK(BM_Idn_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Idn_Hislip)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Socket)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);
BENCHMARK(BM_Block_Hislip)->UseRealTime()->Repetitions(7)->ReportAggregatesOnly(true);

}  // namespace

int main(int argc, char** argv) {
    return qn::bench::RunWithRatios(
        argc, argv,
        {{"BM_Idn_Hislip", "BM_Idn_Socket"}, {"BM_Block_Hislip", "BM_Block_Socket", 1.5}});
}
