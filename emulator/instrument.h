// The emulated instrument: executes SCPI messages against its settings and status model and
// keeps the output queue. Not thread-safe; the server drives it from one thread.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <optional>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "emulator/command_tree.h"
#include "emulator/models.h"
#include "emulator/scope_state.h"
#include "emulator/status_model.h"

namespace qn::emu {

// Command tables, one per subsystem group.
std::span<const CommandSpec> CommonCommands();
std::span<const CommandSpec> SystemDataCommands();
std::span<const CommandSpec> ScopeCommands();
std::span<const CommandSpec> StatusCommands();
std::span<const CommandSpec> ChannelCommands();
std::span<const CommandSpec> WaveformCommands();
std::span<const CommandSpec> MeasureCommands();
std::span<const CommandSpec> DigitalCommands();
std::span<const CommandSpec> SystemCommands();
std::span<const CommandSpec> DisplayCommands();

// The instrument's clock and front panel: not part of a setup.
struct SystemState {
    std::array<int, 3> date{2026, 1, 1};  // year, month, day
    std::array<int, 3> time{0, 0, 0};     // hours, minutes, seconds
    bool locked = false;                  // front panel locked (:SYST:LOCK)
};
std::span<const CommandSpec> TriggerCommands();

class Instrument {
  public:
    static constexpr int kSetupSlots = 10;

    explicit Instrument(ModelInfo model);

    // Executes one message (without its terminator). A reply still in the output queue when
    // the message arrives is discarded with -410, as IEEE 488.2 6.3.2.3 requires.
    void Execute(std::string_view message);
    bool output_pending() const { return !output_.empty() || prepared_output_ != nullptr; }
    // The queued reply, terminator included; empties the output queue.
    std::string TakeOutput();
    // The same, shared rather than copied when it is a prepared reply.
    std::shared_ptr<const std::string> TakeSharedOutput();

    // Services for the command handlers.
    void Error(ScpiError error) { status_.PushError(error); }
    StatusModel& status() { return status_; }
    ScopeSettings& settings() { return settings_; }
    SystemState& system() { return system_; }
    const ModelInfo& model() const { return model_; }
    bool message_available() const { return output_pending() || !replies_.empty(); }
    void Reset();
    bool Save(int slot);
    bool Recall(int slot);

    // Acquisition engine: a started acquisition runs for a simulated time, then captures a
    // record from the current settings, clears the run bit and completes a pending *OPC.
    void StartAcquisition(bool continuous);
    void StopAcquisition();
    void ArmOperationComplete();
    void WaitForCompletion();  // *OPC?: returns when no single acquisition is running
    void Tick();               // completes an acquisition whose time has passed
    void BusTrigger();         // *TRG: an armed acquisition triggers now
    const AcquiredRecord& record() const { return record_; }
    std::uint32_t acquisitions() const { return acquisitions_; }

    // The signals at the analog inputs (*RST keeps them).
    std::array<InputSignal, kMaxAnalogChannels>& inputs() { return inputs_; }
    // The acquisition count when :ACT last cleared the activity edges.
    std::optional<std::uint32_t>& activity_reset() { return activity_reset_; }

    // Test hook: raw bytes served verbatim as the reply to :WAV:DATA? while set, followed by
    // the terminator (the string holds it as its last byte). Shared, not copied: a large
    // block costs nothing on the other messages and is sent straight from memory.
    void set_waveform_override(std::shared_ptr<const std::string> bytes) {
        waveform_override_ = std::move(bytes);
    }
    const std::shared_ptr<const std::string>& waveform_override() const {
        return waveform_override_;
    }

    // The encoded :WAV:DATA? reply (terminator included) of the last acquisition, and the
    // acquisition and transfer settings it was encoded for: a repeated query sends it again
    // from memory instead of encoding the record afresh.
    struct EncodedBlock {
        std::string key;
        std::shared_ptr<const std::string> reply;
    };
    EncodedBlock& encoded_block() { return encoded_block_; }

  private:
    using Clock = std::chrono::steady_clock;
    void ExecuteUnit(const ProgramUnit& unit, bool& stop);
    void Capture();
    void CompleteSingle();  // captures, ends a single acquisition and completes *OPC

    ModelInfo model_;
    CommandTree tree_;
    StatusModel status_;
    ScopeSettings settings_;
    SystemState system_;
    std::array<std::optional<ScopeSettings>, kSetupSlots> saved_;
    std::string output_;
    std::shared_ptr<const std::string> prepared_output_;  // the queued reply when prepared
    std::vector<std::string> replies_;  // replies of the message being executed
    std::shared_ptr<const std::string> prepared_;  // the message's prepared reply, if any
    const CommandTree::Node* base_ = nullptr;
    std::vector<int> base_suffixes_;

    bool running_ = false;
    bool continuous_ = false;
    bool opc_armed_ = false;
    Clock::time_point done_at_{};
    AcquiredRecord record_;
    std::uint32_t acquisitions_ = 0;
    std::shared_ptr<const std::string> waveform_override_;
    EncodedBlock encoded_block_;
    std::array<InputSignal, kMaxAnalogChannels> inputs_;
    std::optional<std::uint32_t> activity_reset_;
};

}  // namespace qn::emu
