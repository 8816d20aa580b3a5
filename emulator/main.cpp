// qn731xx-emulator --model MODEL [--port N] [--log FILE]
//
// Serves the emulated instrument on 127.0.0.1 until SIGINT or SIGTERM. The first line on
// standard output is "listening on 127.0.0.1:PORT", so that a script can start it with port 0
// and read the port actually bound.
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>
#include <string_view>

#include "emulator/emulator.h"

namespace {

struct Arguments {
    std::string model;
    long port = 0;
    std::string log;
};

int Usage(const char* message) {
    std::fprintf(
        stderr,
        "qn731xx-emulator: %s\nusage: qn731xx-emulator --model MODEL [--port N] [--log FILE]\n",
        message);
    return 2;
}

bool ParsePort(const std::string& text, long& port) {
    char* end = nullptr;
    port = std::strtol(text.c_str(), &end, 10);
    return !text.empty() && *end == '\0' && port >= 0 && port <= 65535;
}

}  // namespace

int main(int argc, char** argv) {
    Arguments args;
    for (int i = 1; i < argc; ++i) {
        const std::string_view flag = argv[i];
        if (i + 1 >= argc) return Usage("missing value after an option");
        const std::string value = argv[++i];
        if (flag == "--model") {
            args.model = value;
        } else if (flag == "--port") {
            if (!ParsePort(value, args.port)) return Usage("--port needs a number from 0 to 65535");
        } else if (flag == "--log") {
            args.log = value;
        } else {
            return Usage("unknown option");
        }
    }
    if (args.model.empty()) return Usage("--model is required");

    // Block the stop signals in every thread; the main thread waits for them with sigwait.
    sigset_t stop_signals;
    sigemptyset(&stop_signals);
    sigaddset(&stop_signals, SIGINT);
    sigaddset(&stop_signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stop_signals, nullptr);

    try {
        qn::emu::Emulator emulator(args.model);
        if (!args.log.empty()) emulator.SetLogFile(args.log);
        const std::uint16_t port = emulator.Start(static_cast<std::uint16_t>(args.port));
        std::printf("listening on 127.0.0.1:%u\n", static_cast<unsigned>(port));
        std::fflush(stdout);
        int signal = 0;
        sigwait(&stop_signals, &signal);
        emulator.Stop();
    } catch (const std::exception& e) {
        std::fprintf(stderr, "qn731xx-emulator: %s\n", e.what());
        return 1;
    }
    return 0;
}
