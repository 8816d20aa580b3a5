// In-process SCPI instrument emulator on loopback servers.
//
//   qn::emu::Emulator emu("QDS2014A");
//   emu.EnableVxi11();                        // optional, before Start
//   emu.EnableHislip();                       // optional: TCPIP0::127.0.0.1::hislip0,<emu.hislip_port()>::INSTR
//   std::uint16_t port = emu.Start();        // raw socket on 127.0.0.1, ephemeral port
//   ... connect to TCPIP0::127.0.0.1::<port>::SOCKET, messages end with "\n" ...
//   ... or TCPIP0::127.0.0.1:<emu.vxi11_port()>::inst0::INSTR ...
//   emu.ReceivedMessages();                   // exact text of every message received
//   emu.Stop();
//
// Several clients are served at once, each connection on its own thread; they share the one
// instrument, and each message (or group of messages that arrived together) runs whole.
// Faults can be injected at any time from any thread; they apply to the messages received
// after the call.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <deque>
#include <fstream>
#include <list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace qn::emu {

class Instrument;
class MessageFramer;
struct HislipSession;
struct HislipSessions;
struct Vxi11Links;

class Emulator {
  public:
    static constexpr int kAllReplies = -1;
    static constexpr std::size_t kDefaultLogLimit = 100000;

    // Throws std::invalid_argument for a model outside the supported table.
    explicit Emulator(std::string model);
    ~Emulator();
    Emulator(const Emulator&) = delete;
    Emulator& operator=(const Emulator&) = delete;

    // Servers besides the raw socket; call before Start. VXI-11: the core channel and the
    // abort channel on ephemeral ports. The portmapper (TCP and UDP, `port`) answers where
    // the VXI-11 core channel is; it needs EnableVxi11.
    void EnableVxi11();
    void EnablePortmapper(std::uint16_t port);
    // HiSLIP: both channels of a session on one ephemeral port (hislip_port()).
    void EnableHislip();
    // Connections quiet for this long are closed (0: never, the default).
    void SetIdleTimeout(std::chrono::milliseconds idle);

    // Listens on 127.0.0.1:`port` (0: ephemeral) and the enabled servers, serves in background
    // threads; returns the bound raw-socket port. Throws std::system_error when a socket cannot
    // be set up.
    std::uint16_t Start(std::uint16_t port = 0);
    // Closes the listeners and every client, joins the threads. Idempotent.
    void Stop();
    std::uint16_t port() const { return port_; }
    std::uint16_t vxi11_port() const { return vxi11_port_; }
    std::uint16_t abort_port() const { return abort_port_; }
    std::uint16_t portmapper_port() const { return portmapper_port_; }
    std::uint16_t hislip_port() const { return hislip_port_; }
    const std::string& model() const { return model_; }

    // Appends every received message to `path`, one per line (opened in append mode).
    void SetLogFile(const std::string& path);
    // The newest messages received (at most the log limit), oldest first.
    std::vector<std::string> ReceivedMessages() const;
    void ClearReceivedMessages();
    void SetLogLimit(std::size_t entries);
    // Messages that fell out of the bounded log.
    std::uint64_t DroppedLogEntries() const;

    // Fault injection.
    void SetReplyDelay(std::chrono::milliseconds delay);
    void SuppressReplies(int count);   // next `count` replies are never sent; kAllReplies: all
    void DropConnectionOnNextQuery();  // the next message holding a query closes the link
    void GarbleReplies(int count);     // next `count` replies have their bytes scrambled
    void ServeWaveformData(std::string raw_bytes);  // sent verbatim for :WAV:DATA?
    void ClearWaveformData();
    void SetForcedEventStatusBits(std::uint8_t bits);  // ORed into *ESR before each message
    // VXI-11 reads wait for their reply up to a minute whatever I/O timeout the client gave,
    // as a device busy with a long operation does; only device_abort ends them sooner.
    void OverrunIoTimeouts(bool on);
    bool overruns_io_timeouts() const;
    void ClearFaults();

    // Services of the protocol servers (emulator_*.cpp).

    // Runs the complete messages in `framer` against the instrument, whole; the reply they
    // produced (faults applied) goes to *reply. False: the link is to be closed.
    bool RunMessages(MessageFramer& framer, std::string* reply);
    // The same, the reply shared rather than copied when it is a prepared block (null: none).
    bool RunMessages(MessageFramer& framer, std::shared_ptr<const std::string>* reply);
    // Device clear: drops the instrument's pending output.
    void DeviceClear();
    // The status byte, with message available also while reply_waiting (a reply taken from
    // the instrument and not yet read by the client).
    std::uint8_t StatusByte(bool reply_waiting);
    std::chrono::milliseconds reply_delay() const;
    // Waits up to `duration`; false when the emulator is stopping.
    bool SleepInterruptible(std::chrono::milliseconds duration) const;
    // Waits until fd is readable (true), the idle timeout passes (unless idle_limit is false)
    // or the emulator stops.
    bool WaitReadable(int fd, bool idle_limit = true) const;
    bool WaitWritable(int fd) const;
    bool SendAll(int fd, std::string_view bytes) const;
    bool stopping() const { return stopping_; }
    std::int32_t NewLinkId() { return next_link_++; }

  private:
    struct Faults {
        std::chrono::milliseconds delay{0};
        int suppress = 0;
        bool drop_on_query = false;
        int garble = 0;
        std::shared_ptr<const std::string> waveform_data;
        std::uint8_t forced_events = 0;
        bool overrun_io_timeouts = false;
    };
    enum class Server { kRaw, kVxi11Core, kVxi11Abort, kPortmapper, kHislip };
    struct Listener {
        Server server;
        int fd;
    };
    struct Worker {
        std::thread thread;
        std::shared_ptr<std::atomic<bool>> done;
    };

    int Listen(std::uint16_t port, int type);  // bound loopback socket (listening for TCP)
    void Accept();
    void Spawn(Server server, int client);
    void ReapWorkers(bool all);
    void ServeRaw(int client);
    void ServeVxi11(int client, bool abort_channel);
    void ServePortmapper(int client);
    void AnswerPortmapperDatagram(int fd);
    void ServeHislip(int client);
    void ServeHislipSync(int client, HislipSession& session);
    void ServeHislipAsync(int client, HislipSession& session);
    // An AsyncLock request (waits up to timeout_ms) or release of one session; the response code.
    std::uint8_t ArbitrateLock(std::uint16_t session, std::uint8_t request,
                               std::uint32_t timeout_ms);
    bool HandleMessage(const std::string& message);  // false: close the link
    std::shared_ptr<const std::string> ProduceReply();  // instrument_mutex_ held
    void LogLocked(const std::string& message);      // mutex_ held

    std::string model_;
    std::unique_ptr<Instrument> instrument_;
    std::mutex instrument_mutex_;  // one message group at a time
    std::uint16_t port_ = 0;
    std::uint16_t vxi11_port_ = 0, abort_port_ = 0, portmapper_port_ = 0, hislip_port_ = 0;
    std::shared_ptr<HislipSessions> hislip_sessions_;  // set by EnableHislip
    std::shared_ptr<Vxi11Links> vxi11_links_;          // set by EnableVxi11
    bool vxi11_ = false;
    std::optional<std::uint16_t> portmapper_;
    std::chrono::milliseconds idle_{0};
    std::vector<Listener> listeners_;
    int portmapper_udp_ = -1;
    int wake_[2] = {-1, -1};
    std::atomic<bool> stopping_{false};
    std::atomic<std::int32_t> next_link_{1};
    std::thread acceptor_;
    std::mutex workers_mutex_;
    std::list<Worker> workers_;

    mutable std::mutex mutex_;  // guards the fields below
    Faults faults_;
    std::deque<std::string> received_;
    std::size_t log_limit_ = kDefaultLogLimit;
    std::uint64_t log_dropped_ = 0;
    std::ofstream log_file_;
};

}  // namespace qn::emu
