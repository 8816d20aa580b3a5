// The IviScope class interfaces: IIviScope and its children.
// Each interface's members are the rows of include/members/<Interface>.def.
#pragma once

#include "QnMemberTable.h"
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
    QN_INTERFACE_ID("67bb36e0-3f0c-53d7-8bf6-9de7126b807b");
#include "QnDeclareMembers.h"
#include "members/IIviScope.def"
#include "QnEndMembers.h"
};

struct IIviScopeAcquisition : IUnknown {
    QN_INTERFACE_ID("f0938a7e-eb12-5169-bb04-99f8135e6401");
#include "QnDeclareMembers.h"
#include "members/IIviScopeAcquisition.def"
#include "QnEndMembers.h"
};

struct IIviScopeChannels : IUnknown {
    QN_INTERFACE_ID("4c2ec75e-c1e4-52c2-b52a-ba659765e94c");
#include "QnDeclareMembers.h"
#include "members/IIviScopeChannels.def"
#include "QnEndMembers.h"
};

struct IIviScopeChannel : IUnknown {
    QN_INTERFACE_ID("981e9988-7932-5901-9d2d-32adb546d375");
#include "QnDeclareMembers.h"
#include "members/IIviScopeChannel.def"
#include "QnEndMembers.h"
};

struct IIviScopeMeasurements : IUnknown {
    QN_INTERFACE_ID("90a4237c-5cd9-5923-a77f-1f09a14cfb3b");
#include "QnDeclareMembers.h"
#include "members/IIviScopeMeasurements.def"
#include "QnEndMembers.h"
};

struct IIviScopeMeasurement : IUnknown {
    QN_INTERFACE_ID("50c8438c-5885-5563-9f0a-301081021e59");
#include "QnDeclareMembers.h"
#include "members/IIviScopeMeasurement.def"
#include "QnEndMembers.h"
};

struct IIviScopeReferenceLevel : IUnknown {
    QN_INTERFACE_ID("1f3efd4e-790f-51a9-93ab-8177c14462d2");
#include "QnDeclareMembers.h"
#include "members/IIviScopeReferenceLevel.def"
#include "QnEndMembers.h"
};

struct IIviScopeTrigger : IUnknown {
    QN_INTERFACE_ID("e505bc01-d717-579c-abfd-86ca955ce3d2");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTrigger.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerAcLine : IUnknown {
    QN_INTERFACE_ID("256abb97-794a-5611-b563-0d7392d1577b");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerAcLine.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerEdge : IUnknown {
    QN_INTERFACE_ID("d82c9e0d-310a-5f18-abb3-be2001abfade");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerEdge.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerGlitch : IUnknown {
    QN_INTERFACE_ID("49080129-d173-5f1e-80ef-ffa0e451aaad");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerGlitch.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerRunt : IUnknown {
    QN_INTERFACE_ID("c990857f-c1b2-5a87-bf49-04cff10662f9");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerRunt.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerTv : IUnknown {
    QN_INTERFACE_ID("0073dec7-3ff0-59ca-b0ba-519830503c08");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerTv.def"
#include "QnEndMembers.h"
};

struct IIviScopeTriggerWidth : IUnknown {
    QN_INTERFACE_ID("517e4cf5-39d0-5d97-960a-6829abb90f47");
#include "QnDeclareMembers.h"
#include "members/IIviScopeTriggerWidth.def"
#include "QnEndMembers.h"
};
