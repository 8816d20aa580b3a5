// Acquisition, channel and acquisition-control functions of the C API, and
// the names of the repeated-capability items.
#include "IviScope.h"
#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/call.h"
#include "capi/items.h"

using namespace qn;
using namespace qn::capi;

namespace {

// The name of the item at 1-based `index` of the collection `Coll`.
template <class Coll>
ViStatus ItemName(ViSession vi, ViInt32 index, ViInt32 bufferSize, ViChar name[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (bufferSize < 0) return CopyString(vi, std::string_view{}, bufferSize, name);
        TextResult text{bufferSize, name};
        ViStatus status =
            CallOn<Coll>(vi, [&](Coll* c) { return c->get_Name(index, &text.text); });
        return status < 0 ? status : First(status, text.CopyOut(vi));
    });
}

}  // namespace

extern "C" {

ViStatus Qn731XX_ConfigureAcquisitionRecord(ViSession vi, ViReal64 timePerRecord, ViInt32 minNumPts,
                                            ViReal64 acquisitionStartTime) {
    return CallMethod(vi, &IIviScopeAcquisition::ConfigureRecord, timePerRecord, minNumPts,
                      acquisitionStartTime);
}

ViStatus Qn731XX_ConfigureChannel(ViSession vi, ViConstString channel, ViReal64 range,
                                  ViReal64 offset, ViInt32 coupling, ViReal64 probeAttenuation,
                                  ViBoolean enabled) {
    return Guard(vi, [&] {
        return CallOnItem<IIviScopeChannels>(vi, channel, [&](IIviScopeChannel* c) {
            return c->Configure(range, offset, static_cast<IviScopeVerticalCouplingEnum>(coupling),
                                probeAttenuation, enabled ? VARIANT_TRUE : VARIANT_FALSE);
        });
    });
}

ViStatus Qn731XX_ConfigureChanCharacteristics(ViSession vi, ViConstString channel,
                                              ViReal64 inputImpedance, ViReal64 maxInputFrequency) {
    return Guard(vi, [&] {
        return CallOnItem<IIviScopeChannels>(vi, channel, [&](IIviScopeChannel* c) {
            return c->ConfigureCharacteristics(inputImpedance, maxInputFrequency);
        });
    });
}

ViStatus Qn731XX_GetChannelName(ViSession vi, ViInt32 index, ViInt32 bufferSize, ViChar name[]) {
    return ItemName<IIviScopeChannels>(vi, index, bufferSize, name);
}

ViStatus Qn731XX_GetMeasurementName(ViSession vi, ViInt32 index, ViInt32 bufferSize,
                                    ViChar name[]) {
    return ItemName<IQuorlen731XXMeasurements>(vi, index, bufferSize, name);
}

ViStatus Qn731XX_GetDigitalChannelName(ViSession vi, ViInt32 index, ViInt32 bufferSize,
                                       ViChar name[]) {
    return ItemName<IQuorlen731XXDigitalChannels>(vi, index, bufferSize, name);
}

ViStatus Qn731XX_ChannelClearProtection(ViSession vi, ViConstString channel) {
    return Guard(vi, [&] {
        return CallOnItem<IQuorlen731XXChannels>(
            vi, channel, [&](IQuorlen731XXChannel* c) { return c->ClearProtection(); });
    });
}

ViStatus Qn731XX_InitiateAcquisition(ViSession vi) {
    return CallSimple(vi, &IIviScopeMeasurements::Initiate);
}
ViStatus Qn731XX_Abort(ViSession vi) { return CallSimple(vi, &IIviScopeMeasurements::Abort); }
ViStatus Qn731XX_AutoSetup(ViSession vi) {
    return CallSimple(vi, &IIviScopeMeasurements::AutoSetup);
}

ViStatus Qn731XX_AcquisitionStatus(ViSession vi, ViInt32* status) {
    return Guard(vi, [&]() -> ViStatus {
        if (!status) return NullResult(vi, "status");
        IviScopeAcquisitionStatusEnum value = IviScopeAcqStatusUnknown;
        ViStatus s = CallOn<IIviScopeMeasurements>(
            vi, [&](IIviScopeMeasurements* m) { return m->Status(&value); });
        if (s >= 0) *status = value;
        return s;
    });
}

ViStatus Qn731XX_IsInvalidWfmElement(ViSession vi, ViReal64 elementValue, ViBoolean* isInvalid) {
    return Guard(vi, [&]() -> ViStatus {
        if (!isInvalid) return NullResult(vi, "isInvalid");
        VARIANT_BOOL invalid = VARIANT_FALSE;
        ViStatus s = CallOn<IIviScopeMeasurements>(vi, [&](IIviScopeMeasurements* m) {
            return m->IsWaveformElementInvalid(elementValue, &invalid);
        });
        if (s >= 0) *isInvalid = invalid ? VI_TRUE : VI_FALSE;
        return s;
    });
}

}  // extern "C"
