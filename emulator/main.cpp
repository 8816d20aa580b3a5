// qn731xx-emulator --model MODEL [--port N] [--vxi11 [--portmapper [PORT]]] [--hislip] [--serial]
//                  [--idle-timeout MS] [--log FILE]
//
// Serves the emulated instrument on 127.0.0.1 until SIGINT or SIGTERM. The first line on
// standard output is "listening on 127.0.0.1:PORT" (the raw socket), so that a script can start
// it with port 0 and read the port actually bound; then one line per other server:
// "vxi11 listening on 127.0.0.1:PORT", "portmapper listening on 127.0.0.1:PORT",
// "hislip listening on 127.0.0.1:PORT" and "serial listening on /dev/pts/N".
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <optional>
#include <string>
#include <string_view>

#include "emulator/emulator.h"
#include "emulator/serial_line.h"

namespace {

struct Arguments {
    std::string model;
    long port = 0;
    std::string log;
    bool vxi11 = false;
    bool hislip = false;
    bool serial = false;
    long portmapper = -1;  // -1: none
    long idle_ms = 0;
};

int Usage(const char* message) {
    std::fprintf(
        stderr,
        "qn731xx-emulator: %s\nusage: qn731xx-emulator --model MODEL [--port N] [--vxi11 "
        "[--portmapper [PORT]]] [--hislip] [--serial] [--idle-timeout MS] [--log FILE]\n",
        message);
    return 2;
}

bool ParseNumber(const std::string& text, long max, long& value) {
    char* end = nullptr;
    value = std::strtol(text.c_str(), &end, 10);
    return !text.empty() && *end == '\0' && value >= 0 && value <= max;
}

bool ParsePort(const std::string& text, long& port) {
    return ParseNumber(text, 65535, port);
}

}  // namespace

int main(int argc, char** argv) {
    Arguments args;
    for (int i = 1; i < argc; ++i) {
        const std::string_view flag = argv[i];
        if (flag == "--vxi11") {
            args.vxi11 = true;
            continue;
        }
        if (flag == "--hislip") {
            args.hislip = true;
            continue;
        }
        if (flag == "--serial") {
            args.serial = true;
            continue;
        }
        if (flag == "--portmapper") {
            // The port is optional: 111 unless a number follows.
            args.portmapper = 111;
            if (i + 1 < argc && argv[i + 1][0] != '-' && !ParsePort(argv[++i], args.portmapper))
                return Usage("--portmapper takes a port number from 0 to 65535");
            continue;
        }
        if (i + 1 >= argc) return Usage("missing value after an option");
        const std::string value = argv[++i];
        if (flag == "--model") {
            args.model = value;
        } else if (flag == "--port") {
            if (!ParsePort(value, args.port)) return Usage("--port needs a number from 0 to 65535");
        } else if (flag == "--idle-timeout") {
            if (!ParseNumber(value, 86400000, args.idle_ms))
                return Usage("--idle-timeout needs milliseconds from 0 to 86400000");
        } else if (flag == "--log") {
            args.log = value;
        } else {
            return Usage("unknown option");
        }
    }
    if (args.model.empty()) return Usage("--model is required");
    if (args.portmapper >= 0 && !args.vxi11) return Usage("--portmapper needs --vxi11");

    // Block the stop signals in every thread; the main thread waits for them with sigwait.
    sigset_t stop_signals;
    sigemptyset(&stop_signals);
    sigaddset(&stop_signals, SIGINT);
    sigaddset(&stop_signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stop_signals, nullptr);

    try {
        qn::emu::Emulator emulator(args.model);
        if (!args.log.empty()) emulator.SetLogFile(args.log);
        if (args.vxi11) emulator.EnableVxi11();
        if (args.hislip) emulator.EnableHislip();
        if (args.portmapper >= 0)
            emulator.EnablePortmapper(static_cast<std::uint16_t>(args.portmapper));
        emulator.SetIdleTimeout(std::chrono::milliseconds(args.idle_ms));
        const std::uint16_t port = emulator.Start(static_cast<std::uint16_t>(args.port));
        std::printf("listening on 127.0.0.1:%u\n", static_cast<unsigned>(port));
        if (args.vxi11)
            std::printf("vxi11 listening on 127.0.0.1:%u\n",
                        static_cast<unsigned>(emulator.vxi11_port()));
        if (args.portmapper >= 0)
            std::printf("portmapper listening on 127.0.0.1:%u\n",
                        static_cast<unsigned>(emulator.portmapper_port()));
        if (args.hislip)
            std::printf("hislip listening on 127.0.0.1:%u\n",
                        static_cast<unsigned>(emulator.hislip_port()));
        std::optional<qn::emu::SerialLine> line;
        if (args.serial) {
            line.emplace(emulator);
            std::printf("serial listening on %s\n", line->path().c_str());
        }
        std::fflush(stdout);
        int signal = 0;
        sigwait(&stop_signals, &signal);
        line.reset();
        emulator.Stop();
    } catch (const std::exception& e) {
        std::fprintf(stderr, "qn731xx-emulator: %s\n", e.what());
        return 1;
    }
    return 0;
}
