// The instrument-specific interfaces of the driver: IQuorlen731XX and its children.
// Each interface's members are the rows of include/members/<Interface>.def.
#pragma once

#include "QnMemberTable.h"
#include "Quorlen731XXIds.h"
#include "Quorlen731XXEnums.h"
#include "IviScope.h"
#include "IviDriver.h"
#include "platform/visa/visa.h"
#include "platform/com/com.h"

struct IQuorlen731XX;
struct IQuorlen731XXAcquisition;
struct IQuorlen731XXChannels;
struct IQuorlen731XXChannel;
struct IQuorlen731XXConfigurableMeasurement;
struct IQuorlen731XXCursors;
struct IQuorlen731XXDigitalChannels;
struct IQuorlen731XXDigitalChannel;
struct IQuorlen731XXDisplay;
struct IQuorlen731XXExternal;
struct IQuorlen731XXMeasurements;
struct IQuorlen731XXMeasurement;
struct IQuorlen731XXMultiWaveformMeasurement;
struct IQuorlen731XXReferenceLevel;
struct IQuorlen731XXSetupMemory;
struct IQuorlen731XXStatus;
struct IQuorlen731XXSystem;
struct IQuorlen731XXTrigger;
struct IQuorlen731XXTriggerAcLine;
struct IQuorlen731XXTriggerEdge;
struct IQuorlen731XXTriggerGlitch;
struct IQuorlen731XXTriggerPattern;
struct IQuorlen731XXTriggerRunt;
struct IQuorlen731XXTriggerState;
struct IQuorlen731XXTriggerTv;
struct IQuorlen731XXTriggerWidth;

struct IQuorlen731XX : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XX);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XX.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXAcquisition : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXAcquisition);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXChannels : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXChannels);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXChannels.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXChannel : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXChannel);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXConfigurableMeasurement : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXConfigurableMeasurement);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXCursors : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXCursors);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXCursors.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDigitalChannels : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXDigitalChannels);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDigitalChannel : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXDigitalChannel);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDisplay : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXDisplay);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDisplay.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXExternal : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXExternal);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXExternal.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMeasurements : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXMeasurements);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMeasurements.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMeasurement : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXMeasurement);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMultiWaveformMeasurement : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXMultiWaveformMeasurement);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXReferenceLevel : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXReferenceLevel);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXSetupMemory : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXSetupMemory);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXSetupMemory.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXStatus : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXStatus);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXStatus.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXSystem : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXSystem);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXSystem.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTrigger : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTrigger);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTrigger.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerAcLine : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerAcLine);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerEdge : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerEdge);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerGlitch : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerGlitch);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerPattern : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerPattern);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerRunt : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerRunt);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerState : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerState);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerState.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerTv : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerTv);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerTv.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerWidth : IUnknown {
    QN_INTERFACE_IID(IID_IQuorlen731XXTriggerWidth);
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "QnEndMembers.h"
};
