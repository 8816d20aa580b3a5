// The transport under a message-based session: one connection to one
// instrument. Each kind of resource has its own implementation in its own
// file; the session (session.cpp) holds the settings and the lock and calls
// these operations. Results are HRESULTs (E_VISA_* of visa.h); failures also
// fill *error with a description for the thread's error information.
#pragma once

#include <cstddef>
#include <memory>
#include <string>

#include "platform/visa/deadline.h"
#include "platform/visa/visa.h"

namespace qn::visa {

struct ResourceName;

struct ReadRequest {
    BYTE* buf = nullptr;
    std::size_t count = 0;
    bool term_char_enabled = false;  // stop after term_char
    BYTE term_char = '\n';
    bool return_available = false;  // stop once some data came and no more waits
};

// Line settings of a serial port, in the units of the VISA serial attributes.
struct SerialSettings {
    LONG baud_rate = 9600;
    SHORT data_bits = 8;     // 5 to 8
    SHORT parity = 0;        // SerialParity
    SHORT stop_bits = 10;    // 10: one, 20: two (tenths of a bit)
    SHORT flow_control = 0;  // SerialFlowControl bits
};

struct ReadResult {
    std::size_t bytes = 0;        // stored in buf, also on failure
    ReadEnd end = kReadEndCount;  // why the read stopped (on success)
};

class Transport {
  public:
    virtual ~Transport() = default;

    virtual HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                         std::string* error) = 0;
    // Writes all of data (partial count in *written on failure). send_end
    // marks the end of the message where the bus has an END.
    virtual HRESULT Write(const BYTE* data, std::size_t size, bool send_end,
                          const Deadline& deadline, std::size_t* written, std::string* error) = 0;
    // Device clear as this bus can do it.
    virtual HRESULT Clear(const Deadline& deadline, std::string* error) = 0;
    virtual HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) = 0;
    // The bus's trigger (a message-based bus without one sends "*TRG").
    virtual HRESULT Trigger(const Deadline& deadline, std::string* error) = 0;
    // Takes the device's exclusive lock, waiting up to lock_timeout_ms for
    // another link to give it up (0: not at all, -1: no limit); the wait for
    // the answer ends by deadline. Buses without a lock protocol refuse.
    virtual HRESULT Lock(LONG /*lock_timeout_ms*/, const Deadline& /*deadline*/,
                         std::string* error) {
        *error = "this bus has no device lock";
        return E_VISA_NOT_SUPPORTED;
    }
    virtual HRESULT Unlock(const Deadline& /*deadline*/, std::string* error) {
        *error = "this bus has no device lock";
        return E_VISA_NOT_SUPPORTED;
    }
    // Drops input received and not yet read (after a timeout, so that a late
    // reply is not taken for the answer to the next query).
    virtual void DiscardInput() = 0;
    virtual void Close() = 0;
    // True when the bus marks the end of a message (END).
    virtual bool HasEnd() const { return false; }
    // Sets the line of a serial port; other transports have none.
    virtual HRESULT ApplySerial(const SerialSettings&, std::string* error) {
        *error = "not a serial line";
        return E_VISA_NOT_SUPPORTED;
    }
};

// The raw-socket transport (socket_transport.cpp): connects to host:port of
// a SOCKET resource within open_timeout_ms (-1: no limit).
HRESULT OpenSocketTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error);

// The VXI-11 transport (vxi11_transport.cpp): the core channel of a
// TCPIP INSTR resource, found through the host's portmapper unless the
// resource names its port.
HRESULT OpenVxi11Transport(const ResourceName& name, LONG open_timeout_ms,
                           std::unique_ptr<Transport>* out, std::string* error);
// The same, the link made holding the device's exclusive lock (create_link
// with lockDevice, waiting up to the open timeout for it; E_VISA_RSRC_LOCKED
// when another link keeps it).
HRESULT OpenVxi11TransportLocked(const ResourceName& name, LONG open_timeout_ms,
                                 std::unique_ptr<Transport>* out, std::string* error);

// The HiSLIP transport (hislip_transport.cpp): both channels of a TCPIP
// INSTR resource whose device name is hislip<n>; the port is the one after a
// comma in the device name ("hislip0,4881"), else the one after the host,
// else 4880.
HRESULT OpenHislipTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error);

// The serial transport (serial_transport.cpp): the port of an ASRL resource
// (ASRLn is /dev/ttyS<n-1>, ASRL/dev/path names the device), raw, with the
// default SerialSettings until ApplySerial changes them.
HRESULT OpenSerialTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error);

// The USBTMC transport (usbtmc_transport.cpp): the usbtmc character device
// whose USB device has the resource's vendor id, product id, serial number
// (and interface number, when given).
HRESULT OpenUsbtmcTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error);

}  // namespace qn::visa
