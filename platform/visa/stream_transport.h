// A transport over a byte stream without message ends: a TCP socket
// (SOCKET resources) or a serial line (ASRL resources).
//
// The descriptor is non-blocking; every wait is a poll() bounded by the
// operation's deadline, so a timeout covers the whole operation. A stream
// has no END:
// - a read ends at the termination character (when enabled) or at the count;
//   a pause in the data is never taken as the end of a message;
// - Clear discards input received and not yet read and sends nothing (a
//   "*CLS" would clear the instrument's status registers, which a device
//   clear must not do);
// - the status byte is read with the "*STB?" common query, a trigger is the
//   "*TRG" common command.
// Every write first drops whatever input is waiting (a stray line, the late
// rest of a reply after a timeout), so that it is not taken for the answer to
// what is written now. A reply that arrives after that point cannot be told
// apart from the new one: the protocol has no message ids.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

#include "platform/visa/tcp_connect.h"
#include "platform/visa/transport.h"

namespace qn::visa {

class StreamTransport : public Transport {
  public:
    enum class Kind { kSocket, kFile };
    // Takes ownership of fd (non-blocking). peer names the other end in
    // messages ("host:port", "/dev/ttyS0").
    StreamTransport(int fd, Kind kind, std::string peer);
    ~StreamTransport() override { Close(); }

    HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                 std::string* error) override;
    HRESULT Write(const BYTE* data, std::size_t size, bool send_end, const Deadline& deadline,
                  std::size_t* written, std::string* error) override;
    HRESULT Clear(const Deadline&, std::string*) override {
        DiscardInput();
        return S_OK;
    }
    HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) override;
    // No bus trigger: the "*TRG" common command, which a message-based
    // instrument takes as one.
    HRESULT Trigger(const Deadline& deadline, std::string* error) override;
    void DiscardInput() override;
    void Close() override { fd_.reset(); }

  protected:
    int fd() const { return fd_.get(); }
    const std::string& peer() const { return peer_; }

  private:
    // Copies buffered bytes into the request; true when that ends the read.
    bool TakeBuffered(const ReadRequest& req, ReadResult* r);
    // Receives at least one byte into dst (at most n); waits until deadline.
    HRESULT ReceiveSome(BYTE* dst, std::size_t n, const Deadline& deadline, std::size_t* got,
                        std::string* error);
    HRESULT SendAllBy(const BYTE* data, std::size_t size, const Deadline& deadline,
                      std::size_t* sent, std::string* error);
    // One non-blocking read or write (send without SIGPIPE on a socket).
    ssize_t ReadNow(BYTE* dst, std::size_t n);
    ssize_t WriteNow(const BYTE* src, std::size_t n);

    FdHolder fd_;
    Kind kind_;
    std::string peer_;
    std::vector<BYTE> buf_;
    std::size_t head_ = 0, tail_ = 0;  // unread bytes are buf_[head_, tail_)
    bool drained_ = false;             // the last receive emptied the queue
};

}  // namespace qn::visa
