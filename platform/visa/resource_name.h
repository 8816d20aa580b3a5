// Parsing of VISA resource strings into their parts. A pure function: no I/O,
// no name resolution. Keywords (TCPIP, ASRL, USB, GPIB, INSTR, SOCKET) are
// matched without regard to case; host names, device names and serial
// numbers keep theirs. Accepted forms ([n] is an optional board number):
//
//   TCPIP[n]::host::port::SOCKET
//   TCPIP[n]::host[:port][::device][::INSTR]   device defaults to "inst0"; port:
//                                              the VXI-11 core channel, else the portmapper's;
//                                              device "hislip<n>[,port]": HiSLIP (port 4880)
//   ASRL[n][::INSTR]  and  ASRL/dev/path[::INSTR]
//   USB[n]::vid::pid::serial[::interface][::INSTR]   vid, pid: 0x hex or decimal
//   GPIB[n]::primary[::secondary][::INSTR]     addresses 0..30
//
// An IPv6 host is written in brackets: TCPIP::[::1]::5025::SOCKET.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qn::visa {

struct ResourceName {
    int interface_type = 0;  // HardwareInterfaceType: 1 GPIB, 4 ASRL, 6 TCPIP, 7 USB
    unsigned board = 0;
    std::string resource_class;  // "INSTR" or "SOCKET"
    // TCPIP
    std::string host;         // without IPv6 brackets
    std::uint16_t port = 0;   // SOCKET; INSTR when given after the host (0: not given)
    std::string device_name;  // INSTR only ("inst0", "hislip0", ...)
    // ASRL
    std::string device_path;  // "/dev/ttyUSB0" for ASRL/dev/...; empty for ASRLn
    // USB
    std::uint16_t vendor_id = 0;
    std::uint16_t product_id = 0;
    std::string serial_number;
    int usb_interface = -1;  // -1: not given
    // GPIB
    int primary_address = -1;
    int secondary_address = -1;  // -1: none

    // The canonical spelling: upper-case keywords, explicit board number.
    std::string Canonical() const;
};

// The parsed resource, or nullopt with *error (may be null) saying what is
// wrong. Never throws for any input (std::bad_alloc aside).
std::optional<ResourceName> ParseResourceName(std::string_view text, std::string* error = nullptr);

}  // namespace qn::visa
