#include "emulator/status_model.h"

namespace qn::emu {
namespace {

std::uint8_t EventBitOf(int code) {
    if (code <= -100 && code > -200) return esr::kCommandError;
    if (code <= -200 && code > -300) return esr::kExecutionError;
    if (code <= -300 && code > -400) return esr::kDeviceError;
    if (code <= -400 && code > -500) return esr::kQueryError;
    return esr::kDeviceError;  // positive, device-specific errors
}

std::string Format(ScpiError error) {
    return std::to_string(error.code) + ",\"" + error.text + "\"";
}

}  // namespace

void StatusModel::PushError(ScpiError error) {
    esr_ |= EventBitOf(error.code);
    if (errors_.size() < kErrorQueueCapacity) {
        errors_.push_back(Format(error));
        return;
    }
    // SCPI: when the queue is full the most recent entry is replaced by -350.
    esr_ |= EventBitOf(err::kQueueOverflow.code);
    errors_.back() = Format(err::kQueueOverflow);
}

std::string StatusModel::PopError() {
    if (errors_.empty()) return "+0,\"No error\"";
    std::string front = std::move(errors_.front());
    errors_.pop_front();
    return front;
}

std::uint8_t StatusModel::ReadAndClearEvents() {
    const std::uint8_t value = esr_;
    esr_ = 0;
    return value;
}

void StatusModel::SetOperationCondition(std::uint16_t bits, bool on) {
    const std::uint16_t before = oper_condition_;
    oper_condition_ = on ? (before | bits) : (before & ~bits);
    oper_event_ |= oper_condition_ & ~before;  // positive transitions latch
}

std::uint16_t StatusModel::ReadAndClearOperationEvents() {
    const std::uint16_t value = oper_event_;
    oper_event_ = 0;
    return value;
}

std::uint8_t StatusModel::StatusByte(bool message_available) const {
    std::uint8_t value = 0;
    if (!errors_.empty()) value |= stb::kErrorQueue;
    if (message_available) value |= stb::kMessageAvailable;
    if ((esr_ & ese_) != 0) value |= stb::kEventSummary;
    if ((oper_event_ & oper_enable_) != 0) value |= stb::kOperationSummary;
    if ((value & sre_) != 0) value |= stb::kRequestService;
    return value;
}

void StatusModel::Clear() {
    errors_.clear();
    esr_ = 0;
    oper_event_ = 0;
}

}  // namespace qn::emu
