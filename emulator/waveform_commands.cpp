// :WAVeform subsystem: source and format selection, preamble and scale queries, and the data
// block served from the record of the last acquisition.
#include <array>
#include <cctype>
#include <memory>
#include <string>

#include "emulator/handler_util.h"
#include "emulator/scope_sources.h"
#include "emulator/waveform.h"

namespace qn::emu {
namespace {

constexpr std::array<const char*, 2> kFormats = {"WORD", "BYTE"};
constexpr std::array<const char*, 2> kByteOrders = {"MSBFirst", "LSBFirst"};
constexpr std::array<const char*, 1> kMaximum = {"MAXimum"};

TransferScale Scale(Instrument& inst) {
    return ComputeScale(inst.settings(), inst.record(), inst.model());
}

void SetSource(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto source = SourceArg(inst, call.arg(0))) inst.settings().waveform_source = *source;
}
void QuerySource(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().waveform_source;
}

void SetFormat(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), kFormats)) inst.settings().waveform_format = *v;
}
void QueryFormat(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().waveform_format;
}

void SetUnsigned(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = BoolArg(inst, call.arg(0))) inst.settings().waveform_unsigned = *v;
}
void QueryUnsigned(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatBool(inst.settings().waveform_unsigned);
}

void SetByteOrder(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), kByteOrders)) {
        inst.settings().waveform_byte_order = *v;
    }
}
void QueryByteOrder(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().waveform_byte_order;
}

// :WAV:POIN <n> | MAX | MAX,<n> (the counted form only on models with the "DEC" feature).
// Counts above the record length are coerced to it.
void SetPoints(Instrument& inst, Call& call) {
    const bool counted = inst.model().Has(kFeatCountedMax);
    if (!ExpectArgs(inst, call, 1, counted ? 2 : 1)) return;
    const int max_points = inst.model().family->max_points;
    const Argument& first = call.arg(0);
    std::optional<int> points;
    if (first.kind == Argument::Kind::kText &&
        std::isalpha(static_cast<unsigned char>(first.value[0]))) {
        if (!TokenArg(inst, first, kMaximum)) return;
        points = max_points;
        if (call.arg_count() == 2) points = IntegerInRange(inst, call.arg(1), 1, 1 << 30);
    } else if (call.arg_count() == 1) {
        points = IntegerInRange(inst, first, 1, 1 << 30);
    } else {
        inst.Error(err::kParameterNotAllowed);
    }
    if (points) inst.settings().waveform_points = std::min(*points, max_points);
}
void QueryPoints(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(Scale(inst).points);
}

void QueryPreamble(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatPreamble(Scale(inst));
}

template <auto Member>
void QueryScale(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatNumber(Scale(inst).*Member);
}

void QueryYReference(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(Scale(inst).y_reference);
}

void QueryType(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    constexpr std::array<const char*, 4> kTypes = {"NORM", "PEAK", "AVER", "HRES"};
    call.reply = kTypes[static_cast<std::size_t>(Scale(inst).type)];
}

// Data of the selected source from the last acquisition; without one (nothing acquired, or
// the source was off then) the query fails with -221 and sends nothing.
void QueryData(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    if (inst.waveform_override()) {
        call.prepared = inst.waveform_override();
        return;
    }
    // Everything the encoding depends on: the acquisition that made the record, and the
    // transfer settings.
    const ScopeSettings& s = inst.settings();
    const std::string key = std::to_string(inst.acquisitions()) + ' ' + s.waveform_source + ' ' +
                            s.waveform_format + ' ' + (s.waveform_unsigned ? '1' : '0') + ' ' +
                            s.waveform_byte_order + ' ' + std::to_string(s.waveform_points);
    Instrument::EncodedBlock& cache = inst.encoded_block();
    if (!cache.reply || cache.key != key) {
        auto block = EncodeWaveformBlock(s, inst.record(), inst.model());
        if (!block) {
            inst.Error(err::kSettingsConflict);
            return;
        }
        block->push_back('\n');
        cache = {key, std::make_shared<const std::string>(std::move(*block))};
    }
    call.prepared = cache.reply;
}

constexpr CommandSpec kWaveform[] = {
    {"WAVeform:SOURce", SetSource, QuerySource},
    {"WAVeform:FORMat", SetFormat, QueryFormat},
    {"WAVeform:UNSigned", SetUnsigned, QueryUnsigned},
    {"WAVeform:BYTeorder", SetByteOrder, QueryByteOrder},
    {"WAVeform:POINts", SetPoints, QueryPoints},
    {"WAVeform:PREamble", nullptr, QueryPreamble},
    {"WAVeform:XINCrement", nullptr, QueryScale<&TransferScale::x_increment>},
    {"WAVeform:XORigin", nullptr, QueryScale<&TransferScale::x_origin>},
    {"WAVeform:YINCrement", nullptr, QueryScale<&TransferScale::y_increment>},
    {"WAVeform:YORigin", nullptr, QueryScale<&TransferScale::y_origin>},
    {"WAVeform:YREFerence", nullptr, QueryYReference},
    {"WAVeform:TYPE", nullptr, QueryType},
    {"WAVeform:DATA", nullptr, QueryData},
};

}  // namespace

std::span<const CommandSpec> WaveformCommands() {
    return kWaveform;
}

}  // namespace qn::emu
