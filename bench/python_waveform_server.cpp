// The emulator serving one pre-built word record of N points for :WAV:DATA?,
// for the Python benchmark (bench_python.py): prints "listening on
// 127.0.0.1:PORT" and serves until its standard input closes.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <string>

#include "emulator/emulator.h"

namespace {

// n big-endian 16-bit words spanning most of the code range, as a definite-length block.
std::string WordBlock(std::size_t n) {
    std::string payload(2 * n, '\0');
    for (std::size_t i = 0; i < n; ++i) {
        const auto w = static_cast<std::uint16_t>(static_cast<std::int16_t>((i * 7919) % 60000) - 30000);
        payload[2 * i] = static_cast<char>(w >> 8);
        payload[2 * i + 1] = static_cast<char>(w & 0xFF);
    }
    const std::string len = std::to_string(payload.size());
    return "#" + std::to_string(len.size()) + len + payload;
}

}  // namespace

int main(int argc, char** argv) {
    const std::size_t points = argc > 1 ? std::strtoul(argv[1], nullptr, 10) : 1000000;
    qn::emu::Emulator emu("QDS4032A");
    const std::uint16_t port = emu.Start();
    emu.ServeWaveformData(WordBlock(points));
    std::printf("listening on 127.0.0.1:%u\n", static_cast<unsigned>(port));
    std::fflush(stdout);
    std::string line;
    while (std::getline(std::cin, line)) {
    }
    emu.Stop();
    return 0;
}
