// USBTMC instruments through the Linux usbtmc driver: finding the character
// device of an instrument by its USB ids in sysfs, and the device's
// operations behind a small interface, so that the transport above it can
// run against a stand-in.
#pragma once

#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "platform/visa/transport.h"

namespace qn::visa {

// One usbtmc character device and the USB ids of the instrument behind it.
struct UsbtmcEntry {
    std::string name;  // "usbtmc0": the device node is /dev/<name>
    std::uint16_t vendor_id = 0;
    std::uint16_t product_id = 0;
    std::string serial_number;  // empty when the device has none
    int interface_number = 0;
};

// The usbtmc devices under sysfs_root ("/sys" on a live system:
// class/usbmisc/usbtmc*, whose `device` link is the USB interface and its
// parent the USB device), ordered by name. Entries whose ids cannot be read
// are left out.
std::vector<UsbtmcEntry> ListUsbtmcDevices(const std::string& sysfs_root);

// The operations of an open usbtmc device. Results are 0 or an errno value
// (ETIMEDOUT when the driver's timeout passed, ENODEV once the device is
// unplugged).
class UsbtmcDevice {
  public:
    virtual ~UsbtmcDevice() = default;
    // The driver's timeout for the transfers that follow, in milliseconds
    // (the driver takes no less than 100).
    virtual int SetTimeout(std::uint32_t ms) = 0;
    // One read of at most n bytes of the current reply; *eom is true when the
    // device marked the end of its message with these bytes.
    virtual int Read(BYTE* buf, std::size_t n, std::size_t* got, bool* eom) = 0;
    // Writes one whole message (the driver marks its end).
    virtual int Write(const BYTE* data, std::size_t n, std::size_t* written) = 0;
    // USBTMC INITIATE_CLEAR and its completion: the device drops its I/O.
    virtual int Clear() = 0;
    // USB488 READ_STATUS_BYTE.
    virtual int ReadStatusByte(BYTE* stb) = 0;
    // USB488 TRIGGER; a device without it answers EOPNOTSUPP.
    virtual int Trigger() { return EOPNOTSUPP; }
};

// Opens the character device at path (the kernel driver's ioctls), or null
// with *err set to the errno value.
std::unique_ptr<UsbtmcDevice> OpenUsbtmcDevice(const std::string& path, int* err);

// The transport over an open device; `label` names it in messages.
std::unique_ptr<Transport> MakeUsbtmcTransport(std::unique_ptr<UsbtmcDevice> device,
                                               std::string label);

// Opens the USB INSTR resource `name` among the devices of sysfs_root,
// with device nodes in dev_dir ("/dev").
HRESULT OpenUsbtmcTransportAt(const ResourceName& name, const std::string& sysfs_root,
                              const std::string& dev_dir, std::unique_ptr<Transport>* out,
                              std::string* error);

}  // namespace qn::visa
