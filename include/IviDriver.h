// The inherent IVI driver interfaces: IIviDriver, IIviDriverOperation,
// IIviComponentIdentity, IIviDriverIdentity and IIviDriverUtility.
// Every member returns an HRESULT; out-parameters are pointers the caller
// owns (BSTRs are freed by the caller with SysFreeString).
#pragma once

#include "Quorlen731XXIds.h"
#include "platform/com/com.h"

struct IIviDriverOperation;
struct IIviDriverIdentity;
struct IIviDriverUtility;

struct IIviComponentIdentity : IUnknown {
    QN_INTERFACE_IID(IID_IIviComponentIdentity);
    virtual HRESULT get_Description(BSTR* pbstr) = 0;
    virtual HRESULT get_Revision(BSTR* pbstr) = 0;
    virtual HRESULT get_Vendor(BSTR* pbstr) = 0;
};

struct IIviDriverIdentity : IIviComponentIdentity {
    QN_INTERFACE_IID(IID_IIviDriverIdentity);
    virtual HRESULT get_GroupCapabilities(BSTR* pbstr) = 0;
    virtual HRESULT get_Identifier(BSTR* pbstr) = 0;
    virtual HRESULT get_InstrumentFirmwareRevision(BSTR* pbstr) = 0;
    virtual HRESULT get_InstrumentManufacturer(BSTR* pbstr) = 0;
    virtual HRESULT get_InstrumentModel(BSTR* pbstr) = 0;
    virtual HRESULT get_SpecificationMajorVersion(LONG* plVer) = 0;
    virtual HRESULT get_SpecificationMinorVersion(LONG* plVer) = 0;
    virtual HRESULT get_SupportedInstrumentModels(BSTR* pbstr) = 0;
};

struct IIviDriverOperation : IUnknown {
    QN_INTERFACE_IID(IID_IIviDriverOperation);
    virtual HRESULT get_Cache(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_Cache(VARIANT_BOOL val) = 0;
    virtual HRESULT get_DriverSetup(BSTR* val) = 0;
    virtual HRESULT get_InterchangeCheck(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_InterchangeCheck(VARIANT_BOOL val) = 0;
    virtual HRESULT get_IoResourceDescriptor(BSTR* val) = 0;
    virtual HRESULT get_LogicalName(BSTR* val) = 0;
    virtual HRESULT get_QueryInstrumentStatus(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_QueryInstrumentStatus(VARIANT_BOOL val) = 0;
    virtual HRESULT get_RangeCheck(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_RangeCheck(VARIANT_BOOL val) = 0;
    virtual HRESULT get_RecordCoercions(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_RecordCoercions(VARIANT_BOOL val) = 0;
    virtual HRESULT get_Simulate(VARIANT_BOOL* val) = 0;
    virtual HRESULT put_Simulate(VARIANT_BOOL val) = 0;
    virtual HRESULT ClearInterchangeWarnings() = 0;
    virtual HRESULT GetNextCoercionRecord(BSTR* pbstrRecord) = 0;
    virtual HRESULT GetNextInterchangeWarning(BSTR* pbstrWarning) = 0;
    virtual HRESULT InvalidateAllAttributes() = 0;
    virtual HRESULT ResetInterchangeCheck() = 0;
};

struct IIviDriverUtility : IUnknown {
    QN_INTERFACE_IID(IID_IIviDriverUtility);
    virtual HRESULT Disable() = 0;
    virtual HRESULT ErrorQuery(LONG* ErrorCode, BSTR* ErrorMessage) = 0;
    virtual HRESULT LockObject() = 0;
    virtual HRESULT Reset() = 0;
    virtual HRESULT ResetWithDefaults() = 0;
    virtual HRESULT SelfTest(LONG* TestResult, BSTR* TestMessage) = 0;
    virtual HRESULT UnlockObject() = 0;
};

struct IIviDriver : IUnknown {
    QN_INTERFACE_IID(IID_IIviDriver);
    virtual HRESULT Initialize(BSTR ResourceName, VARIANT_BOOL IdQuery, VARIANT_BOOL Reset,
                               BSTR OptionString) = 0;
    virtual HRESULT Close() = 0;
    virtual HRESULT get_Initialized(VARIANT_BOOL* pbInitialized) = 0;
    virtual HRESULT get_DriverOperation(IIviDriverOperation** pVal) = 0;
    virtual HRESULT get_Identity(IIviDriverIdentity** pVal) = 0;
    virtual HRESULT get_Utility(IIviDriverUtility** pVal) = 0;
};
