// USBTMC transport (USB[n]::vid::pid::serial[::intf]::INSTR) through the
// Linux usbtmc driver's character device.
//
// The device marks the end of each message (END, the EOM bit), so a read
// ends at END, at the termination character when enabled, or at the count.
// Reads are blocking transfers bounded by the driver's own timeout, which is
// set before each transfer to what is left of the operation's deadline (the
// driver's minimum is 100 ms). Nothing arrives unasked on USBTMC: the rest of
// a reply stays in the instrument until it is asked for, so before a write
// the unread rest of a reply that was read only in part is read and dropped.
// Device clear and the status byte are the driver's ioctls.
#include <fcntl.h>
#include <linux/usb/tmc.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>

#include "platform/visa/resource_name.h"
#include "platform/visa/tcp_connect.h"
#include "platform/visa/usbtmc_device.h"

namespace qn::visa {
namespace {

constexpr std::size_t kBufferSize = 64 * 1024;
// The unread rest of a reply dropped before a write: at most this much.
constexpr std::size_t kMaxDrop = 256u * 1024 * 1024;
constexpr std::uint32_t kDriverMinTimeoutMs = 100;

// The kernel driver's character device.
class KernelUsbtmcDevice final : public UsbtmcDevice {
  public:
    explicit KernelUsbtmcDevice(int fd) : fd_(fd) {
        // After a timed-out transfer the driver aborts it, so that the
        // device's bulk pipes stay in step.
        const std::uint8_t on = 1;
        ::ioctl(fd_.get(), USBTMC_IOCTL_AUTO_ABORT, &on);
    }
    int SetTimeout(std::uint32_t ms) override {
        ms = std::max(ms, kDriverMinTimeoutMs);
        return Result(::ioctl(fd_.get(), USBTMC_IOCTL_SET_TIMEOUT, &ms));
    }
    int Read(BYTE* buf, std::size_t n, std::size_t* got, bool* eom) override {
        *got = 0;
        ssize_t r;
        do r = ::read(fd_.get(), buf, n);
        while (r < 0 && errno == EINTR);
        if (r < 0) return errno;
        *got = std::size_t(r);
        // The attributes of the last transfer say whether it carried EOM;
        // drivers without that ioctl end a message with a short read.
        std::uint8_t attr = 0;
        *eom =
            ::ioctl(fd_.get(), USBTMC_IOCTL_MSG_IN_ATTR, &attr) == 0 ? (attr & 1) != 0 : *got < n;
        return 0;
    }
    int Write(const BYTE* data, std::size_t n, std::size_t* written) override {
        *written = 0;
        while (*written < n) {
            ssize_t r = ::write(fd_.get(), data + *written, n - *written);
            if (r < 0 && errno == EINTR) continue;
            if (r < 0) return errno;
            if (r == 0) return EIO;
            *written += std::size_t(r);
        }
        return 0;
    }
    int Clear() override { return Result(::ioctl(fd_.get(), USBTMC_IOCTL_CLEAR)); }
    int ReadStatusByte(BYTE* stb) override {
        unsigned char v = 0;
        int err = Result(::ioctl(fd_.get(), USBTMC488_IOCTL_READ_STB, &v));
        *stb = v;
        return err;
    }
    int Trigger() override { return Result(::ioctl(fd_.get(), USBTMC488_IOCTL_TRIGGER)); }

  private:
    static int Result(int r) { return r == 0 ? 0 : errno; }
    FdHolder fd_;
};

class UsbtmcTransport final : public Transport {
  public:
    UsbtmcTransport(std::unique_ptr<UsbtmcDevice> device, std::string label)
        : device_(std::move(device)), label_(std::move(label)), buf_(kBufferSize) {}

    HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                 std::string* error) override;
    HRESULT Write(const BYTE* data, std::size_t size, bool send_end, const Deadline& deadline,
                  std::size_t* written, std::string* error) override;
    HRESULT Clear(const Deadline& deadline, std::string* error) override;
    HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) override;
    HRESULT Trigger(const Deadline& deadline, std::string* error) override;
    void DiscardInput() override { head_ = tail_ = 0; }
    void Close() override { device_.reset(); }
    bool HasEnd() const override { return true; }

  private:
    // One transfer of at most n bytes by the deadline.
    HRESULT Transfer(BYTE* dst, std::size_t n, const Deadline& deadline, std::size_t* got,
                     bool* eom, std::string* error);
    HRESULT Fail(int err, const std::string& what, std::string* error) const;
    HRESULT TimeoutFor(const Deadline& deadline, std::string* error);
    HRESULT Closed(std::string* error) const {
        *error = "session closed";
        return E_VISA_INVALID_OBJECT;
    }

    std::unique_ptr<UsbtmcDevice> device_;  // null once closed
    std::string label_;
    std::vector<BYTE> buf_;
    std::size_t head_ = 0, tail_ = 0;  // unread bytes of the current transfer
    bool buffered_eom_ = false;        // the buffered bytes end the message
    bool in_message_ = false;          // a reply was read in part: its rest is in the device
};

HRESULT UsbtmcTransport::Fail(int err, const std::string& what, std::string* error) const {
    if (err == ETIMEDOUT) {
        *error = "timeout " + what + " " + label_;
        return E_VISA_TIMEOUT;
    }
    *error = what + " " + label_ + " failed: " + ErrnoText(err);
    if (err == ENODEV || err == ESHUTDOWN || err == ENXIO || err == EIO || err == ENOENT) {
        *error = label_ + " is gone (" + ErrnoText(err) + ") while " + what;
        return E_VISA_CONNECTION_LOST;
    }
    return E_VISA_IO;
}

HRESULT UsbtmcTransport::TimeoutFor(const Deadline& deadline, std::string* error) {
    const int ms = deadline.PollMs();
    int err = device_->SetTimeout(ms < 0 ? std::uint32_t(INT_MAX) : std::uint32_t(std::max(ms, 1)));
    return err ? Fail(err, "setting the timeout of", error) : S_OK;
}

HRESULT UsbtmcTransport::Transfer(BYTE* dst, std::size_t n, const Deadline& deadline,
                                  std::size_t* got, bool* eom, std::string* error) {
    *got = 0;
    *eom = false;
    HRESULT hr = TimeoutFor(deadline, error);
    if (FAILED(hr)) return hr;
    int err = device_->Read(dst, n, got, eom);
    if (err) return Fail(err, "reading from", error);
    in_message_ = !*eom;
    return S_OK;
}

HRESULT UsbtmcTransport::Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                              std::string* error) {
    *result = ReadResult{};
    if (!device_) return Closed(error);
    while (result->bytes < req.count) {
        if (head_ < tail_) {  // bytes of the last transfer first
            std::size_t n = std::min(tail_ - head_, req.count - result->bytes);
            bool term = false;
            if (req.term_char_enabled) {
                if (const void* hit = std::memchr(&buf_[head_], req.term_char, n)) {
                    n = std::size_t(static_cast<const BYTE*>(hit) - &buf_[head_]) + 1;
                    term = true;
                }
            }
            std::memcpy(req.buf + result->bytes, &buf_[head_], n);
            head_ += n;
            result->bytes += n;
            const bool end = head_ == tail_ && buffered_eom_;
            if (head_ == tail_) head_ = tail_ = 0;
            if (end) {
                result->end = kReadEndEnd;
                return S_OK;
            }
            if (term) {
                result->end = kReadEndTermChar;
                return S_OK;
            }
            continue;
        }
        if (req.return_available && result->bytes > 0) {
            result->end = kReadEndAvailable;
            return S_OK;
        }
        const std::size_t want = req.count - result->bytes;
        std::size_t got = 0;
        bool eom = false;
        if (!req.term_char_enabled) {  // straight into the caller's memory
            HRESULT hr = Transfer(req.buf + result->bytes, want, deadline, &got, &eom, error);
            result->bytes += got;
            if (FAILED(hr)) return hr;
            if (eom) {
                result->end = kReadEndEnd;
                return S_OK;
            }
        } else {
            HRESULT hr =
                Transfer(buf_.data(), std::min(want, buf_.size()), deadline, &got, &eom, error);
            if (FAILED(hr)) return hr;
            tail_ = got;
            buffered_eom_ = eom;
            if (got == 0 && eom) {  // an empty message
                result->end = kReadEndEnd;
                return S_OK;
            }
        }
        if (got == 0 && !eom && deadline.Expired()) return Fail(ETIMEDOUT, "reading from", error);
    }
    return S_OK;
}

HRESULT UsbtmcTransport::Write(const BYTE* data, std::size_t size, bool /*send_end*/,
                               const Deadline& deadline, std::size_t* written, std::string* error) {
    *written = 0;
    if (!device_) return Closed(error);
    // The unread rest of an earlier reply must not pass for the reply to
    // what is written now.
    head_ = tail_ = 0;
    for (std::size_t dropped = 0; in_message_ && dropped < kMaxDrop;) {
        std::size_t got = 0;
        bool eom = false;
        HRESULT hr = Transfer(buf_.data(), buf_.size(), deadline, &got, &eom, error);
        if (FAILED(hr)) return hr;
        dropped += got;
    }
    HRESULT hr = TimeoutFor(deadline, error);
    if (FAILED(hr)) return hr;
    int err = device_->Write(data, size, written);
    return err ? Fail(err, "writing to", error) : S_OK;
}

HRESULT UsbtmcTransport::Clear(const Deadline& deadline, std::string* error) {
    if (!device_) return Closed(error);
    head_ = tail_ = 0;
    in_message_ = false;
    HRESULT hr = TimeoutFor(deadline, error);
    if (FAILED(hr)) return hr;
    int err = device_->Clear();
    return err ? Fail(err, "clearing", error) : S_OK;
}

HRESULT UsbtmcTransport::ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) {
    if (!device_) return Closed(error);
    HRESULT hr = TimeoutFor(deadline, error);
    if (FAILED(hr)) return hr;
    int err = device_->ReadStatusByte(stb);
    return err ? Fail(err, "reading the status byte of", error) : S_OK;
}

HRESULT UsbtmcTransport::Trigger(const Deadline& deadline, std::string* error) {
    if (!device_) return Closed(error);
    HRESULT hr = TimeoutFor(deadline, error);
    if (FAILED(hr)) return hr;
    int err = device_->Trigger();
    if (err == EOPNOTSUPP || err == ENOTTY) {
        *error = label_ + " has no USB488 trigger";
        return E_VISA_NOT_SUPPORTED;
    }
    return err ? Fail(err, "triggering", error) : S_OK;
}

}  // namespace

std::unique_ptr<UsbtmcDevice> OpenUsbtmcDevice(const std::string& path, int* err) {
    int fd = ::open(path.c_str(), O_RDWR | O_CLOEXEC);
    if (fd < 0) {
        *err = errno;
        return nullptr;
    }
    return std::make_unique<KernelUsbtmcDevice>(fd);
}

std::unique_ptr<Transport> MakeUsbtmcTransport(std::unique_ptr<UsbtmcDevice> device,
                                               std::string label) {
    return std::make_unique<UsbtmcTransport>(std::move(device), std::move(label));
}

HRESULT OpenUsbtmcTransportAt(const ResourceName& name, const std::string& sysfs_root,
                              const std::string& dev_dir, std::unique_ptr<Transport>* out,
                              std::string* error) {
    const std::vector<UsbtmcEntry> devices = ListUsbtmcDevices(sysfs_root);
    for (const UsbtmcEntry& d : devices) {
        if (d.vendor_id != name.vendor_id || d.product_id != name.product_id ||
            d.serial_number != name.serial_number ||
            (name.usb_interface >= 0 && d.interface_number != name.usb_interface))
            continue;
        const std::string path = dev_dir + "/" + d.name;
        int err = 0;
        auto device = OpenUsbtmcDevice(path, &err);
        if (!device) {
            *error = "cannot open " + path + ": " + ErrnoText(err) +
                     (err == EACCES ? " (the user needs read and write access to the device)" : "");
            return E_VISA_RESOURCE_NOT_FOUND;
        }
        *out = MakeUsbtmcTransport(std::move(device), path);
        return S_OK;
    }
    *error = "no usbtmc device has these ids (" + std::to_string(devices.size()) +
             " usbtmc devices present)";
    return E_VISA_RESOURCE_NOT_FOUND;
}

HRESULT OpenUsbtmcTransport(const ResourceName& name, LONG /*open_timeout_ms*/,
                            std::unique_ptr<Transport>* out, std::string* error) {
    return OpenUsbtmcTransportAt(name, "/sys", "/dev", out, error);
}

}  // namespace qn::visa
