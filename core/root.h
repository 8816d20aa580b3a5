// Quorlen731XX: the root object of a driver session. It implements every
// interface of the session itself and owns the session state shared with the
// child objects of the repeated capabilities.
#pragma once

#include <memory>

#include "IviDriver.h"
#include "core/frame.h"
#include "core/node.h"
#include "core/ties.h"

namespace qn {

class Quorlen731XX final
    : public com::ComObject<Quorlen731XX, IIviDriver, IIviDriverOperation, IIviDriverIdentity,
                            com::As<IIviComponentIdentity, IIviDriverIdentity>, IIviDriverUtility,
                            ISupportErrorInfo,
                            Tie<IQuorlen731XX, Quorlen731XX>,
                            Tie<IQuorlen731XXAcquisition, Quorlen731XX>,
                            Tie<IQuorlen731XXChannels, Quorlen731XX>,
                            Tie<IQuorlen731XXConfigurableMeasurement, Quorlen731XX>,
                            Tie<IQuorlen731XXCursors, Quorlen731XX>,
                            Tie<IQuorlen731XXDigitalChannels, Quorlen731XX>,
                            Tie<IQuorlen731XXDisplay, Quorlen731XX>,
                            Tie<IQuorlen731XXExternal, Quorlen731XX>,
                            Tie<IQuorlen731XXMeasurements, Quorlen731XX>,
                            Tie<IQuorlen731XXMultiWaveformMeasurement, Quorlen731XX>,
                            Tie<IQuorlen731XXReferenceLevel, Quorlen731XX>,
                            Tie<IQuorlen731XXSetupMemory, Quorlen731XX>,
                            Tie<IQuorlen731XXStatus, Quorlen731XX>,
                            Tie<IQuorlen731XXSystem, Quorlen731XX>,
                            Tie<IQuorlen731XXTrigger, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerAcLine, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerEdge, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerGlitch, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerPattern, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerRunt, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerState, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerTv, Quorlen731XX>,
                            Tie<IQuorlen731XXTriggerWidth, Quorlen731XX>,
                            Tie<IIviScope, Quorlen731XX>,
                            Tie<IIviScopeAcquisition, Quorlen731XX>,
                            Tie<IIviScopeChannels, Quorlen731XX>,
                            Tie<IIviScopeMeasurements, Quorlen731XX>,
                            Tie<IIviScopeReferenceLevel, Quorlen731XX>,
                            Tie<IIviScopeTrigger, Quorlen731XX>,
                            Tie<IIviScopeTriggerAcLine, Quorlen731XX>,
                            Tie<IIviScopeTriggerEdge, Quorlen731XX>,
                            Tie<IIviScopeTriggerGlitch, Quorlen731XX>,
                            Tie<IIviScopeTriggerRunt, Quorlen731XX>,
                            Tie<IIviScopeTriggerTv, Quorlen731XX>,
                            Tie<IIviScopeTriggerWidth, Quorlen731XX>>,
      public CDriverNode {
public:
    Quorlen731XX();
    ~Quorlen731XX() override;

    std::string_view ComponentName() const override { return "Quorlen731XX"; }

    // IIviDriver
    HRESULT Initialize(BSTR ResourceName, VARIANT_BOOL IdQuery, VARIANT_BOOL Reset,
                       BSTR OptionString) override;
    HRESULT Close() override;
    HRESULT get_Initialized(VARIANT_BOOL* pbInitialized) override;
    HRESULT get_DriverOperation(IIviDriverOperation** pVal) override;
    HRESULT get_Identity(IIviDriverIdentity** pVal) override;
    HRESULT get_Utility(IIviDriverUtility** pVal) override;

    // IIviComponentIdentity / IIviDriverIdentity
    HRESULT get_Description(BSTR* pbstr) override;
    HRESULT get_Revision(BSTR* pbstr) override;
    HRESULT get_Vendor(BSTR* pbstr) override;
    HRESULT get_GroupCapabilities(BSTR* pbstr) override;
    HRESULT get_Identifier(BSTR* pbstr) override;
    HRESULT get_InstrumentFirmwareRevision(BSTR* pbstr) override;
    HRESULT get_InstrumentManufacturer(BSTR* pbstr) override;
    HRESULT get_InstrumentModel(BSTR* pbstr) override;
    HRESULT get_SpecificationMajorVersion(LONG* plVer) override;
    HRESULT get_SpecificationMinorVersion(LONG* plVer) override;
    HRESULT get_SupportedInstrumentModels(BSTR* pbstr) override;

    // IIviDriverOperation
    HRESULT get_Cache(VARIANT_BOOL* val) override;
    HRESULT put_Cache(VARIANT_BOOL val) override;
    HRESULT get_DriverSetup(BSTR* val) override;
    HRESULT get_InterchangeCheck(VARIANT_BOOL* val) override;
    HRESULT put_InterchangeCheck(VARIANT_BOOL val) override;
    HRESULT get_IoResourceDescriptor(BSTR* val) override;
    HRESULT get_LogicalName(BSTR* val) override;
    HRESULT get_QueryInstrumentStatus(VARIANT_BOOL* val) override;
    HRESULT put_QueryInstrumentStatus(VARIANT_BOOL val) override;
    HRESULT get_RangeCheck(VARIANT_BOOL* val) override;
    HRESULT put_RangeCheck(VARIANT_BOOL val) override;
    HRESULT get_RecordCoercions(VARIANT_BOOL* val) override;
    HRESULT put_RecordCoercions(VARIANT_BOOL val) override;
    HRESULT get_Simulate(VARIANT_BOOL* val) override;
    HRESULT put_Simulate(VARIANT_BOOL val) override;
    HRESULT ClearInterchangeWarnings() override;
    HRESULT GetNextCoercionRecord(BSTR* pbstrRecord) override;
    HRESULT GetNextInterchangeWarning(BSTR* pbstrWarning) override;
    HRESULT InvalidateAllAttributes() override;
    HRESULT ResetInterchangeCheck() override;

    // IIviDriverUtility
    HRESULT Disable() override;
    HRESULT ErrorQuery(LONG* ErrorCode, BSTR* ErrorMessage) override;
    HRESULT LockObject() override;
    HRESULT Reset() override;
    HRESULT ResetWithDefaults() override;
    HRESULT SelfTest(LONG* TestResult, BSTR* TestMessage) override;
    HRESULT UnlockObject() override;

    // ISupportErrorInfo
    HRESULT InterfaceSupportsErrorInfo(REFIID riid) override;

    // The link to the IVI-C session of the C API (SessionCore's
    // c_session_handle): attaching succeeds only when the object is already
    // linked (E_IVI_METHOD_NOT_SUPPORTED otherwise); the handle reads as
    // E_IVI_PROPERTY_NOT_SUPPORTED while none is linked.
    HRESULT AttachToExistingCSession();
    HRESULT get_NativeCHandle(LONG* pVal);

    // Entries of the table-driven interfaces.
#include "core/member_entries_begin.h"
#include "members/IQuorlen731XX.def"
#include "members/IQuorlen731XXAcquisition.def"
#include "members/IQuorlen731XXChannels.def"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "members/IQuorlen731XXCursors.def"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "members/IQuorlen731XXDisplay.def"
#include "members/IQuorlen731XXExternal.def"
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
#include "members/IIviScope.def"
#include "members/IIviScopeAcquisition.def"
#include "members/IIviScopeChannels.def"
#include "members/IIviScopeMeasurements.def"
#include "members/IIviScopeReferenceLevel.def"
#include "members/IIviScopeTrigger.def"
#include "members/IIviScopeTriggerAcLine.def"
#include "members/IIviScopeTriggerEdge.def"
#include "members/IIviScopeTriggerGlitch.def"
#include "members/IIviScopeTriggerRunt.def"
#include "members/IIviScopeTriggerTv.def"
#include "members/IIviScopeTriggerWidth.def"
#include "QnEndMembers.h"

    // The instrument-specific counterparts of the class-compliant interfaces.
    IQuorlen731XXAcquisition* Counterpart(IIviScopeAcquisition*) { return this; }
    IQuorlen731XXReferenceLevel* Counterpart(IIviScopeReferenceLevel*) { return this; }
    IQuorlen731XXTrigger* Counterpart(IIviScopeTrigger*) { return this; }
    IQuorlen731XXTriggerAcLine* Counterpart(IIviScopeTriggerAcLine*) { return this; }
    IQuorlen731XXTriggerEdge* Counterpart(IIviScopeTriggerEdge*) { return this; }
    IQuorlen731XXTriggerGlitch* Counterpart(IIviScopeTriggerGlitch*) { return this; }
    IQuorlen731XXTriggerRunt* Counterpart(IIviScopeTriggerRunt*) { return this; }
    IQuorlen731XXTriggerTv* Counterpart(IIviScopeTriggerTv*) { return this; }
    IQuorlen731XXTriggerWidth* Counterpart(IIviScopeTriggerWidth*) { return this; }

    // Model tests offered to every part of the driver; false when the
    // session is not initialized.
    bool IsModelSupported() const;
    bool IsModel(std::string_view model) const;
    bool IsModelInFamily(std::string_view family) const;

private:
    // Initialize and Close run inside their frames; these are their bodies.
    HRESULT InitializeBody(BSTR resource, bool id_query, bool reset, BSTR options);
    HRESULT CloseBody();
    HRESULT ApplyConfiguration(const std::string& resource, const std::string& options);
    // Session steps that the I/O layer and the object model provide.
    HRESULT StartTracing();
    void SaveTrace();
    HRESULT OpenIo();
    void CloseIo();
    HRESULT StartSession();
    void EndSession();
    void CompleteMeasurements();
    HRESULT BuildInstanceLists();
    HRESULT QueryIdentity();
    void InvalidateAll();
    // Applies one session-flag value through the rules of its setter
    // (used by the flag properties and ResetWithDefaults).
    HRESULT SetFlag(int which, bool value);
    HRESULT DisableBody();
    HRESULT ErrorQueryBody(LONG* code, BSTR* message);
    HRESULT ResetBody();
    HRESULT ResetWithDefaultsBody();
    HRESULT SelfTestBody(LONG* result, BSTR* message);
    HRESULT NextCoercionRecord(BSTR* record);
    void ResetChildren();
    // Instrument traffic of the inherent operations.
    HRESULT QueryInteger(std::string_view command, long timeout_ms, LONG* value);
    HRESULT QueryErrorText(std::string* reply);  // "SYST:ERR?" without the status check
    HRESULT ClearStatus();                        // "*CLS"

    template <class T>
    HRESULT Nav(T** out);
    // Sends the running member's command unless the session simulates.
    HRESULT SendRowCommand();
};

}  // namespace qn
