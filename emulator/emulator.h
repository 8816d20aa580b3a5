// In-process SCPI instrument emulator on a loopback raw socket.
//
//   qn::emu::Emulator emu("QDS2014A");
//   std::uint16_t port = emu.Start();        // 127.0.0.1, ephemeral port
//   ... connect to TCPIP0::127.0.0.1::<port>::SOCKET, messages end with "\n" ...
//   emu.ReceivedMessages();                   // exact text of every message received
//   emu.Stop();
//
// Clients are served one after another: a new connection is accepted when the previous one
// has closed. Faults can be injected at any time from any thread; they apply to the messages
// received after the call.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <fstream>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

namespace qn::emu {

class Instrument;

class Emulator {
  public:
    static constexpr int kAllReplies = -1;

    // Throws std::invalid_argument for a model outside the supported table.
    explicit Emulator(std::string model);
    ~Emulator();
    Emulator(const Emulator&) = delete;
    Emulator& operator=(const Emulator&) = delete;

    // Listens on 127.0.0.1:`port` (0: ephemeral) and serves in a background thread; returns
    // the bound port. Throws std::system_error when the socket cannot be set up.
    std::uint16_t Start(std::uint16_t port = 0);
    // Closes the listener and any client, joins the thread. Idempotent.
    void Stop();
    std::uint16_t port() const { return port_; }
    const std::string& model() const { return model_; }

    // Appends every received message to `path`, one per line (opened in append mode).
    void SetLogFile(const std::string& path);
    std::vector<std::string> ReceivedMessages() const;
    void ClearReceivedMessages();

    // Fault injection.
    void SetReplyDelay(std::chrono::milliseconds delay);
    void SuppressReplies(int count);   // next `count` replies are never sent; kAllReplies: all
    void DropConnectionOnNextQuery();  // the next message holding a query closes the link
    void GarbleReplies(int count);     // next `count` replies have their bytes scrambled
    void ServeWaveformData(std::string raw_bytes);  // sent verbatim for :WAV:DATA?
    void ClearWaveformData();
    void SetForcedEventStatusBits(std::uint8_t bits);  // ORed into *ESR before each message
    void ClearFaults();

  private:
    struct Faults {
        std::chrono::milliseconds delay{0};
        int suppress = 0;
        bool drop_on_query = false;
        int garble = 0;
        std::shared_ptr<const std::string> waveform_data;
        std::uint8_t forced_events = 0;
    };

    void Run();
    void Serve(int client);
    bool HandleMessage(const std::string& message);  // false: close the link
    bool SendReply(int client, std::string reply);
    bool WaitWritable(int fd);
    bool SleepInterruptible(std::chrono::milliseconds duration);
    void LogLocked(const std::string& message);  // mutex_ held

    std::string model_;
    std::unique_ptr<Instrument> instrument_;
    std::uint16_t port_ = 0;
    int listener_ = -1;
    int wake_[2] = {-1, -1};
    std::atomic<bool> stopping_{false};
    std::thread thread_;

    mutable std::mutex mutex_;  // guards the fields below
    Faults faults_;
    std::vector<std::string> received_;
    std::ofstream log_file_;
};

}  // namespace qn::emu
