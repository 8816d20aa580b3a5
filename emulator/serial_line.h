// The emulator's serial line: a pseudo-terminal whose other end a client opens as a serial
// port (ASRL/dev/pts/N::INSTR). Messages and replies are framed as on the raw socket and run
// against the emulator's one instrument.
//
//   qn::emu::Emulator emu("QDS4032A");
//   emu.Start();
//   qn::emu::SerialLine line(emu);            // serves until destroyed
//   ... open "ASRL" + line.path() + "::INSTR" ...
#pragma once

#include <string>
#include <thread>

namespace qn::emu {

class Emulator;

class SerialLine {
  public:
    // Opens the pseudo-terminal and serves it in a background thread. Throws
    // std::system_error when no pseudo-terminal can be set up.
    explicit SerialLine(Emulator& emulator);
    ~SerialLine();
    SerialLine(const SerialLine&) = delete;
    SerialLine& operator=(const SerialLine&) = delete;

    // The terminal a client opens, /dev/pts/N.
    const std::string& path() const { return path_; }

  private:
    void Serve();
    // Waits for `events` on fd; false when the line is stopping.
    bool Wait(int fd, short events, int timeout_ms) const;
    bool WriteAll(std::string_view bytes) const;

    Emulator& emulator_;
    int master_ = -1;
    // The emulator keeps the terminal side open itself, so that a client closing it does not
    // hang up the line for the next one.
    int terminal_ = -1;
    int stop_[2] = {-1, -1};
    std::string path_;
    std::thread thread_;
};

}  // namespace qn::emu
