// The instrument-specific interfaces of the driver: IQuorlen731XX and its children.
// Each interface's members are the rows of include/members/<Interface>.def.
#pragma once

#include "QnMemberTable.h"
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
    QN_INTERFACE_ID("23798094-2077-5968-b88c-c304f7d5e799");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XX.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXAcquisition : IUnknown {
    QN_INTERFACE_ID("f54803e4-7523-54f4-af65-d4b1c597c4d9");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXChannels : IUnknown {
    QN_INTERFACE_ID("b2a322d0-c321-5821-afb6-122c94a6ba30");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXChannels.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXChannel : IUnknown {
    QN_INTERFACE_ID("c3a512ab-d7ac-5fc6-8e8d-e7db9c72a8f6");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXConfigurableMeasurement : IUnknown {
    QN_INTERFACE_ID("81c791be-01fb-55ff-92e7-fb207dcf2ad8");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXCursors : IUnknown {
    QN_INTERFACE_ID("780f9e33-5054-5a10-a203-ec51c52e3295");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXCursors.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDigitalChannels : IUnknown {
    QN_INTERFACE_ID("4c45e2f8-fcb6-5ca0-85d9-c7a9936cbf9e");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDigitalChannel : IUnknown {
    QN_INTERFACE_ID("c984bcf2-e33a-5154-a028-c8c901a8a1d0");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXDisplay : IUnknown {
    QN_INTERFACE_ID("e4a25b4b-9220-5336-ab9e-26fd6a0ceb2f");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXDisplay.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXExternal : IUnknown {
    QN_INTERFACE_ID("da44d608-c6d1-5445-a40e-4d18578a7881");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXExternal.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMeasurements : IUnknown {
    QN_INTERFACE_ID("6efef03b-0604-55a8-ba62-329be299b539");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMeasurements.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMeasurement : IUnknown {
    QN_INTERFACE_ID("d4b30dfe-e2f2-57cd-854c-aa52a859cbed");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXMultiWaveformMeasurement : IUnknown {
    QN_INTERFACE_ID("8e63cd2d-7dc6-5f65-adb4-9a8b052349a9");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXReferenceLevel : IUnknown {
    QN_INTERFACE_ID("f2364f2b-84cd-54dc-81ef-0444db7055a6");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXSetupMemory : IUnknown {
    QN_INTERFACE_ID("ed38c8f9-05bf-5e5c-bf20-11e879f28f0f");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXSetupMemory.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXStatus : IUnknown {
    QN_INTERFACE_ID("16628c88-d33e-5bb2-9967-e22727a0496c");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXStatus.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXSystem : IUnknown {
    QN_INTERFACE_ID("4b6a78f4-8791-5f18-89a8-b83183f46575");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXSystem.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTrigger : IUnknown {
    QN_INTERFACE_ID("0399743b-2119-5847-9cd6-896ef015f208");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTrigger.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerAcLine : IUnknown {
    QN_INTERFACE_ID("2920006a-7f0c-5679-a89d-6c0dc24d3093");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerEdge : IUnknown {
    QN_INTERFACE_ID("2b8b95cd-29b3-5c97-a12e-6d285fb6798d");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerGlitch : IUnknown {
    QN_INTERFACE_ID("894f21f4-5a02-5ba8-8d74-d3b3b2372636");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerPattern : IUnknown {
    QN_INTERFACE_ID("11e3f303-929c-5771-ac04-df269c41bca0");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerRunt : IUnknown {
    QN_INTERFACE_ID("eb90d7b2-1bc0-5e29-933e-d12458f7ca75");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerState : IUnknown {
    QN_INTERFACE_ID("4aca0ae0-6b4f-5aaf-bf7a-9026f66532ae");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerState.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerTv : IUnknown {
    QN_INTERFACE_ID("cbd894b3-4065-5fa6-80b1-103aca460513");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerTv.def"
#include "QnEndMembers.h"
};

struct IQuorlen731XXTriggerWidth : IUnknown {
    QN_INTERFACE_ID("cc7f4f0f-2a0e-56bc-8d94-c074d6612fe3");
#include "QnDeclareMembers.h"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "QnEndMembers.h"
};
