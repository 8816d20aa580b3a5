// :DISPlay labels, persistence and screen image, :CDISplay, the manual markers (:MARKer) and
// the external trigger input (:EXTernal).
#include <array>
#include <string>

#include "emulator/handler_util.h"
#include "emulator/scope_sources.h"
#include "emulator/screen_bitmap.h"
#include "emulator/waveform.h"

namespace qn::emu {
namespace {

constexpr std::array<const char*, 2> kPersistence = {"MINimum", "INFinite"};
constexpr std::array<const char*, 2> kMarkerModes = {"OFF", "MANual"};
constexpr std::array<const char*, 2> kUnits = {"VOLT", "AMPere"};
constexpr std::array<const char*, 1> kImageFormats = {"BMP"};
constexpr std::array<const char*, 2> kImageAreas = {"SCReen", "GRATicule"};
constexpr double kMarkerLimit = 1e9;  // s or V either side of zero
constexpr double kProbeMin = 0.001, kProbeMax = 10000.0;

// Handlers of one field of the settings: a token, a number within limits, a boolean.
template <auto Field, const auto& Tokens>
void SetToken(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), Tokens)) inst.settings().*Field = *v;
}
template <auto Field>
void QueryText(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().*Field;
}
template <auto Field>
void SetBool(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = BoolArg(inst, call.arg(0))) inst.settings().*Field = *v;
}
template <auto Field>
void QueryBool(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatBool(inst.settings().*Field);
}

template <double MarkerSettings::*Field>
void SetMarker(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberInRange(inst, call.arg(0), -kMarkerLimit, kMarkerLimit)) {
        inst.settings().markers.*Field = *v;
    }
}
template <double MarkerSettings::*Field>
void QueryMarker(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatNumber(inst.settings().markers.*Field);
}

// Markers follow analog channels only. The header "X1Y1" reads as "X1Y" with suffix 1, so the
// short forms take a suffix that must be the marker's own number.
template <std::string MarkerSettings::*Field>
void SetMarkerSource(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    const auto source = SourceArg(inst, call.arg(0));
    if (!source) return;
    if (!source->starts_with("CHAN")) {
        inst.Error(err::kIllegalParameter);
        return;
    }
    inst.settings().markers.*Field = *source;
}
template <std::string MarkerSettings::*Field>
void QueryMarkerSource(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().markers.*Field;
}
template <int Marker, Handler H>
void ForMarker(Instrument& inst, Call& call) {
    if (!call.suffixes.empty() && call.suffixes.back() != Marker) {
        inst.Error(err::kSuffixOutOfRange);
        return;
    }
    H(inst, call);
}
constexpr Handler kSetX1Y1 = SetMarkerSource<&MarkerSettings::x1y1_source>;
constexpr Handler kSetX2Y2 = SetMarkerSource<&MarkerSettings::x2y2_source>;
constexpr Handler kQueryX1Y1 = QueryMarkerSource<&MarkerSettings::x1y1_source>;
constexpr Handler kQueryX2Y2 = QueryMarkerSource<&MarkerSettings::x2y2_source>;

void SetMarkerMode(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), kMarkerModes)) inst.settings().markers.mode = *v;
}
void QueryMarkerMode(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.settings().markers.mode;
}

void SetExternalProbe(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberInRange(inst, call.arg(0), kProbeMin, kProbeMax)) {
        inst.settings().external_probe = *v;
    }
}
void QueryExternalProbe(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatNumber(inst.settings().external_probe);
}

void ClearDisplay(Instrument& inst, Call& call) {
    NoArgs(inst, call);
}

// The screen as a BMP block, drawn from the last record (a fresh one before the first
// acquisition).
void QueryScreen(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 2)) return;
    if (!TokenArg(inst, call.arg(0), kImageFormats) || !TokenArg(inst, call.arg(1), kImageAreas)) {
        return;
    }
    const AcquiredRecord& last = inst.record();
    const std::string image =
        last.valid ? RenderScreenBitmap(inst.settings(), last)
                   : RenderScreenBitmap(inst.settings(),
                                        SynthesizeRecord(inst.settings(), inst.model(),
                                                         inst.inputs(), 1));
    call.reply = MakeBlock(image);
}

constexpr CommandSpec kDisplay[] = {
    {"DISPlay:LABel", SetBool<&ScopeSettings::labels>, QueryBool<&ScopeSettings::labels>},
    {"DISPlay:PERSistence", SetToken<&ScopeSettings::persistence, kPersistence>,
     QueryText<&ScopeSettings::persistence>},
    {"DISPlay:DATA", nullptr, QueryScreen},
    {"CDISplay", ClearDisplay, nullptr},
    {"MARKer:MODE", SetMarkerMode, QueryMarkerMode},
    {"MARKer:X1Position", SetMarker<&MarkerSettings::x1>, QueryMarker<&MarkerSettings::x1>},
    {"MARKer:X2Position", SetMarker<&MarkerSettings::x2>, QueryMarker<&MarkerSettings::x2>},
    {"MARKer:Y1Position", SetMarker<&MarkerSettings::y1>, QueryMarker<&MarkerSettings::y1>},
    {"MARKer:Y2Position", SetMarker<&MarkerSettings::y2>, QueryMarker<&MarkerSettings::y2>},
    {"MARKer:X1Y#", ForMarker<1, kSetX1Y1>, ForMarker<1, kQueryX1Y1>},
    {"MARKer:X2Y#", ForMarker<2, kSetX2Y2>, ForMarker<2, kQueryX2Y2>},
    {"MARKer:X1Y1SOURCE", kSetX1Y1, kQueryX1Y1},
    {"MARKer:X2Y2SOURCE", kSetX2Y2, kQueryX2Y2},
    {"EXTernal:PROBe", SetExternalProbe, QueryExternalProbe},
    {"EXTernal:UNITs", SetToken<&ScopeSettings::external_units, kUnits>,
     QueryText<&ScopeSettings::external_units>},
};

}  // namespace

std::span<const CommandSpec> DisplayCommands() {
    return kDisplay;
}

}  // namespace qn::emu
