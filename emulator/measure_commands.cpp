// The :MEASure subsystem: measurement sources, reference levels and delay
// edges, and every automatic measurement, computed from the record the scope
// would send for the source (the last acquisition, or the live signal when
// that did not capture the source). A measurement that cannot be made
// answers 9.9E+37, as the instrument does.
#include <array>
#include <cmath>
#include <optional>

#include "emulator/handler_util.h"
#include "emulator/measure_math.h"
#include "emulator/scope_sources.h"
#include "emulator/waveform.h"

namespace qn::emu {
namespace {

constexpr double kNoResult = 9.9e37;
constexpr int kChannelsPerPod = 8;
constexpr std::array<const char*, 2> kDefinitions = {"THResholds", "DELay"};
constexpr std::array<const char*, 2> kModes = {"PERCent", "ABSolute"};

const SourceRecord* Find(const AcquiredRecord& r, const std::string& source) {
    for (const SourceRecord& s : r.sources)
        if (s.source == source) return &s;
    return nullptr;
}

// The record of `source` in volts (a digital channel as 0/1), or nullopt
// when the source is not displayed.
std::optional<Trace> SourceTrace(Instrument& inst, const std::string& source) {
    if (!IsDisplayed(inst, source)) return std::nullopt;
    const bool digital = source.starts_with("DIG");
    const int d = digital ? std::stoi(source.substr(3)) : 0;
    const std::string held = digital ? "POD" + std::to_string(d / kChannelsPerPod + 1) : source;
    AcquiredRecord live;
    const AcquiredRecord* record = &inst.record();
    if (!record->valid || !Find(*record, held)) {
        live = SynthesizeRecord(inst.settings(), inst.model(), inst.inputs(), 0);
        record = &live;
    }
    const SourceRecord* s = Find(*record, held);
    if (!s) return std::nullopt;
    Trace t;
    t.x0 = record->x_origin;
    t.dx = record->x_increment;
    t.v.reserve(s->raw.size());
    for (std::int16_t code : s->raw)
        t.v.push_back(digital ? static_cast<double>((code >> (d % kChannelsPerPod)) & 1)
                              : code * s->y_increment + s->y_origin);
    return t;
}

// Digital channels are measured at 10/50/90 % of their 0/1 levels. An
// analog signal needs an amplitude of a twentieth of the screen to have
// edges: the trace noise spans a fiftieth.
Thresholds ThresholdsFor(Instrument& inst, const std::string& source) {
    if (source.starts_with("DIG")) return Thresholds{true, 90.0, 50.0, 10.0, 0.5};
    const MeasureSettings& m = inst.settings().measure;
    double range = 0.0;
    if (source.starts_with("CHAN"))
        range = inst.settings().channels[static_cast<std::size_t>(source[4] - '1')].range;
    return Thresholds{m.mode == "PERC", m.high, m.mid, m.low, range / 20.0};
}

// The source of argument `i`, or the default when the query has no such argument.
std::optional<std::string> SourceAt(Instrument& inst, const Call& call, std::size_t i,
                                    const std::string& fallback) {
    if (call.arg_count() <= i) return fallback;
    return SourceArg(inst, call.arg(i));
}

void Reply(Call& call, std::optional<double> v) {
    call.reply = FormatNumber(v && std::isfinite(*v) ? *v : kNoResult);
}

using Plain = std::optional<double> (*)(const Measurer&);

template <Plain F>
void QueryPlain(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 0, 1)) return;
    const auto source = SourceAt(inst, call, 0, inst.settings().measure.source1);
    if (!source) return;
    const auto trace = SourceTrace(inst, *source);
    if (!trace) return Reply(call, std::nullopt);
    Reply(call, F(Measurer(*trace, ThresholdsFor(inst, *source))));
}

std::optional<double> RiseTime(const Measurer& m) { return m.RiseTime(); }
std::optional<double> FallTime(const Measurer& m) { return m.FallTime(); }
std::optional<double> Frequency(const Measurer& m) { return m.Frequency(); }
std::optional<double> Period(const Measurer& m) { return m.Period(); }
std::optional<double> Rms(const Measurer& m) { return m.Rms(); }
std::optional<double> PeakToPeak(const Measurer& m) { return m.PeakToPeak(); }
std::optional<double> Max(const Measurer& m) { return m.Max(); }
std::optional<double> Min(const Measurer& m) { return m.Min(); }
std::optional<double> Top(const Measurer& m) { return m.Top(); }
std::optional<double> Base(const Measurer& m) { return m.Base(); }
std::optional<double> Average(const Measurer& m) { return m.Average(); }
std::optional<double> NegativeWidth(const Measurer& m) { return m.NegativeWidth(); }
std::optional<double> PositiveWidth(const Measurer& m) { return m.PositiveWidth(); }
std::optional<double> DutyCycle(const Measurer& m) { return m.DutyCycle(); }
std::optional<double> Amplitude(const Measurer& m) { return m.Amplitude(); }
std::optional<double> Overshoot(const Measurer& m) { return m.Overshoot(); }
std::optional<double> Preshoot(const Measurer& m) { return m.Preshoot(); }
std::optional<double> TimeAtMax(const Measurer& m) { return m.TimeAtMax(); }
std::optional<double> TimeAtMin(const Measurer& m) { return m.TimeAtMin(); }

// DEL? and PHAS? take two sources (default: the measurement sources).
template <bool kPhase>
void QueryTwoSources(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 0, 2)) return;
    const MeasureSettings& m = inst.settings().measure;
    const auto a = SourceAt(inst, call, 0, m.source1);
    const auto b = a ? SourceAt(inst, call, 1, m.source2) : std::nullopt;
    if (!a || !b) return;
    const auto ta = SourceTrace(inst, *a);
    const auto tb = SourceTrace(inst, *b);
    if (!ta || !tb) return Reply(call, std::nullopt);
    const Measurer ma(*ta, ThresholdsFor(inst, *a)), mb(*tb, ThresholdsFor(inst, *b));
    Reply(call, kPhase ? Phase(ma, mb) : Delay(ma, mb, m.edge1, m.edge2));
}

// VTIM? <time>[,<source>]
void QueryValueAtTime(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1, 2)) return;
    const auto t = NumberArg(inst, call.arg(0));
    const auto source = t ? SourceAt(inst, call, 1, inst.settings().measure.source1) : std::nullopt;
    if (!source) return;
    const auto trace = SourceTrace(inst, *source);
    if (!trace) return Reply(call, std::nullopt);
    Reply(call, Measurer(*trace, ThresholdsFor(inst, *source)).ValueAtTime(*t));
}

// TVAL? <level>,<occurrence>[,<source>]
void QueryTimeAtValue(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 2, 3)) return;
    const auto level = NumberArg(inst, call.arg(0));
    const auto n = level ? IntegerInRange(inst, call.arg(1), -1000000, 1000000) : std::nullopt;
    const auto source = n ? SourceAt(inst, call, 2, inst.settings().measure.source1) : std::nullopt;
    if (!source) return;
    const auto trace = SourceTrace(inst, *source);
    if (!trace) return Reply(call, std::nullopt);
    Reply(call, Measurer(*trace, ThresholdsFor(inst, *source)).TimeAtValue(*level, *n));
}

// TEDG? <occurrence>[,<source>]
void QueryTimeOfEdge(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1, 2)) return;
    const auto n = IntegerInRange(inst, call.arg(0), -1000000, 1000000);
    const auto source = n ? SourceAt(inst, call, 1, inst.settings().measure.source1) : std::nullopt;
    if (!source) return;
    const auto trace = SourceTrace(inst, *source);
    if (!trace) return Reply(call, std::nullopt);
    Reply(call, Measurer(*trace, ThresholdsFor(inst, *source)).EdgeTime(*n));
}

// :MEAS:SOUR <first>[,<second>]: one source replaces the first and keeps the second.
void SetSources(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1, 2)) return;
    const auto a = SourceArg(inst, call.arg(0));
    const auto b = a && call.arg_count() > 1 ? SourceArg(inst, call.arg(1)) : std::nullopt;
    if (!a || (call.arg_count() > 1 && !b)) return;
    inst.settings().measure.source1 = *a;
    if (b) inst.settings().measure.source2 = *b;
}

void QuerySources(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    const MeasureSettings& m = inst.settings().measure;
    call.reply = m.source1 + "," + m.source2;
}

// :MEAS:DEF THR,<mode>,<high>,<mid>,<low> | DEL,<edge1>,<edge2>
void SetDefinition(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 3, 5)) return;
    const auto which = TokenArg(inst, call.arg(0), kDefinitions);
    if (!which) return;
    MeasureSettings& m = inst.settings().measure;
    if (*which == "DEL") {
        if (!ExpectArgs(inst, call, 3)) return;
        const auto a = IntegerInRange(inst, call.arg(1), -1000, 1000);
        const auto b = a ? IntegerInRange(inst, call.arg(2), -1000, 1000) : std::nullopt;
        if (!b) return;
        m.edge1 = *a;
        m.edge2 = *b;
        return;
    }
    if (!ExpectArgs(inst, call, 5)) return;
    const auto mode = TokenArg(inst, call.arg(1), kModes);
    const auto high = mode ? NumberArg(inst, call.arg(2)) : std::nullopt;
    const auto mid = high ? NumberArg(inst, call.arg(3)) : std::nullopt;
    const auto low = mid ? NumberArg(inst, call.arg(4)) : std::nullopt;
    if (!low) return;
    if (!(*high > *mid && *mid > *low)) return inst.Error(err::kDataOutOfRange);
    m.mode = *mode;
    m.high = *high;
    m.mid = *mid;
    m.low = *low;
}

void QueryDefinition(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    const auto which = TokenArg(inst, call.arg(0), kDefinitions);
    if (!which) return;
    const MeasureSettings& m = inst.settings().measure;
    call.reply = *which == "DEL" ? std::to_string(m.edge1) + "," + std::to_string(m.edge2)
                                 : "THR," + m.mode + "," + FormatNumber(m.high) + "," +
                                       FormatNumber(m.mid) + "," + FormatNumber(m.low);
}

// :MEAS:DEL and :MEAS:CLE only change what the screen shows.
void NoEffect(Instrument& inst, Call& call) { NoArgs(inst, call); }

constexpr CommandSpec kMeasure[] = {
    {"MEASure:SOURce", SetSources, QuerySources},
    {"MEASure:DEFine", SetDefinition, QueryDefinition},
    {"MEASure:CLEar", NoEffect, nullptr},
    {"MEASure:RISetime", nullptr, QueryPlain<RiseTime>},
    {"MEASure:FALLtime", nullptr, QueryPlain<FallTime>},
    {"MEASure:FREQuency", nullptr, QueryPlain<Frequency>},
    {"MEASure:PERiod", nullptr, QueryPlain<Period>},
    {"MEASure:VRMS", nullptr, QueryPlain<Rms>},
    {"MEASure:VPP", nullptr, QueryPlain<PeakToPeak>},
    {"MEASure:VMAX", nullptr, QueryPlain<Max>},
    {"MEASure:VMIN", nullptr, QueryPlain<Min>},
    {"MEASure:VTOP", nullptr, QueryPlain<Top>},
    {"MEASure:VBASe", nullptr, QueryPlain<Base>},
    {"MEASure:VAVerage", nullptr, QueryPlain<Average>},
    {"MEASure:NWIDth", nullptr, QueryPlain<NegativeWidth>},
    {"MEASure:PWIDth", nullptr, QueryPlain<PositiveWidth>},
    {"MEASure:DUTYcycle", nullptr, QueryPlain<DutyCycle>},
    {"MEASure:VAMPlitude", nullptr, QueryPlain<Amplitude>},
    {"MEASure:OVERshoot", nullptr, QueryPlain<Overshoot>},
    {"MEASure:PREShoot", nullptr, QueryPlain<Preshoot>},
    {"MEASure:COUNter", nullptr, QueryPlain<Frequency>},
    {"MEASure:XMAX", nullptr, QueryPlain<TimeAtMax>},
    {"MEASure:XMIN", nullptr, QueryPlain<TimeAtMin>},
    {"MEASure:DELay", NoEffect, QueryTwoSources<false>},
    {"MEASure:PHASe", nullptr, QueryTwoSources<true>},
    {"MEASure:VTIMe", nullptr, QueryValueAtTime},
    {"MEASure:TVALue", nullptr, QueryTimeAtValue},
    {"MEASure:TEDGe", nullptr, QueryTimeOfEdge},
};

}  // namespace

std::span<const CommandSpec> MeasureCommands() {
    return kMeasure;
}

}  // namespace qn::emu
