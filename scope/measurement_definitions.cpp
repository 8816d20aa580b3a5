#include "scope/measurement_definitions.h"

#include <limits>

#include "Quorlen731XXErrors.h"
#include "io/enum_command.h"
#include "io/io_manager.h"
#include "scope/measurement_replies.h"
#include "scope/measurement_settings.h"

namespace qn {

namespace {

// Replies of the definition and source queries are read into buffers of
// this size.
constexpr LONG kReplyChars = 127;

const CEnumCommandTable& ReferenceModeTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXMeasurementReferenceModePercent, "PERC"},
                                     {"", Quorlen731XXMeasurementReferenceModeAbsolute, "ABS"}};
    return t;
}

HRESULT Unexpected(CDriverNode& node) {
    return node.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
}

// A signed edge number as slope and occurrence.
void SplitEdge(LONG n, LONG* slope, LONG* occurrence) {
    *slope = n < 0 ? Quorlen731XXMeasurementSlopeNegative : Quorlen731XXMeasurementSlopePositive;
    *occurrence = n >= 0 ? n
                : n == std::numeric_limits<LONG>::min() ? std::numeric_limits<LONG>::max() : -n;
}

}  // namespace

HRESULT GetThresholds(CDriverNode& node, LONG* mode, double* high, double* mid, double* low) {
    std::string reply;
    HRESULT hr = Io(node).InstrQuery(":MEAS:DEF? THR", &reply, kReplyChars);
    if (FAILED(hr)) return hr;
    ThresholdReply t;
    if (!ParseThresholdReply(reply, &t)) return Unexpected(node);
    if (high) *high = t.high;
    if (mid) *mid = t.mid;
    if (low) *low = t.low;
    const std::optional<LONG> m = ReferenceModeTokens().ValueOf(node.Core().Model(), t.mode);
    if (!m) return Unexpected(node);
    if (mode) *mode = *m;
    return hr;
}

HRESULT PutThreshDefine(CDriverNode& node, const ThresholdUpdate& u) {
    LONG mode = 0;
    double high = 0.0, mid = 0.0, low = 0.0;
    if (!u.mode || !u.low || !u.mid || !u.high) {
        HRESULT hr = GetThresholds(node, &mode, &high, &mid, &low);
        if (FAILED(hr)) return hr;
    }
    mode = u.mode.value_or(mode);
    const std::string_view token = ReferenceModeTokens().TokenOf(node.Core().Model(), mode);
    if (token.empty()) return node.Errors().InvalidValue("PutThreshDefine", "val", mode);
    // Levels go out in full precision, like every other double.
    return Io(node).InstrPrintf(":MEAS:DEF THR,%s,%.15g,%.15g,%.15g", token, u.high.value_or(high),
                                u.mid.value_or(mid), u.low.value_or(low));
}

HRESULT GetDelayDefinition(CDriverNode& node, DelayEdges* edges) {
    std::string reply;
    HRESULT hr = Io(node).InstrQuery(":MEAS:DEF? DEL", &reply, kReplyChars);
    if (FAILED(hr)) return hr;
    LONG a = 0, b = 0;
    if (!ParseIntegerPair(reply, &a, &b)) return Unexpected(node);
    SplitEdge(a, &edges->slope1, &edges->occurrence1);
    SplitEdge(b, &edges->slope2, &edges->occurrence2);
    return hr;
}

HRESULT SetDelayDefinition(CDriverNode& node, const DelayUpdate& u) {
    DelayEdges e;
    if (!u.slope1 || !u.slope2 || !u.occurrence1 || !u.occurrence2) {
        HRESULT hr = GetDelayDefinition(node, &e);
        if (FAILED(hr)) return hr;
    }
    const auto slope = [](LONG s) { return static_cast<Quorlen731XXMeasurementSlopeEnum>(s); };
    const LONG edge1 = SignedEdge(slope(u.slope1.value_or(e.slope1)),
                                  u.occurrence1.value_or(e.occurrence1));
    const LONG edge2 = SignedEdge(slope(u.slope2.value_or(e.slope2)),
                                  u.occurrence2.value_or(e.occurrence2));
    CDriverIOManager io(node);
    HRESULT hr = io.InstrWrite(":MEAS:DEL");
    if (SUCCEEDED(hr)) hr = io.InstrWrite(":MEAS:CLE");
    if (SUCCEEDED(hr)) hr = io.InstrPrintf(":MEAS:DEF DEL,%i,%i", edge1, edge2);
    return hr;
}

HRESULT GetSCPIMeasurementSources(CDriverNode& node, std::string* first, std::string* second) {
    std::string reply;
    HRESULT hr = Io(node).InstrQuery(":MEAS:SOUR?", &reply, kReplyChars);
    if (FAILED(hr)) return hr;
    std::string a, b;
    SplitSourcesReply(reply, &a, &b);
    if (first) *first = std::move(a);
    if (second) *second = std::move(b);
    return hr;
}

HRESULT PutSCPIMeasurementSources(CDriverNode& node, const std::optional<std::string>& first,
                                  const std::optional<std::string>& second) {
    if (second && second->find("CHAN") == std::string::npos)
        return node.Errors().InvalidValue("PutSCPIMeasurementSources", "*pBstrSCPISrc2", *second);
    std::string source;
    if (first) {
        source = *first;
    } else {
        HRESULT hr = GetSCPIMeasurementSources(node, &source, nullptr);
        if (FAILED(hr)) return hr;
        // The reply goes back into a command: only a plain name may.
        if (!IsSourceWord(source)) return Unexpected(node);
    }
    CDriverIOManager io(node);
    if (!second) return io.InstrPrintf(":MEAS:SOUR %s", source);
    return io.InstrPrintf(":MEAS:SOUR %s,%s", source, *second);
}

}  // namespace qn
