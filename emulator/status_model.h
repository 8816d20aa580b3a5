// IEEE 488.2 status reporting of the emulated instrument: standard event status register with
// its enable mask, service request enable, the SCPI error queue and the operation status
// register (condition, latched events, enable).
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>

#include "emulator/scpi_errors.h"

namespace qn::emu {

// Standard event status register bits (IEEE 488.2 11.5.1).
namespace esr {
inline constexpr std::uint8_t kOperationComplete = 0x01;
inline constexpr std::uint8_t kQueryError = 0x04;
inline constexpr std::uint8_t kDeviceError = 0x08;
inline constexpr std::uint8_t kExecutionError = 0x10;
inline constexpr std::uint8_t kCommandError = 0x20;
inline constexpr std::uint8_t kPowerOn = 0x80;
}  // namespace esr

// Status byte bits (IEEE 488.2 11.2 plus the SCPI error-queue and operation summaries).
namespace stb {
inline constexpr std::uint8_t kErrorQueue = 0x04;
inline constexpr std::uint8_t kMessageAvailable = 0x10;
inline constexpr std::uint8_t kEventSummary = 0x20;
inline constexpr std::uint8_t kRequestService = 0x40;
inline constexpr std::uint8_t kOperationSummary = 0x80;
}  // namespace stb

// Operation status register bit set while an acquisition runs.
inline constexpr std::uint16_t kOperationRunBit = 0x08;

class StatusModel {
  public:
    static constexpr std::size_t kErrorQueueCapacity = 10;

    // Queues an error and sets the event bit of its class: -1xx command, -2xx execution,
    // -3xx device-dependent, -4xx query. A full queue keeps its oldest entries and turns the
    // newest into -350 "Queue overflow".
    void PushError(ScpiError error);
    // Oldest queued error as "<code>,\"<text>\"", or +0,"No error" when the queue is empty.
    std::string PopError();
    std::size_t error_count() const { return errors_.size(); }

    void SetEvents(std::uint8_t bits) { esr_ |= bits; }
    std::uint8_t ReadAndClearEvents();
    std::uint8_t events() const { return esr_; }

    std::uint8_t event_enable() const { return ese_; }
    void set_event_enable(std::uint8_t mask) { ese_ = mask; }
    std::uint8_t request_enable() const { return sre_; }
    // Bit 6 of the service request enable is ignored, as IEEE 488.2 11.3.2.3 requires.
    void set_request_enable(std::uint8_t mask) { sre_ = mask & ~stb::kRequestService; }

    // Operation status register.
    void SetOperationCondition(std::uint16_t bits, bool on);
    std::uint16_t operation_condition() const { return oper_condition_; }
    std::uint16_t ReadAndClearOperationEvents();
    std::uint16_t operation_enable() const { return oper_enable_; }
    void set_operation_enable(std::uint16_t mask) { oper_enable_ = mask; }

    // Overload event enable mask (the register itself never latches in the emulator).
    int overload_enable() const { return overload_enable_; }
    void set_overload_enable(int mask) { overload_enable_ = mask; }

    // Status byte as *STB? reports it; `message_available` is the state of the output queue.
    std::uint8_t StatusByte(bool message_available) const;

    // *CLS: clears the event registers and the error queue, keeps the enable masks.
    void Clear();

  private:
    std::deque<std::string> errors_;
    std::uint8_t esr_ = esr::kPowerOn;
    std::uint8_t ese_ = 0;
    std::uint8_t sre_ = 0;
    std::uint16_t oper_condition_ = 0;
    std::uint16_t oper_event_ = 0;
    std::uint16_t oper_enable_ = 0;
    int overload_enable_ = 0;
};

}  // namespace qn::emu
