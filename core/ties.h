// The ties of the driver's table-driven interfaces to their implementing
// classes: each interface member calls the class's entry of the same row
// (see core/member_impl.h).
#pragma once

#include "IviScope.h"
#include "Quorlen731XX.h"
#include "core/member_impl.h"

namespace qn {

template <class Impl>
struct Tie<IIviScope, Impl> : IIviScope {
    using TiedInterface = IIviScope;
#include "core/member_ties_begin.h"
#include "members/IIviScope.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeAcquisition, Impl> : IIviScopeAcquisition {
    using TiedInterface = IIviScopeAcquisition;
#include "core/member_ties_begin.h"
#include "members/IIviScopeAcquisition.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeChannels, Impl> : IIviScopeChannels {
    using TiedInterface = IIviScopeChannels;
#include "core/member_ties_begin.h"
#include "members/IIviScopeChannels.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeChannel, Impl> : IIviScopeChannel {
    using TiedInterface = IIviScopeChannel;
#include "core/member_ties_begin.h"
#include "members/IIviScopeChannel.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeMeasurements, Impl> : IIviScopeMeasurements {
    using TiedInterface = IIviScopeMeasurements;
#include "core/member_ties_begin.h"
#include "members/IIviScopeMeasurements.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeMeasurement, Impl> : IIviScopeMeasurement {
    using TiedInterface = IIviScopeMeasurement;
#include "core/member_ties_begin.h"
#include "members/IIviScopeMeasurement.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeReferenceLevel, Impl> : IIviScopeReferenceLevel {
    using TiedInterface = IIviScopeReferenceLevel;
#include "core/member_ties_begin.h"
#include "members/IIviScopeReferenceLevel.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTrigger, Impl> : IIviScopeTrigger {
    using TiedInterface = IIviScopeTrigger;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTrigger.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerAcLine, Impl> : IIviScopeTriggerAcLine {
    using TiedInterface = IIviScopeTriggerAcLine;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerAcLine.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerEdge, Impl> : IIviScopeTriggerEdge {
    using TiedInterface = IIviScopeTriggerEdge;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerEdge.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerGlitch, Impl> : IIviScopeTriggerGlitch {
    using TiedInterface = IIviScopeTriggerGlitch;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerGlitch.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerRunt, Impl> : IIviScopeTriggerRunt {
    using TiedInterface = IIviScopeTriggerRunt;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerRunt.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerTv, Impl> : IIviScopeTriggerTv {
    using TiedInterface = IIviScopeTriggerTv;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerTv.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IIviScopeTriggerWidth, Impl> : IIviScopeTriggerWidth {
    using TiedInterface = IIviScopeTriggerWidth;
#include "core/member_ties_begin.h"
#include "members/IIviScopeTriggerWidth.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XX, Impl> : IQuorlen731XX {
    using TiedInterface = IQuorlen731XX;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XX.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXAcquisition, Impl> : IQuorlen731XXAcquisition {
    using TiedInterface = IQuorlen731XXAcquisition;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXChannels, Impl> : IQuorlen731XXChannels {
    using TiedInterface = IQuorlen731XXChannels;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXChannels.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXChannel, Impl> : IQuorlen731XXChannel {
    using TiedInterface = IQuorlen731XXChannel;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXConfigurableMeasurement, Impl> : IQuorlen731XXConfigurableMeasurement {
    using TiedInterface = IQuorlen731XXConfigurableMeasurement;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXCursors, Impl> : IQuorlen731XXCursors {
    using TiedInterface = IQuorlen731XXCursors;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXCursors.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXDigitalChannels, Impl> : IQuorlen731XXDigitalChannels {
    using TiedInterface = IQuorlen731XXDigitalChannels;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXDigitalChannel, Impl> : IQuorlen731XXDigitalChannel {
    using TiedInterface = IQuorlen731XXDigitalChannel;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXDisplay, Impl> : IQuorlen731XXDisplay {
    using TiedInterface = IQuorlen731XXDisplay;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXDisplay.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXExternal, Impl> : IQuorlen731XXExternal {
    using TiedInterface = IQuorlen731XXExternal;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXExternal.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXMeasurements, Impl> : IQuorlen731XXMeasurements {
    using TiedInterface = IQuorlen731XXMeasurements;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXMeasurements.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXMeasurement, Impl> : IQuorlen731XXMeasurement {
    using TiedInterface = IQuorlen731XXMeasurement;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXMeasurement.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXMultiWaveformMeasurement, Impl> : IQuorlen731XXMultiWaveformMeasurement {
    using TiedInterface = IQuorlen731XXMultiWaveformMeasurement;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXReferenceLevel, Impl> : IQuorlen731XXReferenceLevel {
    using TiedInterface = IQuorlen731XXReferenceLevel;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXSetupMemory, Impl> : IQuorlen731XXSetupMemory {
    using TiedInterface = IQuorlen731XXSetupMemory;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXSetupMemory.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXStatus, Impl> : IQuorlen731XXStatus {
    using TiedInterface = IQuorlen731XXStatus;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXStatus.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXSystem, Impl> : IQuorlen731XXSystem {
    using TiedInterface = IQuorlen731XXSystem;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXSystem.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTrigger, Impl> : IQuorlen731XXTrigger {
    using TiedInterface = IQuorlen731XXTrigger;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTrigger.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerAcLine, Impl> : IQuorlen731XXTriggerAcLine {
    using TiedInterface = IQuorlen731XXTriggerAcLine;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerEdge, Impl> : IQuorlen731XXTriggerEdge {
    using TiedInterface = IQuorlen731XXTriggerEdge;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerGlitch, Impl> : IQuorlen731XXTriggerGlitch {
    using TiedInterface = IQuorlen731XXTriggerGlitch;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerPattern, Impl> : IQuorlen731XXTriggerPattern {
    using TiedInterface = IQuorlen731XXTriggerPattern;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerRunt, Impl> : IQuorlen731XXTriggerRunt {
    using TiedInterface = IQuorlen731XXTriggerRunt;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerState, Impl> : IQuorlen731XXTriggerState {
    using TiedInterface = IQuorlen731XXTriggerState;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerState.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerTv, Impl> : IQuorlen731XXTriggerTv {
    using TiedInterface = IQuorlen731XXTriggerTv;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerTv.def"
#include "QnEndMembers.h"
};

template <class Impl>
struct Tie<IQuorlen731XXTriggerWidth, Impl> : IQuorlen731XXTriggerWidth {
    using TiedInterface = IQuorlen731XXTriggerWidth;
#include "core/member_ties_begin.h"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "QnEndMembers.h"
};

}  // namespace qn
