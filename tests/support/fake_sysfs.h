// A sysfs tree in a temporary directory, laid out as the kernel lays out the
// usbtmc devices: class/usbmisc/usbtmcN/device links to the USB interface,
// whose parent directory is the USB device.
#pragma once

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <string>

namespace qn::test {

class FakeSysfs {
  public:
    FakeSysfs() {
        char tmpl[] = "/tmp/qn-sysfs-XXXXXX";
        root_ = ::mkdtemp(tmpl);
        std::filesystem::create_directories(root_ + "/class/usbmisc");
    }
    ~FakeSysfs() { std::filesystem::remove_all(root_); }
    FakeSysfs(const FakeSysfs&) = delete;
    FakeSysfs& operator=(const FakeSysfs&) = delete;
    const std::string& root() const { return root_; }

    // vid and pid as sysfs writes them (four hex digits); an empty serial
    // writes no serial file.
    void Add(const std::string& node, const std::string& usb, const std::string& vid,
             const std::string& pid, const std::string& serial, const std::string& intf) {
        const std::string dev = root_ + "/devices/" + usb;
        const std::string ifc = dev + "/" + usb + ":1." + intf;
        std::filesystem::create_directories(ifc);
        std::ofstream(dev + "/idVendor") << vid << "\n";
        std::ofstream(dev + "/idProduct") << pid << "\n";
        if (!serial.empty()) std::ofstream(dev + "/serial") << serial << "\n";
        std::ofstream(ifc + "/bInterfaceNumber") << "0" << intf << "\n";
        std::filesystem::create_directories(root_ + "/class/usbmisc/" + node);
        std::filesystem::create_directory_symlink(ifc,
                                                  root_ + "/class/usbmisc/" + node + "/device");
    }

  private:
    std::string root_;
};

}  // namespace qn::test
