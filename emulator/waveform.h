// Synthesised acquisitions and their transfer encoding.
//
// An acquisition captures every displayed source at the family's full record length: analog
// channels carry a sine (odd channels) or a square wave (even channels) plus noise, scaled by
// the channel's range, offset, coupling and inversion; pods carry a binary counter. A transfer
// decimates the record to the requested point count (min/max pairs for a peak record) and
// encodes it as WORD (16-bit) or BYTE (8-bit) codes.
#pragma once

#include <cstdint>
#include <array>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "emulator/models.h"
#include "emulator/scope_state.h"

namespace qn::emu {

// The time (s) added to the signal time of every channel so that the configured edge trigger
// fires at time 0 (the trigger point of the record): the configured level crossed with the
// configured slope by the input of an analog trigger source. 0 for triggers the emulator does
// not model; nullopt when the edge trigger never fires (level outside the signal, grounded
// source).
std::optional<double> EdgeTriggerShift(const ScopeSettings& settings, const ModelInfo& model,
                                       std::span<const InputSignal> inputs);
// Whether an acquisition triggers: the edge trigger fires, or the sweep triggers by itself.
bool TriggerFires(const ScopeSettings& settings, const ModelInfo& model,
                  std::span<const InputSignal> inputs);

// `acquisition` numbers the acquisition and seeds its noise.
// The signal of each analog input is `inputs[channel - 1]`; the record is aligned to the
// trigger (EdgeTriggerShift), free-running when the trigger never fires.
AcquiredRecord SynthesizeRecord(const ScopeSettings& settings, const ModelInfo& model,
                                std::span<const InputSignal> inputs, std::uint32_t acquisition);

// The inputs of a fresh emulator: odd channels a sine, even channels a square
// wave, channel n at (n + 1) kHz with 2.4 V peak (4.8 V peak-to-peak).
std::array<InputSignal, kMaxAnalogChannels> DefaultInputs();

// One byte per point of pod `pod`: pod 1 counts (bit 0 is a clock at half
// the count rate, bit 7 the slowest), pod 2 carries a clock on bit 0, a
// serial line sending "QN" repeatedly (idle high, start bit, eight data bits
// least significant first, stop bit) on bit 1 and the inverted count on the
// other bits.
std::vector<std::int16_t> PodPattern(int pod, int length);

// Scaling of a transfer in the current :WAV:FORM/UNS settings.
struct TransferScale {
    int format = 1;  // 0 BYTE, 1 WORD
    int type = 0;    // 0 NORM, 1 PEAK, 2 AVER, 3 HRES
    int points = 0;
    int count = 1;
    double x_increment = 0.0;
    double x_origin = 0.0;
    double y_increment = 0.0;
    double y_origin = 0.0;
    int y_reference = 0;
};

// Scale of the selected source: from the record when it holds the source, else from the
// current settings.
TransferScale ComputeScale(const ScopeSettings& settings, const AcquiredRecord& record,
                           const ModelInfo& model);
// "format,type,points,count,xinc,xorigin,xref,yinc,yorigin,yref".
std::string FormatPreamble(const TransferScale& scale);
// The IEEE 488.2 block with the selected source's data; nullopt when the record does not hold
// that source.
std::optional<std::string> EncodeWaveformBlock(const ScopeSettings& settings,
                                               const AcquiredRecord& record,
                                               const ModelInfo& model);
// Wraps raw bytes in a definite-length block header.
std::string MakeBlock(const std::string& payload);

}  // namespace qn::emu
