// Finding usbtmc character devices in sysfs. Each device of the usbtmc
// driver appears as class/usbmisc/usbtmcN; its `device` link leads to the
// USB interface (bInterfaceNumber), whose parent directory is the USB device
// (idVendor, idProduct and, when the device has one, serial).
#include <dirent.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <optional>

#include "platform/visa/usbtmc_device.h"

namespace qn::visa {
namespace {

// The first line of a sysfs attribute file, or nullopt when it is absent.
std::optional<std::string> ReadAttribute(const std::string& path) {
    std::ifstream in(path);
    std::string line;
    if (!in || !std::getline(in, line)) return std::nullopt;
    while (!line.empty() && (line.back() == '\r' || line.back() == ' ')) line.pop_back();
    return line;
}

std::optional<unsigned long> ReadHex(const std::string& path, unsigned long max) {
    auto text = ReadAttribute(path);
    if (!text || text->empty()) return std::nullopt;
    char* end = nullptr;
    unsigned long v = std::strtoul(text->c_str(), &end, 16);
    if (*end != '\0' || v > max) return std::nullopt;
    return v;
}

}  // namespace

std::vector<UsbtmcEntry> ListUsbtmcDevices(const std::string& sysfs_root) {
    std::vector<UsbtmcEntry> found;
    const std::string cls = sysfs_root + "/class/usbmisc";
    DIR* dir = ::opendir(cls.c_str());
    if (!dir) return found;
    while (const dirent* e = ::readdir(dir)) {
        const std::string name = e->d_name;
        if (name.rfind("usbtmc", 0) != 0) continue;
        const std::string intf = cls + "/" + name + "/device";
        auto vid = ReadHex(intf + "/../idVendor", 0xFFFF);
        auto pid = ReadHex(intf + "/../idProduct", 0xFFFF);
        auto number = ReadHex(intf + "/bInterfaceNumber", 0xFF);
        if (!vid || !pid || !number) continue;
        UsbtmcEntry entry;
        entry.name = name;
        entry.vendor_id = std::uint16_t(*vid);
        entry.product_id = std::uint16_t(*pid);
        entry.serial_number = ReadAttribute(intf + "/../serial").value_or("");
        entry.interface_number = int(*number);
        found.push_back(std::move(entry));
    }
    ::closedir(dir);
    std::sort(found.begin(), found.end(), [](const UsbtmcEntry& a, const UsbtmcEntry& b) {
        return a.name.size() != b.name.size() ? a.name.size() < b.name.size() : a.name < b.name;
    });
    return found;
}

}  // namespace qn::visa
