// IQuorlen731XXDisplay, IQuorlen731XXCursors (the manual markers),
// IQuorlen731XXExternal (the external trigger input) and
// IQuorlen731XXSetupMemory on the root object.
#include <algorithm>

#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "scope/source_names.h"
#include "scope/waveform_source.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXSetupMemory.def"
#include "members/IQuorlen731XXDisplay.def"
#include "members/IQuorlen731XXCursors.def"
#include "members/IQuorlen731XXExternal.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXDisplay.def"
#include "members/IQuorlen731XXCursors.def"
#include "members/IQuorlen731XXExternal.def"
#include "QnEndMembers.h"

// Longest marker-source reply taken.
constexpr LONG kSourceReplyChars = 1023;
// The external probe attenuation that selects automatic sensing.
constexpr double kAutoSense = -1.0;

const CEnumCommandTable& ExternalUnitsTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXUnitsVolts, "VOLT"},
                                     {"", Quorlen731XXUnitsAmps, "AMP"}};
    return t;
}

// A reply of two-state settings: true exactly when it is `on` (white space
// around it ignored).
HRESULT QueryIs(CDriverNode& node, std::string_view on, VARIANT_BOOL* val) {
    std::string reply;
    HRESULT hr = CDriverIOManager(node).InstrQueryCommand(&reply);
    if (FAILED(hr) && hr != E_IVI_INSTRUMENT_STATUS) return hr;
    constexpr std::string_view kBlanks = " \t\r";
    std::string_view text = reply;
    text.remove_prefix(std::min(text.find_first_not_of(kBlanks), text.size()));
    text.remove_suffix(text.size() - std::min(text.find_last_not_of(kBlanks) + 1, text.size()));
    *val = text == on ? VARIANT_TRUE : VARIANT_FALSE;
    return hr;
}

HRESULT ReadMarkerSource(CDriverNode& node, BSTR* val) {
    std::string reply;
    HRESULT hr = CDriverIOManager(node).InstrQueryCommand(&reply, kSourceReplyChars);
    if (FAILED(hr) && hr != E_IVI_INSTRUMENT_STATUS) return hr;
    *val = com::Utf8ToBstr(SCPIToVirtual(node.Core(), reply, false));
    if (!*val) throw std::bad_alloc();
    return hr;
}

// A marker follows an analog channel that is on screen; anything else is
// refused before a marker command is sent.
HRESULT WriteMarkerSource(CDriverNode& node, std::string_view command, BSTR val) {
    std::string scpi;
    HRESULT hr = VirtualToSCPI(node, com::BstrToUtf8(val), SourceNameRules{}, &scpi);
    if (FAILED(hr)) return hr;
    bool displayed = false;
    hr = IsSourceDisplayed(node, scpi, &displayed);
    if (FAILED(hr)) return hr;
    if (!displayed) return node.Errors().Error(Msg::E_IVISCOPE_CHANNEL_NOT_ENABLED);
    return CDriverIOManager(node).InstrPrintf(command, scpi);
}

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXSetupMemory_Fetch_Body(BSTR*) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"Fetch"});
}

HRESULT Quorlen731XX::IQuorlen731XXSetupMemory_Download_Body(BSTR) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"Download"});
}

HRESULT Quorlen731XX::IQuorlen731XXDisplay_get_Persistence_Body(VARIANT_BOOL* val) {
    return QueryIs(*this, "INF", val);
}

HRESULT Quorlen731XX::IQuorlen731XXDisplay_put_Persistence_Body(VARIANT_BOOL val) {
    return Io(*this).InstrPrintf(IQuorlen731XXDisplay_Persistence_Write,
                                 std::string_view(val != VARIANT_FALSE ? "INF" : "MIN"));
}

HRESULT Quorlen731XX::IQuorlen731XXDisplay_get_PersistTime_Body(BSTR*) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                          {"get_IQuorlen731XXDisplayPersistTime"});
}

HRESULT Quorlen731XX::IQuorlen731XXDisplay_put_PersistTime_Body(BSTR) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                          {"get_IQuorlen731XXDisplayPersistTime"});
}

HRESULT Quorlen731XX::IQuorlen731XXDisplay_Erase_Body() { return SendRowCommand(); }

HRESULT Quorlen731XX::IQuorlen731XXDisplay_Configure_Body(BSTR) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                          {"_IQuorlen731XXDisplayConfigure"});
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_get_Enabled_Body(VARIANT_BOOL* val) {
    return QueryIs(*this, "MAN", val);
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_put_Enabled_Body(VARIANT_BOOL val) {
    return Io(*this).InstrPrintf(IQuorlen731XXCursors_Enabled_Write,
                                 std::string_view(val != VARIANT_FALSE ? "MAN" : "OFF"));
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_get_X1Y1Source_Body(BSTR* val) {
    return ReadMarkerSource(*this, val);
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_put_X1Y1Source_Body(BSTR val) {
    return WriteMarkerSource(*this, IQuorlen731XXCursors_X1Y1Source_Write, val);
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_get_X2Y2Source_Body(BSTR* val) {
    return ReadMarkerSource(*this, val);
}

HRESULT Quorlen731XX::IQuorlen731XXCursors_put_X2Y2Source_Body(BSTR val) {
    return WriteMarkerSource(*this, IQuorlen731XXCursors_X2Y2Source_Write, val);
}

HRESULT Quorlen731XX::IQuorlen731XXExternal_get_ProbeAttenuation_Body(double* val) {
    double& remembered = Core().external_probe_attenuation;
    if (remembered == kAutoSense) {
        *val = kAutoSense;
        return S_OK;
    }
    HRESULT hr = Io(*this).InstrQueryCommand(val);
    if (SUCCEEDED(hr)) remembered = *val;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXExternal_put_ProbeAttenuation_Body(double val) {
    Core().external_probe_attenuation = val;
    if (val == kAutoSense) return S_OK;
    return Io(*this).InstrPrintCommand();
}

HRESULT Quorlen731XX::IQuorlen731XXExternal_get_Units_Body(Quorlen731XXExternalUnitsEnum* val) {
    LONG v = 0;
    HRESULT hr = Io(*this).InstrQueryCommandEnum(ExternalUnitsTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXExternalUnitsEnum>(v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXExternal_put_Units_Body(Quorlen731XXExternalUnitsEnum val) {
    const std::string_view token = ExternalUnitsTokens().TokenOf(Core().Model(), val);
    if (token.empty())
        return Errors().InvalidValue("put_Units", "val", static_cast<std::int32_t>(val));
    return Io(*this).InstrPrintf(IQuorlen731XXExternal_Units_Write, token);
}

}  // namespace qn
