// Bodies of the inherent IVI operations of the root object.
#include "core/inherent.h"

#include <climits>

#include "core/models.h"
#include "core/root.h"

namespace qn {

bool SessionFlags::*FlagMember(int which) {
    static constexpr bool SessionFlags::*kMembers[kFlagCount] = {
        &SessionFlags::cache,           &SessionFlags::interchange_check,
        &SessionFlags::query_instrument_status, &SessionFlags::range_check,
        &SessionFlags::record_coercions, &SessionFlags::simulate};
    return kMembers[which];
}

std::string GroupCapabilities() {
    std::string caps =
        "IviScopeBase,IviScopeInterpolation,IviScopeTVTrigger,IviScopeGlitchTrigger,"
        "IviScopeWidthTrigger,IviScopeAcLineTrigger,IviScopeWaveformMeas,"
        "IviScopeMinMaxWaveform,IviScopeProbeAutoSense,IviScopeContinuousAcquisition,"
        "IviScopeAverageAcquisition,IviScopeSampleMode,IviScopeTriggerModifier,"
        "IviScopeAutoSetup";
    // The stored list carries the group's old name; callers get the current one.
    static constexpr std::string_view kOld = "IviScopeWaveformMeas,";
    auto at = caps.find(kOld);
    if (at != std::string::npos) caps.replace(at, kOld.size() - 1, "IviScopeWaveformMeasurement");
    return caps;
}

const std::string& SupportedInstrumentModels() {
    return CSupportedModelValidator::Instance().ModelList();
}

std::string InstrumentManufacturer(const SessionCore& core) {
    if (core.Simulating()) return std::string(kDriverVendor);
    return core.session.identity.manufacturer;
}

std::string InstrumentFirmwareRevision(const SessionCore& core) {
    if (core.Simulating()) return "Sim" + std::string(kDriverRevision);
    return core.session.identity.firmware_revision;
}

HRESULT Quorlen731XX::SetFlag(int which, bool value) {
    SessionFlags& f = Core().session.flags;
    switch (which) {
        case kFlagCache:
            f.cache = value;
            if (!value) InvalidateAll();
            return S_OK;
        case kFlagInterchangeCheck:
            if (value)
                return Errors().Error(Msg::E_IVI_VALUE_NOT_SUPPORTED,
                                      {"VARIANT_TRUE", "bInterchangeCheck", "put_InterchangeCheck"});
            f.interchange_check = false;
            return S_OK;
        case kFlagQueryInstrumentStatus:
            f.query_instrument_status = value;
            if (value && !f.simulate) return ClearStatus();
            return S_OK;
        case kFlagSimulate:
            if (!value && Core().session.snapshot.simulate)
                return Errors().Error(Msg::E_IVI_CANNOT_CHANGE_SIMULATION_STATE);
            f.simulate = value;
            return S_OK;
        default:
            f.*FlagMember(which) = value;
            return S_OK;
    }
}

HRESULT Quorlen731XX::NextCoercionRecord(BSTR* record) {
    if (!Core().session.flags.record_coercions) return S_OK;
    std::string text = Core().coercions.GetNext();
    *record = com::Utf8ToBstr(text);
    if (!*record) throw std::bad_alloc();
    return S_OK;
}

HRESULT Quorlen731XX::ResetBody() {
    HRESULT hr = S_OK;
    if (!Core().Simulating()) {
        LONG reply = 0;
        hr = QueryInteger(kResetCommand, kResetTimeoutMs, &reply);
        if (FAILED(hr)) return hr;
    }
    // The instrument's probes are back at their defaults: the remembered
    // attenuations (automatic sensing among them) no longer hold.
    ResetChildren();
    Core().external_probe_attenuation = 1.0;
    Cache().InvalidateAll();
    return hr;
}

HRESULT Quorlen731XX::ResetWithDefaultsBody() {
    HRESULT hr = ResetBody();
    if (FAILED(hr)) return hr;
    const SessionFlags snapshot = Core().session.snapshot;
    for (int which = 0; which < kFlagCount; ++which) {
        HRESULT h = SetFlag(which, snapshot.*FlagMember(which));
        if (FAILED(h)) return h;
    }
    return hr;
}

HRESULT Quorlen731XX::DisableBody() {
    if (Core().Simulating()) return S_OK;
    LONG reply = 0;
    return QueryInteger(kResetCommand, kResetTimeoutMs, &reply);
}

HRESULT Quorlen731XX::SelfTestBody(LONG* result, BSTR* message) {
    LONG r = 0;
    if (!Core().Simulating()) {
        HRESULT hr = QueryInteger(kSelfTestCommand, kResetTimeoutMs, &r);
        if (FAILED(hr)) return hr;
    }
    *result = r;
    *message = com::Utf8ToBstr(r == 0 ? "Selftest passed" : "Selftest failed");
    if (!*message) throw std::bad_alloc();
    return S_OK;
}

HRESULT Quorlen731XX::ErrorQueryBody(LONG* code, BSTR* message) {
    if (Core().Simulating()) {
        *code = 0;
        *message = com::Utf8ToBstr("No error.");
        if (!*message) throw std::bad_alloc();
        return S_OK;
    }
    std::string reply;
    HRESULT hr = QueryErrorText(&reply);
    if (FAILED(hr)) return hr;
    long c = 0;
    std::string text;
    if (!ParseErrorQueryReply(reply, &c, &text))
        return Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    *code = static_cast<LONG>(c);
    *message = com::Utf8ToBstr(text);
    if (!*message) throw std::bad_alloc();
    return S_OK;
}

}  // namespace qn
