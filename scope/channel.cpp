// Analog channels: IQuorlen731XXChannel on the user channel, which carries
// the behaviour, and the class-compliant IIviScopeChannel, which forwards to
// the user channel of the same position.
#include <cstdint>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/member_impl.h"
#include "io/enum_command.h"

namespace qn {

#define QN_CLASS Quorlen731XXUserChannel
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"
#undef QN_CLASS

#define QN_CLASS Quorlen731XXChannel
#include "core/member_definitions_begin.h"
#include "members/IIviScopeChannel.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

namespace cmd {
#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"
}  // namespace cmd

// Replies of the coupling, impedance and protection queries are read into
// buffers of this size.
constexpr LONG kReplyChars = 255;
constexpr double kOneMegohm = 1e6;
constexpr double kFiftyOhm = 50.0;
constexpr double kAutomaticProbe = -1.0;

const CEnumCommandTable& CouplingTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXVerticalCouplingAC, "AC"},
                                     {"", Quorlen731XXVerticalCouplingDC, "DC"},
                                     {"", Quorlen731XXVerticalCouplingGnd, "GND"}};
    return t;
}

const CEnumCommandTable& UnitsTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXVolts, "VOLT"},
                                     {"", Quorlen731XXAmps, "AMP"}};
    return t;
}

// The exact reply looked up in `table`; a reply it does not hold is an
// unexpected response.
HRESULT QueryToken(CDriverNode& node, const CEnumCommandTable& table, LONG* value) {
    std::string reply;
    HRESULT hr = CDriverIOManager(node).InstrQueryCommand(&reply, kReplyChars);
    if (FAILED(hr)) return hr;
    auto v = table.ValueOf(node.Core().Model(), reply);
    if (!v) return node.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    *value = *v;
    return hr;
}

}  // namespace

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_Coupling_Body(
    Quorlen731XXVerticalCouplingEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryToken(*this, CouplingTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXVerticalCouplingEnum>(v);
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_Coupling_Body(
    Quorlen731XXVerticalCouplingEnum val) {
    const std::string_view token = CouplingTokens().TokenOf(Core().Model(), val);
    if (token.empty())
        return Errors().InvalidValue("put_Coupling", "val", static_cast<std::int32_t>(val));
    if (val == Quorlen731XXVerticalCouplingGnd && !Core().features.ground_coupling)
        return Errors().Error(Msg::E_QUORLEN731XX_VERTICAL_GROUND_COUPLING);
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXChannel_Coupling_Write,
                                               CommandNumber(), token);
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_InputImpedance_Body(double* val) {
    std::string reply;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(&reply, kReplyChars);
    if (FAILED(hr)) return hr;
    if (reply == "ONEM")
        *val = kOneMegohm;
    else if (reply == "FIFT")
        *val = kFiftyOhm;
    else
        return Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    return hr;
}

// Only the two input terminations exist, compared without tolerance.
HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_InputImpedance_Body(double val) {
    const char* token = nullptr;
    if (val == kOneMegohm)
        token = "ONEM";
    else if (val == kFiftyOhm && Core().features.fifty_ohm_input)
        token = "FIFT";
    if (!token) return Errors().InvalidValue("put_InputImpedance", "val", val);
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXChannel_InputImpedance_Write,
                                               CommandNumber(), std::string_view(token));
}

// The bandwidth-limit filter is on when the wanted maximum frequency fits
// under it; the instrument then reports the filter's frequency, otherwise
// its full bandwidth.
HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_InputFrequencyMax_Body(double* val) {
    LONG limited = 0;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(&limited);
    if (FAILED(hr)) return hr;
    const FeatureRecord& f = Core().features;
    *val = limited == 1 ? f.bandwidth_limit : f.bandwidth;
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_InputFrequencyMax_Body(double val) {
    const bool limit = val <= Core().features.bandwidth_limit;
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXChannel_InputFrequencyMax_Write,
                                               CommandNumber(),
                                               std::string_view(limit ? "ON" : "OFF"));
}

// While automatic probe sensing is selected (-1 written), the attenuation
// is left to the instrument and the read reports -1 without asking it.
HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_ProbeAttenuation_Body(double* val) {
    if (last_probe_attenuation == kAutomaticProbe) {
        *val = kAutomaticProbe;
        return S_OK;
    }
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(val);
    if (SUCCEEDED(hr)) last_probe_attenuation = *val;
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_ProbeAttenuation_Body(double val) {
    last_probe_attenuation = val;
    if (val == kAutomaticProbe) return S_OK;
    return CDriverIOManager(*this).InstrPrintCommand();
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_ProbeSkew_Body(double* val) {
    if (!Core().features.probe_skew)
        return Errors().Error(Msg::E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED, {"get_ProbeSkew"});
    return CDriverIOManager(*this).InstrQueryCommand(val);
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_ProbeSkew_Body(double) {
    if (!Core().features.probe_skew)
        return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"put_ProbeSkew"});
    return CDriverIOManager(*this).InstrPrintCommand();
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_Protection_Body(
    Quorlen731XXChannelProtectionEnum* val) {
    if (!Core().features.channel_protection)
        return Errors().Error(Msg::E_IVI_VALUE_NOT_SUPPORTED, {"get_Protection", "val",
                                                               "get_Protection"});
    std::string reply;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(&reply, kReplyChars);
    if (SUCCEEDED(hr))
        *val = reply == "NORM" ? Quorlen731XXChannelProtectionOK
                               : Quorlen731XXChannelProtectionTripped;
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_get_Units_Body(
    Quorlen731XXChannelUnitsEnum* val) {
    LONG v = 0;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommandEnum(UnitsTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXChannelUnitsEnum>(v);
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_put_Units_Body(
    Quorlen731XXChannelUnitsEnum val) {
    const std::string_view token = UnitsTokens().TokenOf(Core().Model(), val);
    if (token.empty())
        return Errors().InvalidValue("put_Units", "val", static_cast<std::int32_t>(val));
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXChannel_Units_Write,
                                               CommandNumber(), token);
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_ClearProtection_Body() {
    if (Core().Simulating()) return S_OK;
    if (!Core().features.channel_protection)
        return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"ClearProtection"});
    return CDriverIOManager(*this).InstrPrintCommand();
}

// Each setting is written through its own member; the first failure ends
// the method.
HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_Configure_Body(
    double Range, double Offset, Quorlen731XXVerticalCouplingEnum Coupling,
    double ProbeAttenuation, VARIANT_BOOL Enabled) {
    auto* channel = static_cast<IQuorlen731XXChannel*>(this);
    HRESULT hr = channel->put_ProbeAttenuation(ProbeAttenuation);
    if (SUCCEEDED(hr)) hr = channel->put_Range(Range);
    if (SUCCEEDED(hr)) hr = channel->put_Offset(Offset);
    if (SUCCEEDED(hr)) hr = channel->put_Coupling(Coupling);
    if (SUCCEEDED(hr)) hr = channel->put_Enabled(Enabled);
    return hr;
}

HRESULT Quorlen731XXUserChannel::IQuorlen731XXChannel_ConfigureCharacteristics_Body(
    double InputImpedance, double InputFrequencyMax) {
    auto* channel = static_cast<IQuorlen731XXChannel*>(this);
    HRESULT hr = channel->put_InputImpedance(InputImpedance);
    if (SUCCEEDED(hr)) hr = channel->put_InputFrequencyMax(InputFrequencyMax);
    return hr;
}

// The class-compliant coupling values equal the driver's, value for value.
HRESULT Quorlen731XXChannel::IIviScopeChannel_Configure_Body(double Range, double Offset,
                                                             IviScopeVerticalCouplingEnum Coupling,
                                                             double ProbeAttenuation,
                                                             VARIANT_BOOL Enabled) {
    IQuorlen731XXChannel* target = Counterpart(static_cast<IIviScopeChannel*>(nullptr));
    if (!target) return E_UNEXPECTED;
    return target->Configure(Range, Offset, static_cast<Quorlen731XXVerticalCouplingEnum>(Coupling),
                             ProbeAttenuation, Enabled);
}

}  // namespace qn
