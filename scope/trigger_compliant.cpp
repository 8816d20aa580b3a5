// The class-compliant trigger interfaces on the root object. Each member
// calls the driver member of the same meaning, which runs its own frame;
// enumeration values pass value for value except the trigger coupling,
// whose class values skip 2.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IIviScopeTrigger.def"
#include "members/IIviScopeTriggerAcLine.def"
#include "members/IIviScopeTriggerEdge.def"
#include "members/IIviScopeTriggerGlitch.def"
#include "members/IIviScopeTriggerRunt.def"
#include "members/IIviScopeTriggerTv.def"
#include "members/IIviScopeTriggerWidth.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

struct CouplingPair {
    IviScopeTriggerCouplingEnum ivi;
    Quorlen731XXTriggerCouplingEnum driver;
};
constexpr CouplingPair kCouplings[] = {
    {IviScopeTriggerCouplingAC, Quorlen731XXTriggerCouplingAC},
    {IviScopeTriggerCouplingDC, Quorlen731XXTriggerCouplingDC},
    {IviScopeTriggerCouplingHFReject, Quorlen731XXTriggerCouplingHFReject},
    {IviScopeTriggerCouplingLFReject, Quorlen731XXTriggerCouplingLFReject},
    {IviScopeTriggerCouplingNoiseReject, Quorlen731XXTriggerCouplingNoiseReject},
};

}  // namespace

HRESULT Quorlen731XX::IIviScopeTrigger_get_Coupling_Body(IviScopeTriggerCouplingEnum* val) {
    Quorlen731XXTriggerCouplingEnum driver{};
    HRESULT hr = static_cast<IQuorlen731XXTrigger*>(this)->get_Coupling(&driver);
    if (FAILED(hr)) return hr;
    // TV coupling has no class value; report it outside the class range.
    *val = static_cast<IviScopeTriggerCouplingEnum>(IviScopeTriggerCouplingInstrumentTV);
    for (const CouplingPair& c : kCouplings)
        if (c.driver == driver) *val = c.ivi;
    return hr;
}

// A class value without a driver counterpart (2 among them) is refused: it
// would otherwise select the driver's coupling of the same number.
HRESULT Quorlen731XX::IIviScopeTrigger_put_Coupling_Body(IviScopeTriggerCouplingEnum val) {
    for (const CouplingPair& c : kCouplings)
        if (c.ivi == val) return static_cast<IQuorlen731XXTrigger*>(this)->put_Coupling(c.driver);
    return Errors().InvalidValue("put_Coupling", "val", std::int32_t{val});
}

HRESULT Quorlen731XX::IIviScopeTrigger_Configure_Body(IviScopeTriggerTypeEnum Type,
                                                      double Holdoff) {
    return static_cast<IQuorlen731XXTrigger*>(this)->Configure(
        static_cast<Quorlen731XXTriggerTypeEnum>(Type), Holdoff);
}

HRESULT Quorlen731XX::IIviScopeTriggerEdge_Configure_Body(BSTR Source, double Level,
                                                          IviScopeTriggerSlopeEnum Slope) {
    return static_cast<IQuorlen731XXTriggerEdge*>(this)->Configure(
        Source, Level, static_cast<Quorlen731XXTriggerSlopeEnum>(Slope));
}

HRESULT Quorlen731XX::IIviScopeTriggerGlitch_Configure_Body(BSTR Source, double Level,
                                                            double Width,
                                                            IviScopeGlitchPolarityEnum Polarity,
                                                            IviScopeGlitchConditionEnum Condition) {
    return static_cast<IQuorlen731XXTriggerGlitch*>(this)->Configure(
        Source, Level, Width, static_cast<Quorlen731XXGlitchPolarityEnum>(Polarity),
        static_cast<Quorlen731XXGlitchConditionEnum>(Condition));
}

HRESULT Quorlen731XX::IIviScopeTriggerWidth_Configure_Body(BSTR Source, double Level,
                                                           double ThresholdLow,
                                                           double ThresholdHigh,
                                                           IviScopeWidthPolarityEnum Polarity,
                                                           IviScopeWidthConditionEnum Condition) {
    return static_cast<IQuorlen731XXTriggerWidth*>(this)->Configure(
        Source, Level, ThresholdLow, ThresholdHigh,
        static_cast<Quorlen731XXWidthPolarityEnum>(Polarity),
        static_cast<Quorlen731XXWidthConditionEnum>(Condition));
}

HRESULT Quorlen731XX::IIviScopeTriggerRunt_Configure_Body(BSTR Source, double ThresholdLow,
                                                          double ThresholdHigh,
                                                          IviScopeRuntPolarityEnum Polarity) {
    return static_cast<IQuorlen731XXTriggerRunt*>(this)->Configure(
        Source, ThresholdLow, ThresholdHigh, static_cast<Quorlen731XXRuntPolarityEnum>(Polarity));
}

HRESULT Quorlen731XX::IIviScopeTriggerTv_Configure_Body(BSTR Source,
                                                        IviScopeTVSignalFormatEnum SignalFormat,
                                                        IviScopeTVTriggerEventEnum Event,
                                                        IviScopeTVTriggerPolarityEnum Polarity) {
    return static_cast<IQuorlen731XXTriggerTv*>(this)->Configure(
        Source, static_cast<Quorlen731XXTVSignalFormatEnum>(SignalFormat),
        static_cast<Quorlen731XXTVTriggerEventEnum>(Event),
        static_cast<Quorlen731XXTVTriggerPolarityEnum>(Polarity));
}

}  // namespace qn
