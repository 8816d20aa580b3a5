// qn731xx list: the resources this machine can reach, found without being
// told: usbtmc instruments (sysfs), serial ports that exist and open, and
// with --lan the VXI-11 instruments that answer a portmapper GETPORT sent by
// UDP broadcast on the local networks (or to the addresses given).
#include "tools/list_command.h"

#include <arpa/inet.h>
#include <dirent.h>
#include <fcntl.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <set>
#include <string>
#include <vector>

#include "platform/visa/onc_rpc.h"
#include "platform/visa/usbtmc_device.h"
#include "tools/command_line.h"
#include "tools/json_output.h"

namespace qn::tools {
namespace {

constexpr std::uint32_t kVxi11CoreProgram = 0x0607AF;
constexpr std::uint32_t kVxi11CoreVersion = 1;
constexpr std::uint16_t kPortmapperPort = 111;

struct Found {
    std::string resource;
    std::string kind;  // "usb", "serial", "vxi11"
    std::string detail;
};

std::string Hex4(unsigned v) {
    char buf[8];
    std::snprintf(buf, sizeof buf, "0x%04X", v & 0xFFFF);
    return buf;
}

void FindUsb(const std::string& sysfs, const std::string& dev, std::vector<Found>* out) {
    for (const visa::UsbtmcEntry& e : visa::ListUsbtmcDevices(sysfs)) {
        // Without a serial number the device cannot be named by a resource.
        if (e.serial_number.empty()) continue;
        std::string r =
            "USB0::" + Hex4(e.vendor_id) + "::" + Hex4(e.product_id) + "::" + e.serial_number;
        if (e.interface_number != 0) r += "::" + std::to_string(e.interface_number);
        out->push_back({r + "::INSTR", "usb", dev + "/" + e.name});
    }
}

// Serial ports: ttyS<n> (ASRL<n+1>), ttyUSB<n> and ttyACM<n> (by path) that
// open as terminals; ttyS entries without a UART behind them fail to open.
void FindSerial(const std::string& dev, std::vector<Found>* out) {
    DIR* dir = ::opendir(dev.c_str());
    if (!dir) return;
    std::vector<std::string> names;
    while (const dirent* e = ::readdir(dir)) {
        const std::string n = e->d_name;
        for (const char* prefix : {"ttyS", "ttyUSB", "ttyACM"}) {
            const std::string p = prefix;
            if (n.size() > p.size() && n.compare(0, p.size(), p) == 0 &&
                std::all_of(n.begin() + long(p.size()), n.end(),
                            [](char c) { return std::isdigit(static_cast<unsigned char>(c)); }))
                names.push_back(n);
        }
    }
    ::closedir(dir);
    // ttyS2 before ttyS10: shorter names first.
    std::sort(names.begin(), names.end(), [](const std::string& a, const std::string& b) {
        return a.size() != b.size() ? a.size() < b.size() : a < b;
    });
    for (const std::string& n : names) {
        const std::string path = dev + "/" + n;
        const int fd = ::open(path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
        if (fd < 0) continue;
        const bool tty = ::isatty(fd);
        ::close(fd);
        if (!tty) continue;
        const bool numbered = n.compare(0, 4, "ttyS") == 0 && dev == "/dev";
        out->push_back({numbered ? "ASRL" + std::to_string(std::stoul(n.substr(4)) + 1) + "::INSTR"
                                 : "ASRL" + path + "::INSTR",
                        "serial", path});
    }
}

// "host[:port]" as an IPv4 address; port 111 when not given.
bool ParseTarget(const std::string& text, sockaddr_in* addr) {
    std::string host = text;
    unsigned long port = kPortmapperPort;
    if (auto colon = text.rfind(':'); colon != std::string::npos) {
        host = text.substr(0, colon);
        char* end = nullptr;
        port = std::strtoul(text.c_str() + colon + 1, &end, 10);
        if (*end != '\0' || port == 0 || port > 65535) return false;
    }
    *addr = sockaddr_in{};
    addr->sin_family = AF_INET;
    addr->sin_port = htons(std::uint16_t(port));
    return ::inet_pton(AF_INET, host.c_str(), &addr->sin_addr) == 1;
}

// The broadcast address of every IPv4 interface that has one.
std::vector<sockaddr_in> BroadcastTargets() {
    std::vector<sockaddr_in> targets;
    ifaddrs* list = nullptr;
    if (::getifaddrs(&list) != 0) return targets;
    for (ifaddrs* i = list; i; i = i->ifa_next) {
        if (!i->ifa_broadaddr || i->ifa_broadaddr->sa_family != AF_INET ||
            !(i->ifa_flags & IFF_BROADCAST) || !(i->ifa_flags & IFF_UP))
            continue;
        sockaddr_in a = *reinterpret_cast<const sockaddr_in*>(i->ifa_broadaddr);
        a.sin_port = htons(kPortmapperPort);
        targets.push_back(a);
    }
    ::freeifaddrs(list);
    return targets;
}

// Sends one GETPORT (VXI-11 core, TCP) to each target and collects the
// answers that name a port, until timeout_ms has passed.
int FindLan(const std::vector<sockaddr_in>& targets, int timeout_ms, std::vector<Found>* out) {
    const int fd = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd < 0) return errno;
    const int one = 1;
    ::setsockopt(fd, SOL_SOCKET, SO_BROADCAST, &one, sizeof one);
    const std::uint32_t xid = std::uint32_t(::getpid()) ^ 0x51AB0000u;
    rpc::XdrWriter args;
    args.U32(kVxi11CoreProgram);
    args.U32(kVxi11CoreVersion);
    args.U32(rpc::kProtocolTcp);
    args.U32(0);
    const std::string call = rpc::BuildCall(xid, rpc::kPortmapProgram, rpc::kPortmapVersion,
                                            rpc::kPortmapGetPort, args.data());
    int sent = 0;
    for (const sockaddr_in& t : targets)
        if (::sendto(fd, call.data(), call.size(), 0, reinterpret_cast<const sockaddr*>(&t),
                     sizeof t) == ssize_t(call.size()))
            ++sent;
    const int err = sent == 0 && !targets.empty() ? errno : 0;
    std::set<std::string> seen;
    const auto until = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeout_ms);
    while (sent > 0) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
            until - std::chrono::steady_clock::now());
        pollfd p{fd, POLLIN, 0};
        if (left.count() <= 0 || ::poll(&p, 1, int(left.count())) <= 0) break;
        char buf[512];
        sockaddr_in from{};
        socklen_t len = sizeof from;
        const ssize_t n =
            ::recvfrom(fd, buf, sizeof buf, 0, reinterpret_cast<sockaddr*>(&from), &len);
        if (n <= 0) continue;
        std::uint32_t got_xid = 0;
        rpc::AcceptStat stat{};
        std::string_view results;
        std::uint32_t port = 0;
        if (rpc::ParseReply(std::string_view(buf, std::size_t(n)), &got_xid, &stat, &results) !=
                rpc::ReplyStatus::kAccepted ||
            got_xid != xid || stat != rpc::kSuccess || !rpc::XdrReader(results).U32(&port) ||
            port == 0 || port > 65535)
            continue;
        char host[INET_ADDRSTRLEN] = {};
        ::inet_ntop(AF_INET, &from.sin_addr, host, sizeof host);
        if (!seen.insert(host).second) continue;
        // A portmapper on its standard port finds the instrument again later;
        // elsewhere the resource names the core channel's port itself.
        const bool standard = ntohs(from.sin_port) == kPortmapperPort;
        const std::string r = std::string("TCPIP0::") + host +
                              (standard ? "" : ":" + std::to_string(port)) + "::inst0::INSTR";
        out->push_back({r, "vxi11", std::string(host) + ":" + std::to_string(port)});
    }
    ::close(fd);
    return err;
}

}  // namespace

int ListCommand(std::span<char*> argv) {
    auto app =
        CommandApp("list", "Print the instrument resources this machine can reach.", nullptr);
    bool lan = false, json = false;
    std::vector<std::string> addresses;
    int timeout_ms = 1000;
    std::string sysfs = "/sys", dev = "/dev";
    app->add_flag("--lan", lan,
                  "also ask the local networks for VXI-11 instruments (UDP broadcast to port 111)");
    app->add_option("--lan-address", addresses,
                    "ask ADDR[:PORT] instead of broadcasting (IPv4, port 111 by default)");
    app->add_option("--timeout", timeout_ms, "how long to wait for LAN answers, ms")
        ->capture_default_str()
        ->check(CLI::Range(1, 60000));
    app->add_flag("--json", json, "print one JSON object");
    app->add_option("--sysfs", sysfs, "where sysfs is mounted")->capture_default_str();
    app->add_option("--dev", dev, "where the device nodes are")->capture_default_str();
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    if (!addresses.empty() && !lan) {
        std::fprintf(stderr, "qn731xx list: --lan-address needs --lan\n");
        return 2;
    }
    std::vector<sockaddr_in> targets;
    for (const std::string& a : addresses) {
        sockaddr_in t{};
        if (!ParseTarget(a, &t)) {
            std::fprintf(stderr, "qn731xx list: '%s' is not an IPv4 ADDR[:PORT]\n", a.c_str());
            return 2;
        }
        targets.push_back(t);
    }
    if (lan && addresses.empty()) targets = BroadcastTargets();

    std::vector<Found> found;
    FindUsb(sysfs, dev, &found);
    FindSerial(dev, &found);
    if (lan) {
        if (int err = FindLan(targets, timeout_ms, &found))
            std::fprintf(stderr, "qn731xx list: LAN query not sent: %s\n", std::strerror(err));
    }
    if (json) {
        Json list = Json::array();
        for (const Found& f : found)
            list.push_back({{"resource", f.resource}, {"kind", f.kind}, {"where", f.detail}});
        PrintJson({{"resources", list}});
    } else {
        for (const Found& f : found) std::printf("%s\n", f.resource.c_str());
    }
    return 0;
}

}  // namespace qn::tools
