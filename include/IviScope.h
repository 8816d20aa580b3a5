// The IviScope class interfaces: IIviScope and its children.
// Each interface's members are the rows of include/members/<Interface>.def.
#pragma once

#include "QnMemberTable.h"
#include "Quorlen731XXIds.h"
#include "Quorlen731XXEnums.h"
#include "platform/com/com.h"

struct IIviScope;
struct IIviScopeAcquisition;
struct IIviScopeChannels;
struct IIviScopeChannel;
struct IIviScopeMeasurements;
struct IIviScopeMeasurement;
struct IIviScopeReferenceLevel;
struct IIviScopeTrigger;
struct IIviScopeTriggerAcLine;
struct IIviScopeTriggerEdge;
struct IIviScopeTriggerGlitch;
struct IIviScopeTriggerRunt;
struct IIviScopeTriggerTv;
struct IIviScopeTriggerWidth;

struct IIviScope : IUnknown {
    QN_INTERFACE_IID(IID_IIviScope);
#include "QnDeclareMembers.h"
#include "members/IIviScope.def"
#include "QnEndMembers.h"
};

struct IIviScopeAcquisition : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeAcquisition);
#include "QnDeclareMembers.h"
#include "members/IIviScopeAcquisition.def"
#include "QnEndMembers.h"
};

struct IIviScopeChannels : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeChannels);
#include "QnDeclareMembers.h"
#include "members/IIviScopeChannels.def"
#include "QnEndMembers.h"
};

struct IIviScopeChannel : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeChannel);
#include "QnDeclareMembers.h"
#include "members/IIviScopeChannel.def"
#include "QnEndMembers.h"
};

struct IIviScopeMeasurements : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeMeasurements);
#include "QnDeclareMembers.h"
#include "members/IIviScopeMeasurements.def"
#include "QnEndMembers.h"
};

struct IIviScopeMeasurement : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeMeasurement);
#include "QnDeclareMembers.h"
#include "members/IIviScopeMeasurement.def"
#include "QnEndMembers.h"
};

struct IIviScopeReferenceLevel : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeReferenceLevel);
#include "QnDeclareMembers.h"
#include "members/IIviScopeReferenceLevel.def"
#include "QnEndMembers.h"
};

struct IIviScopeTrigger : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTrigger);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTrigger.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerAcLine : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerAcLine);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerAcLine.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerEdge : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerEdge);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerEdge.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerGlitch : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerGlitch);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerGlitch.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerRunt : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerRunt);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerRunt.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerTv : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerTv);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerTv.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerWidth : IUnknown {
    QN_INTERFACE_IID(IID_IIviScopeTriggerWidth);
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerWidth.def"
#include "QnEndMembers.h"
};
