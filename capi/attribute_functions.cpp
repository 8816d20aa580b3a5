// The ten typed attribute functions and the attribute shortcuts. The checks
// come first and in a fixed order (known ID, type, writable), then the
// property is reached through the session's driver object or one of its
// channel items and called through its full frame.
#include <string>

#include "IviDriver.h"
#include "IviScope.h"
#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/attribute_table.h"
#include "capi/c_session.h"
#include "capi/items.h"
#include "core/root_factory.h"

using namespace qn;
using namespace qn::capi;

namespace {

enum class Access { kGet, kSet };

ViStatus CheckAttribute(ViSession vi, ViAttr id, CType type, Access access, Attribute* out) {
    *out = FindAttribute(id);
    if (!out->row || !out->property)
        return Fail(vi, kAttributeNotRecognized, "Attribute not recognized.");
    if (type != out->property->type)
        return Fail(vi, kAttributeWrongType, access == Access::kGet
                                                 ? "Incorrect GetAttribute for attribute of this type."
                                                 : "Incorrect SetAttribute for attribute of this type.");
    if (access == Access::kSet && !out->property->put)
        return Fail(vi, kAttributeReadOnly, "Attribute is read only.");
    if (access == Access::kGet && !out->property->get)
        return Fail(vi, kFailure, "Attribute is write only.");
    return VI_SUCCESS;
}

// The interface pointer that carries the attribute's property: the driver's
// own interface, or the channel item the selector names; *hold keeps an item
// the session does not cache.
ViStatus TargetOf(ViSession vi, SessionData& session, const Attribute& attr, ViConstString selector,
                  ComPtr<IUnknown>* hold, IUnknown** itf) {
    switch (attr.row->scope) {
        case Scope::kSession:
            return Convert(vi, session.Interface(*attr.property->iid, attr.interface_slot, itf));
        case Scope::kChannel:
            return CachedItemOf<IIviScopeChannels>(vi, session, selector, hold, itf);
        case Scope::kUserChannel:
            return CachedItemOf<IQuorlen731XXChannels>(vi, session, selector, hold, itf);
        case Scope::kDigitalChannel:
            return CachedItemOf<IQuorlen731XXDigitalChannels>(vi, session, selector, hold, itf);
    }
    return kFailure;
}

// The driver's own identity can be read without a session: a temporary,
// uninitialized driver object answers it.
bool ReadableWithoutSession(ViAttr id) {
    switch (id) {
        case IVI_ATTR_SPECIFIC_DRIVER_VENDOR:
        case IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION:
        case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION:
        case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION:
        case IVI_ATTR_SPECIFIC_DRIVER_REVISION: return true;
        default: return false;
    }
}

ViStatus SessionFor(ViSession vi, ViAttr id, Access access, SessionRef* session) {
    if (vi == 0 && access == Access::kGet && ReadableWithoutSession(id)) {
        ComPtr<IUnknown> driver;
        if (FAILED(CreateQuorlen731XX(nullptr, iid_of<IUnknown>, driver.OutVoid())))
            return Fail(0, kFailure, "The driver object could not be created.");
        session->reset(new SessionData(driver.get(), false));
        return VI_SUCCESS;
    }
    return SessionOf(vi, session);
}

// `result` is the caller's result variable, checked before anything is sent.
ViStatus GetAttribute(ViSession vi, ViConstString selector, ViAttr id, CType type, AttrValue* value,
                      const void* result) {
    Attribute attr;
    ViStatus status = CheckAttribute(vi, id, type, Access::kGet, &attr);
    if (status != VI_SUCCESS) return status;
    if (!result) return NullResult(vi, "value");
    SessionRef session;
    status = SessionFor(vi, id, Access::kGet, &session);
    if (status != VI_SUCCESS) return status;
    ComPtr<IUnknown> hold;
    IUnknown* itf = nullptr;
    status = TargetOf(vi, *session.get(), attr, selector, &hold, &itf);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, attr.property->get(itf, value));
}

ViStatus SetAttribute(ViSession vi, ViConstString selector, ViAttr id, CType type,
                      const AttrValue& value) {
    Attribute attr;
    ViStatus status = CheckAttribute(vi, id, type, Access::kSet, &attr);
    if (status != VI_SUCCESS) return status;
    SessionRef session;
    status = SessionFor(vi, id, Access::kSet, &session);
    if (status != VI_SUCCESS) return status;
    ComPtr<IUnknown> hold;
    IUnknown* itf = nullptr;
    status = TargetOf(vi, *session.get(), attr, selector, &hold, &itf);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, attr.property->put(itf, value));
}

// A getter of a number-like type: the value is copied after success.
template <class T, class Pick>
ViStatus GetNumber(ViSession vi, ViConstString selector, ViAttr id, CType type, T* value, Pick pick) {
    return Guard(vi, [&]() -> ViStatus {
        AttrValue v;
        ViStatus status = GetAttribute(vi, selector, id, type, &v, value);
        if (status < 0) return status;
        *value = pick(v);
        return status;
    });
}

}  // namespace

extern "C" {

ViStatus Qn731XX_GetAttributeViInt32(ViSession vi, ViConstString repCapIdentifier, ViAttr attributeId,
                                     ViInt32* value) {
    return GetNumber(vi, repCapIdentifier, attributeId, CType::kInt32, value,
                     [](const AttrValue& v) { return v.i32; });
}

ViStatus Qn731XX_GetAttributeViReal64(ViSession vi, ViConstString repCapIdentifier,
                                      ViAttr attributeId, ViReal64* value) {
    return GetNumber(vi, repCapIdentifier, attributeId, CType::kReal64, value,
                     [](const AttrValue& v) { return v.r64; });
}

ViStatus Qn731XX_GetAttributeViBoolean(ViSession vi, ViConstString repCapIdentifier,
                                       ViAttr attributeId, ViBoolean* value) {
    return GetNumber(vi, repCapIdentifier, attributeId, CType::kBoolean, value,
                     [](const AttrValue& v) { return v.boolean; });
}

ViStatus Qn731XX_GetAttributeViSession(ViSession vi, ViConstString repCapIdentifier,
                                       ViAttr attributeId, ViSession* value) {
    return GetNumber(vi, repCapIdentifier, attributeId, CType::kSession, value,
                     [](const AttrValue&) { return ViSession{0}; });
}

ViStatus Qn731XX_GetAttributeViString(ViSession vi, ViConstString repCapIdentifier,
                                      ViAttr attributeId, ViInt32 bufferSize, ViChar value[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (bufferSize < 0) return CopyString(vi, std::string_view{}, bufferSize, value);
        AttrValue v;
        ViStatus status =
            GetAttribute(vi, repCapIdentifier, attributeId, CType::kString, &v, &bufferSize);
        if (status < 0) return status;
        return First(status, CopyString(vi, v.str.get(), bufferSize, value));
    });
}

ViStatus Qn731XX_SetAttributeViInt32(ViSession vi, ViConstString repCapIdentifier, ViAttr attributeId,
                                     ViInt32 value) {
    return Guard(vi, [&]() -> ViStatus {
        AttrValue v;
        v.i32 = value;
        return SetAttribute(vi, repCapIdentifier, attributeId, CType::kInt32, v);
    });
}

ViStatus Qn731XX_SetAttributeViReal64(ViSession vi, ViConstString repCapIdentifier,
                                      ViAttr attributeId, ViReal64 value) {
    return Guard(vi, [&]() -> ViStatus {
        AttrValue v;
        v.r64 = value;
        return SetAttribute(vi, repCapIdentifier, attributeId, CType::kReal64, v);
    });
}

ViStatus Qn731XX_SetAttributeViBoolean(ViSession vi, ViConstString repCapIdentifier,
                                       ViAttr attributeId, ViBoolean value) {
    return Guard(vi, [&]() -> ViStatus {
        AttrValue v;
        v.boolean = value;
        return SetAttribute(vi, repCapIdentifier, attributeId, CType::kBoolean, v);
    });
}

ViStatus Qn731XX_SetAttributeViString(ViSession vi, ViConstString repCapIdentifier,
                                      ViAttr attributeId, ViConstString value) {
    return Guard(vi, [&]() -> ViStatus {
        AttrValue v;
        v.str = com::Bstr(value);
        return SetAttribute(vi, repCapIdentifier, attributeId, CType::kString, v);
    });
}

ViStatus Qn731XX_SetAttributeViSession(ViSession vi, ViConstString repCapIdentifier,
                                       ViAttr attributeId, ViSession) {
    return Guard(vi, [&]() -> ViStatus {
        return SetAttribute(vi, repCapIdentifier, attributeId, CType::kSession, AttrValue{});
    });
}

// Shortcuts: one attribute each, on the session or on the given channel.

ViStatus Qn731XX_ActualRecordLength(ViSession vi, ViInt32* actualRecordLength) {
    return Qn731XX_GetAttributeViInt32(vi, "", IVISCOPE_ATTR_HORZ_RECORD_LENGTH, actualRecordLength);
}
ViStatus Qn731XX_SampleRate(ViSession vi, ViReal64* sampleRate) {
    return Qn731XX_GetAttributeViReal64(vi, "", IVISCOPE_ATTR_HORZ_SAMPLE_RATE, sampleRate);
}
ViStatus Qn731XX_SampleMode(ViSession vi, ViInt32* sampleMode) {
    return Qn731XX_GetAttributeViInt32(vi, "", IVISCOPE_ATTR_SAMPLE_MODE, sampleMode);
}
ViStatus Qn731XX_AutoProbeSenseValue(ViSession vi, ViConstString channel,
                                     ViReal64* autoProbeSenseValue) {
    return Qn731XX_GetAttributeViReal64(vi, channel, IVISCOPE_ATTR_PROBE_SENSE_VALUE,
                                        autoProbeSenseValue);
}
ViStatus Qn731XX_ConfigureAcquisitionType(ViSession vi, ViInt32 acquisitionType) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_ACQUISITION_TYPE, acquisitionType);
}
ViStatus Qn731XX_ConfigureInterpolation(ViSession vi, ViInt32 interpolation) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_INTERPOLATION, interpolation);
}
ViStatus Qn731XX_ConfigureInitiateContinuous(ViSession vi, ViBoolean continuousAcquisition) {
    return Qn731XX_SetAttributeViBoolean(vi, "", IVISCOPE_ATTR_INITIATE_CONTINUOUS,
                                         continuousAcquisition);
}
ViStatus Qn731XX_ConfigureTriggerCoupling(ViSession vi, ViInt32 coupling) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_TRIGGER_COUPLING, coupling);
}
ViStatus Qn731XX_ConfigureTriggerModifier(ViSession vi, ViInt32 triggerModifier) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_TRIGGER_MODIFIER, triggerModifier);
}
ViStatus Qn731XX_ConfigureTVTriggerLineNumber(ViSession vi, ViInt32 lineNumber) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_TV_TRIGGER_LINE_NUMBER, lineNumber);
}
ViStatus Qn731XX_ConfigureAcLineTriggerSlope(ViSession vi, ViInt32 acLineSlope) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_AC_LINE_TRIGGER_SLOPE, acLineSlope);
}
ViStatus Qn731XX_ConfigureNumAverages(ViSession vi, ViInt32 numberOfAverages) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_NUM_AVERAGES, numberOfAverages);
}
ViStatus Qn731XX_ConfigureNumEnvelopes(ViSession vi, ViInt32 numberOfEnvelopes) {
    return Qn731XX_SetAttributeViInt32(vi, "", IVISCOPE_ATTR_NUM_ENVELOPES, numberOfEnvelopes);
}

}  // extern "C"
