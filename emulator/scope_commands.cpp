// Timebase, acquisition, display and run control, and the :STAT? display query.
#include <array>
#include <cctype>

#include "emulator/handler_util.h"
#include "emulator/scope_sources.h"

namespace qn::emu {
namespace {

constexpr std::array<const char*, 3> kReferences = {"LEFT", "CENTer", "RIGHt"};
constexpr std::array<const char*, 4> kAcquireTypes = {"NORMal", "AVERage", "HRESolution", "PEAK"};
constexpr std::array<const char*, 2> kAcquireModes = {"RTIMe", "ETIMe"};

struct Limits {
    double min;
    double max;
};
constexpr Limits kTimeRange{2e-9, 500.0};       // s, full screen
constexpr Limits kTimePosition{-500.0, 500.0};  // s

template <auto Member, const Limits& L>
void SetNumber(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberInRange(inst, call.arg(0), L.min, L.max)) inst.settings().*Member = *v;
}

template <auto Member>
void QueryNumber(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatNumber(inst.settings().*Member);
}

template <auto Member, const auto& Tokens>
void SetToken(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), Tokens)) inst.settings().*Member = *v;
}

template <auto Member>
void QueryText(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().*Member;
}

template <auto Member>
void SetBool(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = BoolArg(inst, call.arg(0))) inst.settings().*Member = *v;
}

template <auto Member>
void QueryBool(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatBool(inst.settings().*Member);
}

void SetAcquireCount(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 1, 65536)) inst.settings().acquire_count = *v;
}

void QueryAcquireCount(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.settings().acquire_count);
}

void QueryAcquirePoints(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.model().family->max_points);
}

void QuerySampleRate(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    call.reply = FormatNumber(inst.model().family->max_points / inst.settings().time_range);
}

void QueryStat(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (const auto source = SourceArg(inst, call.arg(0))) {
        call.reply = FormatBool(IsDisplayed(inst, *source));
    }
}

// :DIG acquires one record before the next command runs; :SING arms one acquisition that
// completes in the background (run bit of the operation register set meanwhile).
void Digitize(Instrument& inst, Call&) {
    inst.StartAcquisition(false);
    inst.WaitForCompletion();
}

void Single(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.StartAcquisition(false);
}

void Run(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.StartAcquisition(true);
}

void Stop(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.StopAcquisition();
}

// Autoscale: every analog channel on, 1 V/division, a record showing a few periods.
void Autoscale(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    ScopeSettings& s = inst.settings();
    for (int ch = 0; ch < inst.model().analog_channels; ++ch) {
        auto& c = s.channels[static_cast<std::size_t>(ch)];
        c.display = true;
        c.range = 8.0 * c.probe;
        c.offset = 0.0;
    }
    s.time_range = 1e-3;
    s.time_position = 0.0;
}

constexpr CommandSpec kScope[] = {
    {"TIMebase:RANGe", SetNumber<&ScopeSettings::time_range, kTimeRange>,
     QueryNumber<&ScopeSettings::time_range>},
    {"TIMebase:POSition", SetNumber<&ScopeSettings::time_position, kTimePosition>,
     QueryNumber<&ScopeSettings::time_position>},
    {"TIMebase:REFerence", SetToken<&ScopeSettings::time_reference, kReferences>,
     QueryText<&ScopeSettings::time_reference>},
    {"ACQuire:TYPE", SetToken<&ScopeSettings::acquire_type, kAcquireTypes>,
     QueryText<&ScopeSettings::acquire_type>},
    {"ACQuire:COUNt", SetAcquireCount, QueryAcquireCount},
    {"ACQuire:MODE", SetToken<&ScopeSettings::acquire_mode, kAcquireModes>,
     QueryText<&ScopeSettings::acquire_mode>},
    {"ACQuire:POINts", nullptr, QueryAcquirePoints},
    {"ACQuire:SRATe", nullptr, QuerySampleRate},
    {"DISPlay:VECTors", SetBool<&ScopeSettings::vectors>, QueryBool<&ScopeSettings::vectors>},
    {"STATus", nullptr, QueryStat},
    {"DIGitize", Digitize, nullptr},
    {"SINGle", Single, nullptr},
    {"RUN", Run, nullptr},
    {"STOP", Stop, nullptr},
    {"AUToscale", Autoscale, nullptr},
};

}  // namespace

std::span<const CommandSpec> ScopeCommands() {
    return kScope;
}

}  // namespace qn::emu
