#include "platform/visa/resource_name.h"

#include <charconv>
#include <utility>
#include <vector>

namespace qn::visa {
namespace {

using Fields = std::vector<std::string_view>;

bool IEquals(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        char x = a[i], y = b[i];
        if (x >= 'a' && x <= 'z') x = char(x - 32);
        if (y >= 'a' && y <= 'z') y = char(y - 32);
        if (x != y) return false;
    }
    return true;
}

bool IStartsWith(std::string_view s, std::string_view prefix) {
    return s.size() >= prefix.size() && IEquals(s.substr(0, prefix.size()), prefix);
}

// Splits at "::", except inside [...] (IPv6 literals contain "::").
std::optional<Fields> Split(std::string_view s) {
    Fields out;
    std::size_t start = 0;
    bool bracket = false;
    for (std::size_t i = 0; i < s.size(); ++i) {
        if (s[i] == '[') {
            if (bracket) return std::nullopt;
            bracket = true;
        } else if (s[i] == ']') {
            if (!bracket) return std::nullopt;
            bracket = false;
        } else if (!bracket && s[i] == ':' && i + 1 < s.size() && s[i + 1] == ':') {
            out.push_back(s.substr(start, i - start));
            start = i + 2;
            ++i;
        }
    }
    if (bracket) return std::nullopt;
    out.push_back(s.substr(start));
    // ":::" has no single reading: a field may not begin or end with ':'.
    for (std::string_view f : out)
        if (!f.empty() && (f.front() == ':' || f.back() == ':')) return std::nullopt;
    return out;
}

// Unsigned decimal (or 0x hex when hex_ok) no larger than max.
std::optional<unsigned> Number(std::string_view s, unsigned max, bool hex_ok = false) {
    int base = 10;
    if (hex_ok && s.size() > 2 && s[0] == '0' && (s[1] == 'x' || s[1] == 'X')) {
        s.remove_prefix(2);
        base = 16;
    }
    if (s.empty() || s.size() > 10) return std::nullopt;
    unsigned v = 0;
    auto [end, ec] = std::from_chars(s.data(), s.data() + s.size(), v, base);
    if (ec != std::errc() || end != s.data() + s.size() || v > max) return std::nullopt;
    return v;
}

bool PrintableField(std::string_view s) {
    if (s.empty()) return false;
    for (char c : s)
        if (static_cast<unsigned char>(c) <= ' ' || c == 0x7f) return false;
    return true;
}

// Removes a trailing resource class keyword; returns it, or "" when absent.
std::string_view PopClass(Fields& f) {
    if (f.size() > 1 && (IEquals(f.back(), "INSTR") || IEquals(f.back(), "SOCKET"))) {
        std::string_view c = IEquals(f.back(), "INSTR") ? "INSTR" : "SOCKET";
        f.pop_back();
        return c;
    }
    return "";
}

using Parser = bool (*)(std::string_view board, Fields f, ResourceName& r, std::string& err);

bool Board(std::string_view s, ResourceName& r, std::string& err) {
    if (s.empty()) return true;
    auto n = Number(s, 65535);
    if (!n) {
        err = "invalid board number '" + std::string(s) + "'";
        return false;
    }
    r.board = *n;
    return true;
}

bool ParseTcpip(std::string_view board, Fields f, ResourceName& r, std::string& err) {
    if (!Board(board, r, err)) return false;
    std::string_view cls = PopClass(f);
    if (f.size() < 2 || !PrintableField(f[1])) {
        err = "missing or invalid host";
        return false;
    }
    std::string_view host = f[1];
    // An INSTR resource may name the port of its server after the host
    // ("host:port", "[v6]:port"): the VXI-11 core channel without asking the
    // portmapper.
    std::string_view port_text;
    if (cls != "SOCKET") {
        const std::size_t colon = host.rfind(':');
        const bool v6 = host.front() == '[';
        if (colon != std::string_view::npos && (v6 ? colon > 0 && host[colon - 1] == ']'
                                                   : host.find(':') == colon)) {
            port_text = host.substr(colon + 1);
            host = host.substr(0, colon);
            auto port = Number(port_text, 65535);
            if (!port || *port == 0 || host.empty()) {
                err = "invalid port after the host (host:port, port 1..65535)";
                return false;
            }
            r.port = std::uint16_t(*port);
        }
    }
    if (host.front() == '[') {
        if (host.back() != ']' || host.size() < 3) {
            err = "invalid IPv6 host";
            return false;
        }
        host = host.substr(1, host.size() - 2);
    } else if (host.find_first_of("[]") != std::string_view::npos) {
        err = "invalid host";
        return false;
    }
    r.host = std::string(host);
    if (cls == "SOCKET") {
        auto port = f.size() == 3 ? Number(f[2], 65535) : std::nullopt;
        if (!port || *port == 0) {
            err = "SOCKET resource needs a port number 1..65535";
            return false;
        }
        r.port = std::uint16_t(*port);
        r.resource_class = "SOCKET";
        return true;
    }
    if (f.size() > 3 || (f.size() == 3 && !PrintableField(f[2]))) {
        err = "invalid TCPIP INSTR resource";
        return false;
    }
    r.device_name = f.size() == 3 ? std::string(f[2]) : "inst0";
    r.resource_class = "INSTR";
    return true;
}

bool ParseAsrl(std::string_view board, Fields f, ResourceName& r, std::string& err) {
    std::string_view cls = PopClass(f);
    if (cls == "SOCKET" || f.size() != 1) {
        err = "serial resource is ASRL<n>[::INSTR] or ASRL/dev/<path>[::INSTR]";
        return false;
    }
    if (!board.empty() && board.front() == '/') {
        if (board.size() < 2 || !PrintableField(board)) {
            err = "invalid serial device path";
            return false;
        }
        r.device_path = std::string(board);
    } else if (!Board(board, r, err)) {
        return false;
    }
    r.resource_class = "INSTR";
    return true;
}

bool ParseUsb(std::string_view board, Fields f, ResourceName& r, std::string& err) {
    if (!Board(board, r, err)) return false;
    std::string_view cls = PopClass(f);
    auto vid = f.size() >= 4 ? Number(f[1], 0xffff, true) : std::nullopt;
    auto pid = f.size() >= 4 ? Number(f[2], 0xffff, true) : std::nullopt;
    if (cls == "SOCKET" || f.size() < 4 || f.size() > 5 || !vid || !pid || !PrintableField(f[3])) {
        err = "USB resource is USB<n>::vid::pid::serial[::interface][::INSTR]";
        return false;
    }
    r.vendor_id = std::uint16_t(*vid);
    r.product_id = std::uint16_t(*pid);
    r.serial_number = std::string(f[3]);
    if (f.size() == 5) {
        auto intf = Number(f[4], 255);
        if (!intf) {
            err = "invalid USB interface number";
            return false;
        }
        r.usb_interface = int(*intf);
    }
    r.resource_class = "INSTR";
    return true;
}

bool ParseGpib(std::string_view board, Fields f, ResourceName& r, std::string& err) {
    if (!Board(board, r, err)) return false;
    std::string_view cls = PopClass(f);
    auto primary = f.size() >= 2 ? Number(f[1], 30) : std::nullopt;
    auto secondary = f.size() == 3 ? Number(f[2], 30) : std::nullopt;
    if (cls == "SOCKET" || f.size() < 2 || f.size() > 3 || !primary ||
        (f.size() == 3 && !secondary)) {
        err = "GPIB resource is GPIB<n>::primary[::secondary][::INSTR], addresses 0..30";
        return false;
    }
    r.primary_address = int(*primary);
    r.secondary_address = secondary ? int(*secondary) : -1;
    r.resource_class = "INSTR";
    return true;
}

struct Kind {
    std::string_view keyword;
    int interface_type;
    Parser parse;
};

constexpr Kind kKinds[] = {
    {"TCPIP", 6, ParseTcpip},
    {"ASRL", 4, ParseAsrl},
    {"USB", 7, ParseUsb},
    {"GPIB", 1, ParseGpib},
};

std::string_view Trim(std::string_view s) {
    while (!s.empty() && (s.front() == ' ' || s.front() == '\t')) s.remove_prefix(1);
    while (!s.empty() && (s.back() == ' ' || s.back() == '\t')) s.remove_suffix(1);
    return s;
}

std::string Hex4(unsigned v) {
    static constexpr char kDigits[] = "0123456789ABCDEF";
    std::string s = "0x0000";
    for (int i = 0; i < 4; ++i) s[5 - i] = kDigits[(v >> (4 * i)) & 0xf];
    return s;
}

}  // namespace

std::optional<ResourceName> ParseResourceName(std::string_view text, std::string* error) {
    std::string err;
    std::string_view s = Trim(text);
    std::optional<Fields> fields = Split(s);
    for (const Kind& kind : kKinds) {
        if (!fields || !IStartsWith(fields->front(), kind.keyword)) continue;
        ResourceName r;
        r.interface_type = kind.interface_type;
        std::string_view board = fields->front().substr(kind.keyword.size());
        if (kind.parse(board, *fields, r, err)) return r;
        break;
    }
    if (err.empty()) err = "unrecognised resource string";
    if (error) *error = "'" + std::string(text) + "': " + err;
    return std::nullopt;
}

std::string ResourceName::Canonical() const {
    const std::string b = std::to_string(board);
    switch (interface_type) {
        case 6: {
            std::string h = host.find(':') != std::string::npos ? "[" + host + "]" : host;
            if (resource_class == "SOCKET")
                return "TCPIP" + b + "::" + h + "::" + std::to_string(port) + "::SOCKET";
            if (port) h += ":" + std::to_string(port);
            return "TCPIP" + b + "::" + h + "::" + device_name + "::INSTR";
        }
        case 4:
            return (device_path.empty() ? "ASRL" + b : "ASRL" + device_path) + "::INSTR";
        case 7:
            return "USB" + b + "::" + Hex4(vendor_id) + "::" + Hex4(product_id) +
                   "::" + serial_number +
                   (usb_interface >= 0 ? "::" + std::to_string(usb_interface) : "") + "::INSTR";
        case 1:
            return "GPIB" + b + "::" + std::to_string(primary_address) +
                   (secondary_address >= 0 ? "::" + std::to_string(secondary_address) : "") +
                   "::INSTR";
        default:
            return {};
    }
}

}  // namespace qn::visa
