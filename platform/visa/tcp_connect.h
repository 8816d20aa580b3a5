// TCP connections for the LAN transports: name resolution and connection
// within a deadline, and the bounded sends and receives of the RPC and
// HiSLIP transports. Sockets are non-blocking; every wait is a poll()
// bounded by the operation's deadline.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>

#include "platform/visa/deadline.h"
#include "platform/visa/visa.h"

namespace qn::visa {

// Owns a file descriptor.
class FdHolder {
  public:
    explicit FdHolder(int fd = -1) : fd_(fd) {}
    FdHolder(const FdHolder&) = delete;
    FdHolder& operator=(const FdHolder&) = delete;
    ~FdHolder() { reset(); }
    int get() const { return fd_; }
    int release() { return std::exchange(fd_, -1); }
    void reset(int fd = -1);

  private:
    int fd_;
};

std::string ErrnoText(int err);

// Resolves host and connects to port by the deadline: a non-blocking socket
// with TCP_NODELAY in *fd, or E_VISA_RESOURCE_NOT_FOUND with *error.
HRESULT ConnectTcp(const std::string& host, std::uint16_t port, const Deadline& deadline,
                   FdHolder* fd, std::string* error);

// Sends all of data by the deadline (E_VISA_TIMEOUT, E_VISA_CONNECTION_LOST
// or E_VISA_IO otherwise; *sent says how much left).
HRESULT SendAll(int fd, const void* data, std::size_t size, const Deadline& deadline,
                const std::string& peer, std::size_t* sent, std::string* error);

// Receives at least one byte and at most n by the deadline.
HRESULT RecvSome(int fd, void* dst, std::size_t n, const Deadline& deadline,
                 const std::string& peer, std::size_t* got, std::string* error);

}  // namespace qn::visa
