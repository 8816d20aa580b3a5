// The limit of the waveform path, for benchmarks: an independent loopback
// server that sends a pre-built definite-length block in one send, and a bare
// reader that fetches it into one reused buffer.
//
// The server answers ":WAV:DATA?" with its block. Any other query is answered
// from a reply table; a query not yet in the table is asked once of a
// `teacher` instrument (the emulator) and its reply kept, so that a driver
// session can be opened against the server while every reply of the fetch
// loop comes from memory. Commands (no '?') are not answered.
#pragma once

#include <poll.h>

#include <atomic>
#include <cstdint>
#include <cstring>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "bench/loopback.h"

namespace qn::bench {

class BlockServer {
  public:
    // `block`: the whole reply to ":WAV:DATA?" ("#<n><len><data>\n").
    // `teacher_port`: the instrument asked for replies not yet known (0: none).
    BlockServer(std::string block, std::uint16_t teacher_port)
        : block_(std::move(block)), teacher_port_(teacher_port) {
        listener_ = ListenLoopback(&port_);
        acceptor_ = std::thread([this] { AcceptLoop(); });
    }
    ~BlockServer() {
        stop_ = true;
        ::shutdown(listener_, SHUT_RDWR);
        acceptor_.join();
        ::close(listener_);
        for (std::thread& t : clients_) t.join();
        if (teacher_ >= 0) ::close(teacher_);
    }
    BlockServer(const BlockServer&) = delete;
    BlockServer& operator=(const BlockServer&) = delete;

    std::uint16_t port() const { return port_; }
    std::string Resource() const {
        return SocketResource(port_);
    }

  private:
    void AcceptLoop() {
        while (!stop_) {
            pollfd p{listener_, POLLIN, 0};
            if (::poll(&p, 1, 100) <= 0) continue;
            const int c = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
            if (c < 0) continue;
            int one = 1;
            ::setsockopt(c, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            clients_.emplace_back([this, c] { Serve(c); });
        }
    }

    void Serve(int fd) {
        std::string pending;
        char buf[4096];
        while (!stop_) {
            pollfd p{fd, POLLIN, 0};
            if (::poll(&p, 1, 100) <= 0) continue;
            const ssize_t r = ::recv(fd, buf, sizeof buf, 0);
            if (r <= 0) break;
            pending.append(buf, std::size_t(r));
            for (std::size_t nl; (nl = pending.find('\n')) != std::string::npos;) {
                const std::string message = pending.substr(0, nl + 1);
                pending.erase(0, nl + 1);
                if (!Answer(fd, message)) break;
            }
        }
        ::close(fd);
    }

    bool Answer(int fd, const std::string& message) {
        if (message.find('?') == std::string::npos) {
            Teach(message, false);
            return true;
        }
        if (message == ":WAV:DATA?\n") return SendAll(fd, block_.data(), block_.size());
        std::string reply;
        {
            std::lock_guard<std::mutex> lock(m_);
            auto it = replies_.find(message);
            if (it != replies_.end()) reply = it->second;
        }
        if (reply.empty()) reply = Teach(message, true);
        return SendAll(fd, reply.data(), reply.size());
    }

    // Passes a message on to the teacher; for a query, keeps its reply.
    std::string Teach(const std::string& message, bool query) {
        std::lock_guard<std::mutex> lock(m_);
        if (teacher_port_ == 0) return query ? "0\n" : "";
        if (teacher_ < 0) teacher_ = ConnectLoopback(teacher_port_);
        std::string reply;
        if (teacher_ < 0 || !SendAll(teacher_, message.data(), message.size())) return "0\n";
        if (!query) return "";
        if (!RecvLine(teacher_, &reply)) return "0\n";
        replies_[message] = reply;
        return reply;
    }

    std::string block_;
    std::uint16_t teacher_port_;
    int teacher_ = -1;
    int listener_ = -1;
    std::uint16_t port_ = 0;
    std::atomic<bool> stop_{false};
    std::thread acceptor_;
    std::vector<std::thread> clients_;
    std::mutex m_;
    std::map<std::string, std::string> replies_;
};

// The least a client can do for one record: send the query, read the
// header, read the data straight into one buffer kept across calls, read the
// final line feed.
class BareReader {
  public:
    explicit BareReader(std::uint16_t port) : fd_(ConnectLoopback(port)) {}
    ~BareReader() {
        if (fd_ >= 0) ::close(fd_);
    }
    BareReader(const BareReader&) = delete;
    BareReader& operator=(const BareReader&) = delete;
    bool ok() const { return fd_ >= 0; }

    // The data bytes of one block, valid until the next Fetch; null on a
    // protocol surprise.
    const std::uint8_t* Fetch(std::size_t* bytes) {
        static const char kQuery[] = ":WAV:DATA?\n";
        if (!SendAll(fd_, kQuery, sizeof kQuery - 1)) return nullptr;
        char head[2];
        if (!RecvAll(fd_, head, 2) || head[0] != '#' || head[1] < '1' || head[1] > '9')
            return nullptr;
        char digits[10] = {};
        if (!RecvAll(fd_, digits, std::size_t(head[1] - '0'))) return nullptr;
        *bytes = std::strtoul(digits, nullptr, 10);
        if (buffer_.size() < *bytes) buffer_.resize(*bytes);
        char end = 0;
        if (!RecvAll(fd_, buffer_.data(), *bytes) || !RecvAll(fd_, &end, 1)) return nullptr;
        return buffer_.data();
    }

  private:
    int fd_;
    std::vector<std::uint8_t> buffer_;
};

}  // namespace qn::bench
