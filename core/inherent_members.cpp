// The inherent IVI members of the root object: their member rows and their
// entries into the method frame. Behaviour lives in the *_body files.
#include "core/inherent.h"
#include "core/root.h"

namespace qn {

namespace {

using V = FrameVariant;
using P = std::array<std::string_view, kMaxFrameParams>;

constexpr MemberInfo Row(std::string_view entry, std::string_view itf, const GUID& iid, V v,
                         P params = {}) {
    return MemberInfo{entry, itf, &iid, v, {}, {}, {}, params};
}

constexpr const GUID& kDrv = iid_of<IIviDriver>;
constexpr const GUID& kOp = iid_of<IIviDriverOperation>;
constexpr const GUID& kId = iid_of<IIviDriverIdentity>;
constexpr const GUID& kComp = iid_of<IIviComponentIdentity>;
constexpr const GUID& kUtil = iid_of<IIviDriverUtility>;

// IIviDriver
constexpr MemberInfo kInitialize = Row("Initialize", "IIviDriver", kDrv, V::A,
    {"bstrResourceDescriptor", "IdQuery", "Reset", "OptionString"});
constexpr MemberInfo kClose = Row("Close", "IIviDriver", kDrv, V::B);
constexpr MemberInfo kInitialized = Row("get_Initialized", "IIviDriver", kDrv, V::A, {"pbInitialized"});
constexpr MemberInfo kDriverOperation = Row("get_DriverOperation", "IIviDriver", kDrv, V::A, {"pVal"});
constexpr MemberInfo kIdentity = Row("get_Identity", "IIviDriver", kDrv, V::A, {"pVal"});
constexpr MemberInfo kUtility = Row("get_Utility", "IIviDriver", kDrv, V::A, {"pVal"});
// IIviComponentIdentity / IIviDriverIdentity
constexpr MemberInfo kDescription = Row("get_Description", "IIviComponentIdentity", kComp, V::A, {"pbstr"});
constexpr MemberInfo kRevision = Row("get_Revision", "IIviComponentIdentity", kComp, V::A, {"pbstr"});
constexpr MemberInfo kVendor = Row("get_Vendor", "IIviComponentIdentity", kComp, V::A, {"pbstr"});
constexpr MemberInfo kGroupCaps = Row("get_GroupCapabilities", "IIviDriverIdentity", kId, V::D, {"pbstr"});
constexpr MemberInfo kIdentifier = Row("get_Identifier", "IIviDriverIdentity", kId, V::A, {"pbstr"});
constexpr MemberInfo kFirmware = Row("get_InstrumentFirmwareRevision", "IIviDriverIdentity", kId, V::D, {"pbstr"});
constexpr MemberInfo kManufacturer = Row("get_InstrumentManufacturer", "IIviDriverIdentity", kId, V::D, {"pbstr"});
constexpr MemberInfo kModel = Row("get_InstrumentModel", "IIviDriverIdentity", kId, V::D, {"pbstr"});
constexpr MemberInfo kSpecMajor = Row("get_SpecificationMajorVersion", "IIviDriverIdentity", kId, V::A, {"plVer"});
constexpr MemberInfo kSpecMinor = Row("get_SpecificationMinorVersion", "IIviDriverIdentity", kId, V::A, {"plVer"});
constexpr MemberInfo kSupported = Row("get_SupportedInstrumentModels", "IIviDriverIdentity", kId, V::A, {"pbstr"});
// IIviDriverOperation
constexpr MemberInfo kGetCache = Row("get_Cache", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutCache = Row("put_Cache", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kDriverSetup = Row("get_DriverSetup", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kGetInterchange = Row("get_InterchangeCheck", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutInterchange = Row("put_InterchangeCheck", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kIoResource = Row("get_IoResourceDescriptor", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kLogicalName = Row("get_LogicalName", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kGetQis = Row("get_QueryInstrumentStatus", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutQis = Row("put_QueryInstrumentStatus", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kGetRange = Row("get_RangeCheck", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutRange = Row("put_RangeCheck", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kGetCoerce = Row("get_RecordCoercions", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutCoerce = Row("put_RecordCoercions", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kGetSimulate = Row("get_Simulate", "IIviDriverOperation", kOp, V::D, {"val"});
constexpr MemberInfo kPutSimulate = Row("put_Simulate", "IIviDriverOperation", kOp, V::E, {"val"});
constexpr MemberInfo kClearIcw = Row("ClearInterchangeWarnings", "IIviDriverOperation", kOp, V::B);
constexpr MemberInfo kNextCoercion = Row("GetNextCoercionRecord", "IIviDriverOperation", kOp, V::C, {"pbstrRecord"});
constexpr MemberInfo kNextIcw = Row("GetNextInterchangeWarning", "IIviDriverOperation", kOp, V::C, {"pbstrWarning"});
constexpr MemberInfo kInvalidate = Row("InvalidateAllAttributes", "IIviDriverOperation", kOp, V::B);
constexpr MemberInfo kResetIcw = Row("ResetInterchangeCheck", "IIviDriverOperation", kOp, V::B);
// IIviDriverUtility
constexpr MemberInfo kDisable = Row("Disable", "IIviDriverUtility", kUtil, V::B);
constexpr MemberInfo kErrorQuery = Row("ErrorQuery", "IIviDriverUtility", kUtil, V::C, {"ErrorCode", "ErrorMessage"});
constexpr MemberInfo kLockObject = Row("LockObject", "IIviDriverUtility", kUtil, V::B);
constexpr MemberInfo kReset = Row("Reset", "IIviDriverUtility", kUtil, V::B);
constexpr MemberInfo kResetDefaults = Row("ResetWithDefaults", "IIviDriverUtility", kUtil, V::B);
constexpr MemberInfo kSelfTest = Row("SelfTest", "IIviDriverUtility", kUtil, V::C, {"TestResult", "TestMessage"});
constexpr MemberInfo kUnlockObject = Row("UnlockObject", "IIviDriverUtility", kUtil, V::B);

HRESULT PutText(std::string_view text, BSTR* out) {
    *out = com::Utf8ToBstr(text);
    if (!*out) throw std::bad_alloc();
    return S_OK;
}

VARIANT_BOOL Vb(bool b) { return b ? VARIANT_TRUE : VARIANT_FALSE; }

}  // namespace

// clang-format off
HRESULT Quorlen731XX::Initialize(BSTR r, VARIANT_BOOL id, VARIANT_BOOL rst, BSTR o) {
    return RunFrame(*this, kInitialize, [&] { return InitializeBody(r, id != VARIANT_FALSE, rst != VARIANT_FALSE, o); },
                    in(r), in_bool(id), in_bool(rst), in(o));
}
HRESULT Quorlen731XX::Close() { return RunFrame(*this, kClose, [&] { return CloseBody(); }); }
HRESULT Quorlen731XX::get_Initialized(VARIANT_BOOL* p) {
    return RunFrame(*this, kInitialized, [&] { *p = Vb(Core().Initialized()); return S_OK; }, out_bool(p));
}
HRESULT Quorlen731XX::get_DriverOperation(IIviDriverOperation** p) { return RunFrame(*this, kDriverOperation, [&] { return Nav(p); }, out(p)); }
HRESULT Quorlen731XX::get_Identity(IIviDriverIdentity** p) { return RunFrame(*this, kIdentity, [&] { return Nav(p); }, out(p)); }
HRESULT Quorlen731XX::get_Utility(IIviDriverUtility** p) { return RunFrame(*this, kUtility, [&] { return Nav(p); }, out(p)); }

HRESULT Quorlen731XX::get_Description(BSTR* p) { return RunFrame(*this, kDescription, [&] { return PutText(kDriverDescription, p); }, out(p)); }
HRESULT Quorlen731XX::get_Revision(BSTR* p) { return RunFrame(*this, kRevision, [&] { return PutText(kDriverRevision, p); }, out(p)); }
HRESULT Quorlen731XX::get_Vendor(BSTR* p) { return RunFrame(*this, kVendor, [&] { return PutText(kDriverVendor, p); }, out(p)); }
HRESULT Quorlen731XX::get_GroupCapabilities(BSTR* p) { return RunFrame(*this, kGroupCaps, [&] { return PutText(GroupCapabilities(), p); }, out(p)); }
HRESULT Quorlen731XX::get_Identifier(BSTR* p) { return RunFrame(*this, kIdentifier, [&] { return PutText(kDriverIdentifier, p); }, out(p)); }
HRESULT Quorlen731XX::get_InstrumentFirmwareRevision(BSTR* p) { return RunFrame(*this, kFirmware, [&] { return PutText(InstrumentFirmwareRevision(Core()), p); }, out(p)); }
HRESULT Quorlen731XX::get_InstrumentManufacturer(BSTR* p) { return RunFrame(*this, kManufacturer, [&] { return PutText(InstrumentManufacturer(Core()), p); }, out(p)); }
HRESULT Quorlen731XX::get_InstrumentModel(BSTR* p) { return RunFrame(*this, kModel, [&] { return PutText(Core().Model(), p); }, out(p)); }
HRESULT Quorlen731XX::get_SpecificationMajorVersion(LONG* p) { return RunFrame(*this, kSpecMajor, [&] { *p = kSpecificationMajorVersion; return S_OK; }, out(p)); }
HRESULT Quorlen731XX::get_SpecificationMinorVersion(LONG* p) { return RunFrame(*this, kSpecMinor, [&] { *p = kSpecificationMinorVersion; return S_OK; }, out(p)); }
HRESULT Quorlen731XX::get_SupportedInstrumentModels(BSTR* p) { return RunFrame(*this, kSupported, [&] { return PutText(SupportedInstrumentModels(), p); }, out(p)); }

HRESULT Quorlen731XX::get_Cache(VARIANT_BOOL* p) { return RunFrame(*this, kGetCache, [&] { *p = Vb(Core().session.flags.cache); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_Cache(VARIANT_BOOL v) { return RunFrame(*this, kPutCache, [&] { return SetFlag(kFlagCache, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::get_DriverSetup(BSTR* p) { return RunFrame(*this, kDriverSetup, [&] { return PutText(Core().session.driver_setup, p); }, out(p)); }
HRESULT Quorlen731XX::get_InterchangeCheck(VARIANT_BOOL* p) { return RunFrame(*this, kGetInterchange, [&] { *p = Vb(Core().session.flags.interchange_check); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_InterchangeCheck(VARIANT_BOOL v) { return RunFrame(*this, kPutInterchange, [&] { return SetFlag(kFlagInterchangeCheck, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::get_IoResourceDescriptor(BSTR* p) { return RunFrame(*this, kIoResource, [&] { return PutText(Core().session.io_resource_descriptor, p); }, out(p)); }
HRESULT Quorlen731XX::get_LogicalName(BSTR* p) { return RunFrame(*this, kLogicalName, [&] { return PutText(Core().session.logical_name, p); }, out(p)); }
HRESULT Quorlen731XX::get_QueryInstrumentStatus(VARIANT_BOOL* p) { return RunFrame(*this, kGetQis, [&] { *p = Vb(Core().session.flags.query_instrument_status); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_QueryInstrumentStatus(VARIANT_BOOL v) { return RunFrame(*this, kPutQis, [&] { return SetFlag(kFlagQueryInstrumentStatus, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::get_RangeCheck(VARIANT_BOOL* p) { return RunFrame(*this, kGetRange, [&] { *p = Vb(Core().session.flags.range_check); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_RangeCheck(VARIANT_BOOL v) { return RunFrame(*this, kPutRange, [&] { return SetFlag(kFlagRangeCheck, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::get_RecordCoercions(VARIANT_BOOL* p) { return RunFrame(*this, kGetCoerce, [&] { *p = Vb(Core().session.flags.record_coercions); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_RecordCoercions(VARIANT_BOOL v) { return RunFrame(*this, kPutCoerce, [&] { return SetFlag(kFlagRecordCoercions, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::get_Simulate(VARIANT_BOOL* p) { return RunFrame(*this, kGetSimulate, [&] { *p = Vb(Core().session.flags.simulate); return S_OK; }, out_bool(p)); }
HRESULT Quorlen731XX::put_Simulate(VARIANT_BOOL v) { return RunFrame(*this, kPutSimulate, [&] { return SetFlag(kFlagSimulate, v != VARIANT_FALSE); }, in_bool(v)); }
HRESULT Quorlen731XX::ClearInterchangeWarnings() { return RunFrame(*this, kClearIcw, [&] { return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"ClearInterchangeWarnings"}); }); }
HRESULT Quorlen731XX::GetNextCoercionRecord(BSTR* p) { return RunFrame(*this, kNextCoercion, [&] { return NextCoercionRecord(p); }, out(p)); }
HRESULT Quorlen731XX::GetNextInterchangeWarning(BSTR* p) { return RunFrame(*this, kNextIcw, [&] { return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"GetNextInterchangeWarning"}); }, out(p)); }
HRESULT Quorlen731XX::InvalidateAllAttributes() { return RunFrame(*this, kInvalidate, [&] { InvalidateAll(); return S_OK; }); }
HRESULT Quorlen731XX::ResetInterchangeCheck() { return RunFrame(*this, kResetIcw, [&] { return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"ResetInterchangeCheck"}); }); }

HRESULT Quorlen731XX::Disable() { return RunFrame(*this, kDisable, [&] { return DisableBody(); }); }
HRESULT Quorlen731XX::ErrorQuery(LONG* c, BSTR* m) { return RunFrame(*this, kErrorQuery, [&] { return ErrorQueryBody(c, m); }, out(c), out(m)); }
HRESULT Quorlen731XX::LockObject() { return RunFrame(*this, kLockObject, [&] { return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"LockObject"}); }); }
HRESULT Quorlen731XX::Reset() { return RunFrame(*this, kReset, [&] { return ResetBody(); }); }
HRESULT Quorlen731XX::ResetWithDefaults() { return RunFrame(*this, kResetDefaults, [&] { return ResetWithDefaultsBody(); }); }
HRESULT Quorlen731XX::SelfTest(LONG* r, BSTR* m) { return RunFrame(*this, kSelfTest, [&] { return SelfTestBody(r, m); }, out(r), out(m)); }
HRESULT Quorlen731XX::UnlockObject() { return RunFrame(*this, kUnlockObject, [&] { return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"UnlockObject"}); }); }
// clang-format on

}  // namespace qn
