// The general trigger settings: IQuorlen731XXTrigger on the root object.
// Type and Source are kept in the session's trigger shadow; selecting a type
// runs that type's writer, so settings written while another type was
// current reach the instrument now.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/options.h"
#include "core/root.h"
#include "io/enum_command.h"
#include "scope/source_names.h"
#include "scope/trigger_tokens.h"
#include "scope/trigger_writers.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXTrigger.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

namespace cmd {
#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXTrigger.def"
#include "QnEndMembers.h"

constexpr std::string_view kTvSource = ":TRIG:TV:SOUR %s";
constexpr std::string_view kEdgeSource = ":TRIG:EDGE:SOUR %s";
constexpr std::string_view kGlitchSourceQuery = ":TRIG:GLIT:SOUR?";
constexpr std::string_view kTvSourceQuery = ":TRIG:TV:SOUR?";
constexpr std::string_view kRejectQuery = ":TRIG:REJ?";
constexpr std::string_view kNoiseRejectQuery = ":TRIG:NREJ?";
constexpr std::string_view kEarlyOperationQuery = ":OPER?";
constexpr std::string_view kRun = ":RUN";
constexpr std::string_view kStop = ":STOP";
}  // namespace cmd

constexpr LONG kRunBit = 8;  // operation status: acquiring

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXTrigger_get_Type_Body(Quorlen731XXTriggerTypeEnum* val) {
    *val = Core().trigger.type;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_put_Type_Body(Quorlen731XXTriggerTypeEnum val) {
    TriggerShadow& t = Core().trigger;
    const Quorlen731XXTriggerTypeEnum previous = t.type;
    HRESULT hr = S_OK;
    switch (val) {
        case Quorlen731XXTriggerRunt:
            return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"Runt Triggers"});
        case Quorlen731XXTriggerImmediate:
            return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"Immediate Trigger"});
        case Quorlen731XXTriggerEdge:
            t.type = val;
            // The AC-line trigger set the edge source to the line; give the
            // edge trigger its own source back.
            if (previous == Quorlen731XXTriggerACLine) {
                hr = CDriverIOManager(*this).InstrPrintf(cmd::kEdgeSource,
                                                         std::string_view(t.source));
                if (FAILED(hr)) return hr;
            }
            t.edge_pending = true;
            hr = WriteTriggerEdge(*this);
            break;
        case Quorlen731XXTriggerWidth:
            t.type = val;
            t.width_pending = true;
            return WriteTriggerWidth(*this);
        case Quorlen731XXTriggerGlitch:
            t.type = val;
            t.glitch_pending = true;
            return WriteTriggerGlitch(*this);
        case Quorlen731XXTriggerTV:
            t.type = val;
            break;
        case Quorlen731XXTriggerACLine:
            t.type = val;
            hr = static_cast<IQuorlen731XXTriggerAcLine*>(this)->put_Slope(t.ac_line_slope);
            break;
        case Quorlen731XXTriggerPattern:
            t.type = val;
            t.pattern_pending = true;
            return WriteTriggerPattern(*this);
        case Quorlen731XXTriggerState:
            t.type = val;
            t.state_pending = true;
            return WriteTriggerState(*this);
        default:
            return Errors().InvalidValue("put_Type", "val", std::int32_t{val});
    }
    if (FAILED(hr)) return hr;
    const std::string_view token = TriggerTypeTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_Type", "val", std::int32_t{val});
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTrigger_Type_Write, token);
}

// The source of the current type's trigger: the glitch and TV triggers have
// their own.
HRESULT Quorlen731XX::IQuorlen731XXTrigger_get_Source_Body(BSTR* val) {
    Quorlen731XXTriggerTypeEnum type = Quorlen731XXTriggerEdge;
    HRESULT hr = static_cast<IQuorlen731XXTrigger*>(this)->get_Type(&type);
    if (FAILED(hr)) return hr;
    const std::string_view query = type == Quorlen731XXTriggerGlitch ? cmd::kGlitchSourceQuery
                                   : type == Quorlen731XXTriggerTV
                                       ? cmd::kTvSourceQuery
                                       : cmd::IQuorlen731XXTrigger_Source_Read;
    std::string reply;
    hr = CDriverIOManager(*this).InstrQuery(query, &reply, 127);
    if (FAILED(hr)) return hr;
    const std::string_view scpi = TrimBlanks(reply);
    if (!IsInstrumentSourceName(scpi)) return UnexpectedTriggerReply(*this, query, reply);
    *val = com::Utf8ToBstr(SCPIToVirtual(Core(), scpi, false));
    if (!*val) throw std::bad_alloc();
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_put_Source_Body(BSTR val) {
    std::string scpi;
    HRESULT hr = VirtualToSCPI(*this, com::BstrToUtf8(val), {true, true}, &scpi);
    if (FAILED(hr)) return hr;
    CDriverIOManager io(*this);
    const std::string_view name = scpi;
    // The TV trigger takes analog channels only.
    if (scpi.find("CHAN") != std::string::npos) {
        hr = io.InstrPrintf(cmd::kTvSource, name);
        if (FAILED(hr)) return hr;
    }
    hr = io.InstrPrintf(cmd::IQuorlen731XXTrigger_Source_Write, name, name);
    if (SUCCEEDED(hr)) Core().trigger.source = scpi;
    return hr;
}

// The reject filters override the coupling the instrument reports.
HRESULT Quorlen731XX::IQuorlen731XXTrigger_get_Coupling_Body(
    Quorlen731XXTriggerCouplingEnum* val) {
    CDriverIOManager io(*this);
    std::string reject;
    HRESULT hr = io.InstrQuery(cmd::kRejectQuery, &reject, 127);
    if (FAILED(hr)) return hr;
    if (TrimBlanks(reject) == "HFR") {
        *val = Quorlen731XXTriggerCouplingHFReject;
        return hr;
    }
    LONG noise_reject = 0;
    hr = io.InstrQuery(cmd::kNoiseRejectQuery, &noise_reject);
    if (FAILED(hr)) return hr;
    if (noise_reject == 1) {
        *val = Quorlen731XXTriggerCouplingNoiseReject;
        return hr;
    }
    LONG v = 0;
    hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTrigger_Coupling_Read, TriggerCouplingTokens(),
                           &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXTriggerCouplingEnum>(v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_put_Coupling_Body(Quorlen731XXTriggerCouplingEnum val) {
    const std::string_view command = TriggerCouplingCommand(val);
    if (command.empty())
        return Errors().ErrorWithExtra(Msg::E_QUORLEN731XX_SETTINGS_CONFLICT,
                                       "Trigger coupling " + std::to_string(val) +
                                           " cannot be selected.");
    return CDriverIOManager(*this).InstrPrintf(command);
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_get_Modifier_Body(
    Quorlen731XXTriggerModifierEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTrigger_Modifier_Read,
                                   TriggerModifierTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXTriggerModifierEnum>(v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_put_Modifier_Body(Quorlen731XXTriggerModifierEnum val) {
    const std::string_view token = TriggerModifierTokens().TokenOf(Core().Model(), val);
    if (token.empty() ||
        (val == Quorlen731XXTriggerModifierAutoLevel && !Core().features.auto_level_sweep))
        return Errors().InvalidValue("put_Modifier", "val", std::int32_t{val});
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTrigger_Modifier_Write, token);
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_get_Continuous_Body(VARIANT_BOOL* val) {
    const std::string_view query = Core().features.early_family
                                       ? cmd::kEarlyOperationQuery
                                       : cmd::IQuorlen731XXTrigger_Continuous_Read;
    LONG condition = 0;
    HRESULT hr = CDriverIOManager(*this).InstrQuery(query, &condition);
    if (SUCCEEDED(hr)) *val = (condition & kRunBit) ? VARIANT_TRUE : VARIANT_FALSE;
    return hr;
}

// Any non-zero value runs: C callers pass 1 for true.
HRESULT Quorlen731XX::IQuorlen731XXTrigger_put_Continuous_Body(VARIANT_BOOL val) {
    return CDriverIOManager(*this).InstrPrintf(val != VARIANT_FALSE ? cmd::kRun : cmd::kStop);
}

HRESULT Quorlen731XX::IQuorlen731XXTrigger_Configure_Body(Quorlen731XXTriggerTypeEnum Type,
                                                          double Holdoff) {
    IQuorlen731XXTrigger* trigger = this;
    HRESULT hr = trigger->put_Type(Type);
    if (FAILED(hr)) return hr;
    return trigger->put_Holdoff(Holdoff);
}

}  // namespace qn
