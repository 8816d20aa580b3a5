// The property table of the attribute functions, generated from the member
// tables: every QN_PROPERTY row of include/members/*.def becomes one entry
// with its type and access as the row declares them. The inherent interfaces
// are declared by hand in IviDriver.h; their entries take type and access from
// the members' signatures.
#include <algorithm>
#include <array>

#include "IviDriver.h"
#include "IviScope.h"
#include "Quorlen731XX.h"
#include "capi/property_access.h"

namespace qn::capi {

namespace {

#define QN_CAPI_GET_RO(Itf, Name, T, Vt) &GetThunk<Itf, T, &Itf::get_##Name, Vt>
#define QN_CAPI_GET_RW(Itf, Name, T, Vt) &GetThunk<Itf, T, &Itf::get_##Name, Vt>
#define QN_CAPI_GET_WO(Itf, Name, T, Vt) nullptr
#define QN_CAPI_PUT_RO(Itf, Name, T, Vt) nullptr
#define QN_CAPI_PUT_RW(Itf, Name, T, Vt) &PutThunk<Itf, T, &Itf::put_##Name, Vt>
#define QN_CAPI_PUT_WO(Itf, Name, T, Vt) &PutThunk<Itf, T, &Itf::put_##Name, Vt>

#define QN_PROPERTY(Itf, Name, T, Vt, Access, ...)                                        \
    PropertyAccess{#Itf "." #Name, &iid_of<Itf>, CTypeOf<T>(Vt),                           \
                   QN_CAPI_GET_##Access(Itf, Name, T, Vt),                                 \
                   QN_CAPI_PUT_##Access(Itf, Name, T, Vt)},
#define QN_NAVIGATION(...)
#define QN_METHOD(...)
#define QN_METHOD0(...)

// The value type of a getter.
template <class Itf, class T>
T ValueOf(HRESULT (Itf::*)(T*));

#define QN_CAPI_INHERENT_RO(Itf, Name)                                                       \
    PropertyAccess{#Itf "." #Name, &iid_of<Itf>,                                             \
                   CTypeOf<decltype(ValueOf(&Itf::get_##Name))>(),                           \
                   &GetThunk<Itf, decltype(ValueOf(&Itf::get_##Name)), &Itf::get_##Name>, \
                   nullptr},
#define QN_CAPI_INHERENT_RW(Itf, Name)                                                       \
    PropertyAccess{#Itf "." #Name, &iid_of<Itf>,                                             \
                   CTypeOf<decltype(ValueOf(&Itf::get_##Name))>(),                           \
                   &GetThunk<Itf, decltype(ValueOf(&Itf::get_##Name)), &Itf::get_##Name>, \
                   &PutThunk<Itf, decltype(ValueOf(&Itf::get_##Name)), &Itf::put_##Name>},

const auto kProperties = std::to_array<PropertyAccess>({
    QN_CAPI_INHERENT_RW(IIviDriverOperation, Cache)
    QN_CAPI_INHERENT_RO(IIviDriverOperation, DriverSetup)
    QN_CAPI_INHERENT_RW(IIviDriverOperation, InterchangeCheck)
    QN_CAPI_INHERENT_RO(IIviDriverOperation, IoResourceDescriptor)
    QN_CAPI_INHERENT_RO(IIviDriverOperation, LogicalName)
    QN_CAPI_INHERENT_RW(IIviDriverOperation, QueryInstrumentStatus)
    QN_CAPI_INHERENT_RW(IIviDriverOperation, RangeCheck)
    QN_CAPI_INHERENT_RW(IIviDriverOperation, RecordCoercions)
    QN_CAPI_INHERENT_RW(IIviDriverOperation, Simulate)
    QN_CAPI_INHERENT_RO(IIviComponentIdentity, Description)
    QN_CAPI_INHERENT_RO(IIviComponentIdentity, Revision)
    QN_CAPI_INHERENT_RO(IIviComponentIdentity, Vendor)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, GroupCapabilities)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, Identifier)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, InstrumentFirmwareRevision)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, InstrumentManufacturer)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, InstrumentModel)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, SpecificationMajorVersion)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, SpecificationMinorVersion)
    QN_CAPI_INHERENT_RO(IIviDriverIdentity, SupportedInstrumentModels)
#include "members/IIviScope.def"
#include "members/IIviScopeAcquisition.def"
#include "members/IIviScopeChannel.def"
#include "members/IIviScopeChannels.def"
#include "members/IIviScopeMeasurement.def"
#include "members/IIviScopeMeasurements.def"
#include "members/IIviScopeReferenceLevel.def"
#include "members/IIviScopeTrigger.def"
#include "members/IIviScopeTriggerAcLine.def"
#include "members/IIviScopeTriggerEdge.def"
#include "members/IIviScopeTriggerGlitch.def"
#include "members/IIviScopeTriggerRunt.def"
#include "members/IIviScopeTriggerTv.def"
#include "members/IIviScopeTriggerWidth.def"
#include "members/IQuorlen731XX.def"
#include "members/IQuorlen731XXAcquisition.def"
#include "members/IQuorlen731XXChannel.def"
#include "members/IQuorlen731XXChannels.def"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "members/IQuorlen731XXCursors.def"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "members/IQuorlen731XXDisplay.def"
#include "members/IQuorlen731XXExternal.def"
#include "members/IQuorlen731XXMeasurement.def"
#include "members/IQuorlen731XXMeasurements.def"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "members/IQuorlen731XXSetupMemory.def"
#include "members/IQuorlen731XXStatus.def"
#include "members/IQuorlen731XXSystem.def"
#include "members/IQuorlen731XXTrigger.def"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "members/IQuorlen731XXTriggerState.def"
#include "members/IQuorlen731XXTriggerTv.def"
#include "members/IQuorlen731XXTriggerWidth.def"
});

#include "QnEndMembers.h"

}  // namespace

std::string_view CTypeName(CType t) {
    switch (t) {
        case CType::kInt32: return "ViInt32";
        case CType::kReal64: return "ViReal64";
        case CType::kBoolean: return "ViBoolean";
        case CType::kString: return "ViString";
        case CType::kSession: return "ViSession";
    }
    return "?";
}

std::span<const PropertyAccess> Properties() { return kProperties; }

const PropertyAccess* FindProperty(std::string_view key) {
    auto it = std::find_if(kProperties.begin(), kProperties.end(),
                           [&](const PropertyAccess& p) { return p.key == key; });
    return it == kProperties.end() ? nullptr : &*it;
}

}  // namespace qn::capi
