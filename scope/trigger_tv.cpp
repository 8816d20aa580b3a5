// The TV trigger on the root object. Its settings are sent at once; the
// event and the line number are also kept in the trigger shadow, because
// the instrument selects a line through the field it lies in: a new signal
// format or the line-number event sends the line selection again.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/options.h"
#include "core/root.h"
#include "scope/trigger_tokens.h"
#include "scope/trigger_writers.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXTriggerTv.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

namespace cmd {
#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXTriggerTv.def"
#include "QnEndMembers.h"

constexpr std::string_view kLineMode = ":TRIG:TV:MODE LINE";
constexpr std::string_view kField1Line = ":TRIG:TV:MODE LINEF1;:TRIG:TV:LINE %d";
constexpr std::string_view kField2Line = ":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE %d";
constexpr std::string_view kModeQuery = ":TRIGger:TV:MODE?";
}  // namespace cmd

// The line selection of line `n` in signal format `format` while the event
// is the line number: the field-selecting mode and the line within it.
HRESULT SendLineSelection(Quorlen731XX& root, LONG format, LONG n) {
    CDriverIOManager io(root);
    const TvLineCounts lines = TvLinesOf(format);
    switch (format) {
        case Quorlen731XXTVSignalFormatP480:
        case Quorlen731XXTVSignalFormatP720:
        case Quorlen731XXTVSignalFormatP1080:
        case Quorlen731XXTVSignalFormatI1080: {
            HRESULT hr = io.InstrPrintf(cmd::kLineMode);
            if (FAILED(hr)) return hr;
            return io.InstrPrintf(cmd::IQuorlen731XXTriggerTv_LineNumber_Write, n);
        }
        case Quorlen731XXTVSignalFormatPAL:
        case Quorlen731XXTVSignalFormatSECAM:
        case Quorlen731XXTVSignalFormatPALM:
            return io.InstrPrintf(n > lines.per_field ? cmd::kField2Line : cmd::kField1Line, n);
        case Quorlen731XXTVSignalFormatGeneric:
            return io.InstrPrintf(cmd::kField1Line, n);
        case Quorlen731XXTVSignalFormatNTSC:
            // NTSC numbers the second field's lines from 1 again.
            if (n > lines.per_field) return io.InstrPrintf(cmd::kField2Line, n - lines.per_field);
            return io.InstrPrintf(cmd::kField1Line, n);
        default:
            return S_OK;
    }
}

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_put_LineNumber_Body(LONG val) {
    if (val < 1) return Errors().InvalidValue("put_LineNumber", "val", std::int32_t{val});
    Quorlen731XXTVSignalFormatEnum format = Quorlen731XXTVSignalFormatNTSC;
    HRESULT hr = static_cast<IQuorlen731XXTriggerTv*>(this)->get_SignalFormat(&format);
    if (FAILED(hr)) return hr;
    // A line the format does not have would be taken silently by the
    // instrument as some other line.
    if (val > TvLinesOf(format).per_frame)
        return Errors().InvalidValue("put_LineNumber", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    if (t.tv_event == Quorlen731XXTVEventLineNumber)
        hr = SendLineSelection(*this, format, val);
    else
        hr = CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTriggerTv_LineNumber_Write, val);
    t.tv_line = val;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_get_LineNumber_Body(LONG* val) {
    Quorlen731XXTVSignalFormatEnum format = Quorlen731XXTVSignalFormatNTSC;
    HRESULT hr = static_cast<IQuorlen731XXTriggerTv*>(this)->get_SignalFormat(&format);
    if (FAILED(hr)) return hr;
    CDriverIOManager io(*this);
    LONG line = 0;
    hr = io.InstrQuery(cmd::IQuorlen731XXTriggerTv_LineNumber_Read, &line);
    if (FAILED(hr)) return hr;
    if (format == Quorlen731XXTVSignalFormatNTSC) {
        std::string mode;
        hr = io.InstrQuery(cmd::kModeQuery, &mode, 127);
        if (FAILED(hr)) return hr;
        if (TrimBlanks(mode) == "LINEF2") line += TvLinesOf(format).per_field;
    }
    *val = line;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_put_Event_Body(Quorlen731XXTVTriggerEventEnum val) {
    const std::string_view token = TvEventTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_Event", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    t.tv_event = val;
    if (val == Quorlen731XXTVEventLineNumber)
        return static_cast<IQuorlen731XXTriggerTv*>(this)->put_LineNumber(t.tv_line);
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTriggerTv_Event_Write, token);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_get_Event_Body(Quorlen731XXTVTriggerEventEnum* val) {
    std::string reply;
    HRESULT hr =
        CDriverIOManager(*this).InstrQuery(cmd::IQuorlen731XXTriggerTv_Event_Read, &reply, 127);
    if (FAILED(hr)) return hr;
    auto v = TvEventTokens().ValueOf(Core().Model(), NormalizeTvModeReply(reply));
    if (!v) return UnexpectedTriggerReply(*this, cmd::IQuorlen731XXTriggerTv_Event_Read, reply);
    *val = static_cast<Quorlen731XXTVTriggerEventEnum>(*v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_put_SignalFormat_Body(
    Quorlen731XXTVSignalFormatEnum val) {
    const std::string_view token = TvSignalFormatTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_SignalFormat", "val", std::int32_t{val});
    HRESULT hr = CDriverIOManager(*this).InstrPrintf(
        cmd::IQuorlen731XXTriggerTv_SignalFormat_Write, token);
    if (FAILED(hr)) return hr;
    return static_cast<IQuorlen731XXTriggerTv*>(this)->put_LineNumber(Core().trigger.tv_line);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_get_SignalFormat_Body(
    Quorlen731XXTVSignalFormatEnum* val) {
    std::string reply;
    HRESULT hr = CDriverIOManager(*this).InstrQuery(
        cmd::IQuorlen731XXTriggerTv_SignalFormat_Read, &reply, 127);
    if (FAILED(hr)) return hr;
    std::string_view token = TrimBlanks(reply);
    if (token == "NTS") token = "NTSC";
    auto v = TvSignalFormatTokens().ValueOf(Core().Model(), token);
    if (!v)
        return UnexpectedTriggerReply(*this, cmd::IQuorlen731XXTriggerTv_SignalFormat_Read, reply);
    *val = static_cast<Quorlen731XXTVSignalFormatEnum>(*v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_put_polarity_Body(
    Quorlen731XXTVTriggerPolarityEnum val) {
    const std::string_view token = TvPolarityTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_polarity", "val", std::int32_t{val});
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTriggerTv_polarity_Write, token);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_get_polarity_Body(
    Quorlen731XXTVTriggerPolarityEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTriggerTv_polarity_Read,
                                   TvPolarityTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXTVTriggerPolarityEnum>(v);
    return hr;
}

// Configure makes TV the current type in the shadow without sending the
// mode; the members then send the TV settings in order.
HRESULT Quorlen731XX::IQuorlen731XXTriggerTv_Configure_Body(
    BSTR Source, Quorlen731XXTVSignalFormatEnum SignalFormat, Quorlen731XXTVTriggerEventEnum Event,
    Quorlen731XXTVTriggerPolarityEnum polarity) {
    Core().trigger.type = Quorlen731XXTriggerTV;
    IQuorlen731XXTriggerTv* tv = this;
    HRESULT hr = static_cast<IQuorlen731XXTrigger*>(this)->put_Source(Source);
    if (SUCCEEDED(hr)) hr = tv->put_SignalFormat(SignalFormat);
    if (SUCCEEDED(hr)) hr = tv->put_Event(Event);
    if (SUCCEEDED(hr)) hr = tv->put_polarity(polarity);
    return hr;
}

}  // namespace qn
