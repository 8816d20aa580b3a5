#include "emulator/instrument.h"

#include <algorithm>
#include <array>
#include <thread>
#include <utility>

#include "emulator/waveform.h"

namespace qn::emu {
namespace {

std::vector<std::span<const CommandSpec>> AllTables() {
    return {CommonCommands(), SystemDataCommands(), ScopeCommands(),
            StatusCommands(), ChannelCommands(),    WaveformCommands(),
            MeasureCommands(), DigitalCommands(), SystemCommands(),
            DisplayCommands(),  TriggerCommands()};
}

CommandTree BuildTree(const ModelInfo& model) {
    const auto tables = AllTables();
    return CommandTree(tables, model.features);
}

// Simulated acquisition time: a few screen widths, kept short for the tests.
std::chrono::milliseconds AcquisitionTime(const ScopeSettings& s) {
    const double sweeps = s.acquire_type == "AVER" ? std::min(s.acquire_count, 64) : 1;
    const double ms = std::clamp(s.time_range * 1e3 * 4.0 * sweeps, 5.0, 200.0);
    return std::chrono::milliseconds(static_cast<long>(ms));
}

}  // namespace

Instrument::Instrument(ModelInfo model)
    : model_(std::move(model)), tree_(BuildTree(model_)), inputs_(DefaultInputs()) {
    base_ = tree_.root();
}

void Instrument::Execute(std::string_view message) {
    Tick();
    if (output_pending()) {
        output_.clear();
        prepared_output_.reset();
        Error(err::kQueryInterrupted);
    }
    base_ = tree_.root();  // every message starts at the root
    base_suffixes_.clear();
    replies_.clear();
    prepared_.reset();
    bool stop = false;
    for (std::string_view text : SplitUnits(message)) {
        UnitParse parsed = ParseUnit(text);
        if (parsed.error) {
            Error(*parsed.error);
            break;  // a command error discards the rest of the message
        }
        if (parsed.unit) ExecuteUnit(*parsed.unit, stop);
        if (stop) break;
    }
    if (replies_.empty()) return;
    if (replies_.size() == 1 && prepared_) {
        // The message's only reply is prepared with its terminator: queued as it is.
        prepared_output_ = std::move(prepared_);
        replies_.clear();
        return;
    }
    if (prepared_) {
        // Among other replies the prepared one is copied, without its terminator.
        for (std::string& r : replies_)
            if (r.empty()) r.assign(*prepared_, 0, prepared_->size() - 1);
        prepared_.reset();
    }
    for (std::size_t i = 0; i < replies_.size(); ++i) {
        if (i > 0) output_ += ';';
        output_ += replies_[i];
    }
    output_ += '\n';
    replies_.clear();
}

void Instrument::ExecuteUnit(const ProgramUnit& unit, bool& stop) {
    const bool from_root = unit.common || unit.absolute;
    const CommandTree::Node* from = from_root ? tree_.root() : base_;
    CommandTree::Match match = tree_.Resolve(from, unit.mnemonics);
    const Handler handler =
        match.node ? (unit.query ? match.node->query : match.node->set) : nullptr;
    if (!handler) {
        Error(err::kUndefinedHeader);
        stop = true;
        return;
    }
    if (match.suffix_out_of_range) {
        Error(err::kSuffixOutOfRange);
        stop = true;
        return;
    }
    Call call;
    if (!from_root) call.suffixes = base_suffixes_;
    call.suffixes.insert(call.suffixes.end(), match.suffixes.begin(), match.suffixes.end());
    call.args = &unit.args;
    handler(*this, call);
    if (unit.query && call.prepared && call.prepared->size() > 1 && !prepared_) {
        // An empty entry stands for the prepared reply until the message ends.
        prepared_ = std::move(call.prepared);
        replies_.emplace_back();
    } else if (unit.query && call.prepared && call.prepared->size() > 1) {
        replies_.emplace_back(*call.prepared, 0, call.prepared->size() - 1);
    } else if (unit.query && !call.reply.empty()) {
        replies_.push_back(std::move(call.reply));
    }
    if (unit.common) return;  // common commands leave the current path alone
    base_ = match.node->parent;
    base_suffixes_ = call.suffixes;
    if (match.node->takes_suffix) base_suffixes_.pop_back();
}

std::string Instrument::TakeOutput() {
    std::string out;
    if (prepared_output_) out = *std::exchange(prepared_output_, nullptr);
    else out.swap(output_);
    return out;
}

std::shared_ptr<const std::string> Instrument::TakeSharedOutput() {
    if (prepared_output_) return std::exchange(prepared_output_, nullptr);
    auto out = std::make_shared<std::string>();
    out->swap(output_);
    return out;
}

void Instrument::Reset() {
    StopAcquisition();
    settings_ = ScopeSettings{};
    opc_armed_ = false;
}

bool Instrument::Save(int slot) {
    if (slot < 0 || slot >= kSetupSlots) return false;
    saved_[static_cast<std::size_t>(slot)] = settings_;
    return true;
}

bool Instrument::Recall(int slot) {
    if (slot < 0 || slot >= kSetupSlots || !saved_[static_cast<std::size_t>(slot)]) return false;
    settings_ = *saved_[static_cast<std::size_t>(slot)];
    return true;
}

void Instrument::StartAcquisition(bool continuous) {
    running_ = true;
    continuous_ = continuous;
    done_at_ = Clock::now() + AcquisitionTime(settings_);
    status_.SetOperationCondition(kOperationRunBit, true);
    if (continuous && TriggerFires(settings_, model_, inputs_)) Capture();
}

void Instrument::StopAcquisition() {
    running_ = false;
    continuous_ = false;
    status_.SetOperationCondition(kOperationRunBit, false);
}

void Instrument::ArmOperationComplete() {
    if (running_ && !continuous_) {
        opc_armed_ = true;
    } else {
        status_.SetEvents(esr::kOperationComplete);
    }
}

void Instrument::WaitForCompletion() {
    if (running_ && !continuous_) std::this_thread::sleep_until(done_at_);
    Tick();
}

void Instrument::Tick() {
    if (!running_ || continuous_ || Clock::now() < done_at_) return;
    // Without a trigger event (normal sweep) a single acquisition stays pending.
    if (!TriggerFires(settings_, model_, inputs_)) return;
    CompleteSingle();
}

void Instrument::BusTrigger() {
    if (!running_) return;  // nothing armed: the trigger is ignored
    if (continuous_) {
        Capture();
        return;
    }
    CompleteSingle();
}

void Instrument::CompleteSingle() {
    Capture();
    StopAcquisition();
    if (opc_armed_) {
        opc_armed_ = false;
        status_.SetEvents(esr::kOperationComplete);
    }
}

void Instrument::Capture() {
    record_ = SynthesizeRecord(settings_, model_, inputs_, ++acquisitions_);
}

}  // namespace qn::emu
