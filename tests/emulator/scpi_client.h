// Minimal blocking loopback client for the emulator tests. Reads wait at most kWait so that a
// broken emulator fails a test instead of hanging it; no test asserts on durations.
#pragma once

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include "emulator/emulator.h"

namespace qn::emu::test {

class ScpiClient {
  public:
    static constexpr int kWaitMs = 10000;

    explicit ScpiClient(std::uint16_t port) {
        fd_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_in addr{};
        addr.sin_family = AF_INET;
        addr.sin_port = htons(port);
        addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        if (fd_ < 0 || ::connect(fd_, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0) {
            throw std::runtime_error("cannot connect to the emulator");
        }
    }
    ~ScpiClient() { Close(); }
    ScpiClient(const ScpiClient&) = delete;
    ScpiClient& operator=(const ScpiClient&) = delete;

    void Close() {
        if (fd_ >= 0) ::close(fd_);
        fd_ = -1;
    }

    // Sends the bytes as they are (the caller adds the terminator).
    void SendRaw(std::string_view bytes) {
        while (!bytes.empty()) {
            const ssize_t n = ::send(fd_, bytes.data(), bytes.size(), MSG_NOSIGNAL);
            if (n <= 0) throw std::runtime_error("send failed");
            bytes.remove_prefix(static_cast<std::size_t>(n));
        }
    }
    void Send(std::string_view message) { SendRaw(std::string(message) + "\n"); }

    // One reply line without its terminator; nullopt on end of stream or after kWaitMs.
    std::optional<std::string> ReadLine() {
        while (true) {
            const auto nl = buffer_.find('\n');
            if (nl != std::string::npos) {
                std::string line = buffer_.substr(0, nl);
                buffer_.erase(0, nl + 1);
                return line;
            }
            if (!Fill()) return std::nullopt;
        }
    }

    // Exactly `count` bytes; nullopt on end of stream or after kWaitMs.
    std::optional<std::string> ReadBytes(std::size_t count) {
        while (buffer_.size() < count) {
            if (!Fill()) return std::nullopt;
        }
        std::string out = buffer_.substr(0, count);
        buffer_.erase(0, count);
        return out;
    }

    std::string Query(std::string_view message) {
        Send(message);
        return ReadLine().value_or("<no reply>");
    }

    // True when the peer closed the connection.
    bool PeerClosed() { return !Fill() && closed_; }

  private:
    bool Fill() {
        pollfd p{fd_, POLLIN, 0};
        if (::poll(&p, 1, kWaitMs) <= 0) return false;
        char chunk[65536];
        const ssize_t n = ::recv(fd_, chunk, sizeof chunk, 0);
        if (n <= 0) {
            closed_ = true;
            return false;
        }
        buffer_.append(chunk, static_cast<std::size_t>(n));
        return true;
    }

    int fd_ = -1;
    std::string buffer_;
    bool closed_ = false;
};

inline constexpr const char* kNoError = R"(+0,"No error")";

// An emulator of `model` and one client connected to it, with the status
// cleared (the round trip also waits until the emulator serves the client).
struct Session {
    explicit Session(const char* model) : emu(model), client(emu.Start()) {
        client.Query("*CLS;*OPC?");
    }
    Emulator emu;
    ScpiClient client;
};

// A message sent to a fresh emulator of `model` and the error it leaves in
// the queue (null: accepted). The parameterized test Refusals walks them.
struct Refusal {
    const char* model;
    const char* message;
    const char* error;
};
class Refusals : public ::testing::TestWithParam<Refusal> {};
inline constexpr const char* kConflict = R"(-221,"Settings conflict")";
inline constexpr const char* kOutOfRange = R"(-222,"Data out of range")";
inline constexpr const char* kIllegal = R"(-224,"Illegal parameter value")";

// The payload of the definite-length block that answers `query`, its header
// and final line feed checked.
inline std::string ReadBlock(ScpiClient& c, const std::string& query) {
    c.Send(query);
    const auto head = c.ReadBytes(2);
    if (!head || (*head)[0] != '#') return "<bad header>";
    const auto digits = c.ReadBytes(static_cast<std::size_t>((*head)[1] - '0'));
    const auto payload = c.ReadBytes(std::stoul(*digits));
    EXPECT_EQ(c.ReadBytes(1), "\n");
    return payload.value_or("<short block>");
}

}  // namespace qn::emu::test
