// Serial transport (ASRLn::INSTR and ASRL/dev/path::INSTR): a byte stream
// (stream_transport.h) over a tty in raw mode. ASRLn names /dev/ttyS<n-1>
// (ASRL1 is the first port, /dev/ttyS0); any other device, a USB adapter
// (/dev/ttyUSB0, /dev/ttyACM0) or a pseudo-terminal, is named by its path.
//
// The line is set with termios: speed, data bits, parity, stop bits and
// flow control from SerialSettings; no echo, no line editing, no character
// translation, modem lines ignored (CLOCAL). Bytes with framing or parity
// errors are dropped by the driver (IGNPAR), so noise on the line shows as
// a reply that never completes (a timeout) or an unreadable one, never as
// a shifted reply.
#include <fcntl.h>
#include <termios.h>
#include <unistd.h>

#include <cerrno>

#include "platform/visa/resource_name.h"
#include "platform/visa/serial.h"
#include "platform/visa/serial_line.h"
#include "platform/visa/stream_transport.h"

namespace qn::visa {
namespace {

struct Speed {
    LONG baud;
    speed_t code;
};

constexpr Speed kSpeeds[] = {
    {50, B50},           {75, B75},           {110, B110},         {134, B134},
    {150, B150},         {200, B200},         {300, B300},         {600, B600},
    {1200, B1200},       {1800, B1800},       {2400, B2400},       {4800, B4800},
    {9600, B9600},       {19200, B19200},     {38400, B38400},     {57600, B57600},
    {115200, B115200},   {230400, B230400},   {460800, B460800},   {500000, B500000},
    {576000, B576000},   {921600, B921600},   {1000000, B1000000}, {1152000, B1152000},
    {1500000, B1500000}, {2000000, B2000000}, {2500000, B2500000}, {3000000, B3000000},
    {3500000, B3500000}, {4000000, B4000000},
};

constexpr tcflag_t kDataBits[] = {CS5, CS6, CS7, CS8};  // 5 to 8 bits

}  // namespace

HRESULT SerialTermios(const SerialSettings& s, termios* t, std::string* error) {
    const Speed* speed = nullptr;
    for (const Speed& sp : kSpeeds)
        if (sp.baud == s.baud_rate) speed = &sp;
    if (!speed) {
        *error = "baud rate " + std::to_string(s.baud_rate) +
                 " is not a standard rate (50 to 4000000, e.g. 9600, 115200)";
        return E_VISA_ATTRIBUTE_STATE;
    }
    if (s.data_bits < 5 || s.data_bits > 8) {
        *error = "data bits " + std::to_string(s.data_bits) + ": use 5 to 8";
        return E_VISA_ATTRIBUTE_STATE;
    }
    if (s.parity < kParityNone || s.parity > kParitySpace) {
        *error =
            "parity " + std::to_string(s.parity) + ": use 0 none, 1 odd, 2 even, 3 mark, 4 space";
        return E_VISA_ATTRIBUTE_STATE;
    }
    if (s.stop_bits == 15) {
        *error = "1.5 stop bits are not supported by the serial driver";
        return E_VISA_NOT_SUPPORTED;
    }
    if (s.stop_bits != kStopOne && s.stop_bits != kStopTwo) {
        *error = "stop bits " + std::to_string(s.stop_bits) + ": use 10 (one) or 20 (two)";
        return E_VISA_ATTRIBUTE_STATE;
    }
    if (s.flow_control == 4) {
        *error = "DTR/DSR flow control is not supported by the serial driver";
        return E_VISA_NOT_SUPPORTED;
    }
    if (s.flow_control != kFlowNone && s.flow_control != kFlowXonXoff &&
        s.flow_control != kFlowRtsCts) {
        *error = "flow control " + std::to_string(s.flow_control) +
                 ": use 0 none, 1 XON/XOFF, 2 RTS/CTS";
        return E_VISA_ATTRIBUTE_STATE;
    }
    ::cfmakeraw(t);
    t->c_iflag |= IGNPAR | IGNBRK;
    t->c_cflag &= ~tcflag_t(CSIZE | PARENB | PARODD | CMSPAR | CSTOPB | CRTSCTS);
    t->c_cflag |= CLOCAL | CREAD | kDataBits[s.data_bits - 5];
    if (s.parity != kParityNone) t->c_cflag |= PARENB;
    if (s.parity == kParityOdd || s.parity == kParityMark) t->c_cflag |= PARODD;
    if (s.parity == kParityMark || s.parity == kParitySpace) t->c_cflag |= CMSPAR;
    if (s.stop_bits == kStopTwo) t->c_cflag |= CSTOPB;
    t->c_iflag &= ~tcflag_t(IXON | IXOFF | IXANY);
    if (s.flow_control == kFlowXonXoff) t->c_iflag |= IXON | IXOFF;
    if (s.flow_control == kFlowRtsCts) t->c_cflag |= CRTSCTS;
    // A read waits for one byte: with the descriptor non-blocking that makes
    // an empty line EAGAIN (poll() does the waiting), and 0 a hang-up.
    t->c_cc[VMIN] = 1;
    t->c_cc[VTIME] = 0;
    ::cfsetispeed(t, speed->code);
    ::cfsetospeed(t, speed->code);
    return S_OK;
}

namespace {

class SerialTransport final : public StreamTransport {
  public:
    SerialTransport(int fd, std::string path) : StreamTransport(fd, Kind::kFile, std::move(path)) {}

    // Drops what the driver holds in both directions, then what was read
    // and not taken; nothing is sent.
    HRESULT Clear(const Deadline& deadline, std::string* error) override {
        if (fd() >= 0) ::tcflush(fd(), TCIOFLUSH);
        return StreamTransport::Clear(deadline, error);
    }

    HRESULT ApplySerial(const SerialSettings& s, std::string* error) override {
        if (fd() < 0) {
            *error = "session closed";
            return E_VISA_INVALID_OBJECT;
        }
        termios t{};
        if (::tcgetattr(fd(), &t) != 0) {
            *error = "cannot read the line settings of " + peer() + ": " + ErrnoText(errno);
            return E_VISA_IO;
        }
        HRESULT hr = SerialTermios(s, &t, error);
        if (FAILED(hr)) return hr;
        if (::tcsetattr(fd(), TCSANOW, &t) != 0) {
            *error = "cannot set the line of " + peer() + ": " + ErrnoText(errno);
            return E_VISA_ATTRIBUTE_STATE;
        }
        return S_OK;
    }
};

std::string DevicePath(const ResourceName& name, std::string* error) {
    if (!name.device_path.empty()) return name.device_path;
    if (name.board == 0) {
        *error = "serial ports are numbered from 1 (ASRL1 is /dev/ttyS0)";
        return {};
    }
    return "/dev/ttyS" + std::to_string(name.board - 1);
}

}  // namespace

HRESULT OpenSerialTransport(const ResourceName& name, LONG /*open_timeout_ms*/,
                            std::unique_ptr<Transport>* out, std::string* error) {
    const std::string path = DevicePath(name, error);
    if (path.empty()) return E_VISA_RESOURCE_NOT_FOUND;
    FdHolder fd(::open(path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC));
    if (fd.get() < 0) {
        *error = "cannot open " + path + ": " + ErrnoText(errno);
        return E_VISA_RESOURCE_NOT_FOUND;
    }
    if (!::isatty(fd.get())) {
        *error = path + " is not a serial port";
        return E_VISA_RESOURCE_NOT_FOUND;
    }
    auto transport = std::make_unique<SerialTransport>(fd.release(), path);
    HRESULT hr = transport->ApplySerial(SerialSettings{}, error);
    if (FAILED(hr)) return E_VISA_RESOURCE_NOT_FOUND;
    transport->Clear(Deadline::Infinite(), error);  // nothing from before the open
    *out = std::move(transport);
    return S_OK;
}

}  // namespace qn::visa
