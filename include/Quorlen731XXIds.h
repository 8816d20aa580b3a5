// Identifiers of the Quorlen731XX driver, fixed once for every release:
// the creatable class, its AppID, the type-information id, the component
// categories the class implements, its ProgIDs and description, and the
// interface ids. Changing any value here breaks existing registrations and
// compiled clients.
#pragma once

#include "platform/com/types.h"

// ---------------------------------------------------------------------------
// The creatable class and its registration
// ---------------------------------------------------------------------------

// The root driver object (one per session).
constexpr CLSID CLSID_Quorlen731XX = MakeGuid("b67ff9a5-23ac-4050-9b90-e89c130f632d");
// The AppID the module registers and the class refers to.
constexpr GUID APPID_Quorlen731XX = MakeGuid("d8e2edc5-2e57-4a60-b9c1-c272fbaddbf1");
// The type information of the module (also its module GUID).
constexpr GUID LIBID_Quorlen731XXLib = MakeGuid("f10e9bd9-1577-4d20-92cb-0910b8580f3e");
inline constexpr char kQuorlen731XXLibVersion[] = "1.0";

// Component categories implemented by the class: instrument drivers in
// general, and oscilloscope class drivers in particular.
constexpr GUID CATID_Quorlen731XXIviDrivers = MakeGuid("e6a29af0-5052-460f-b2e0-e490c679eff1");
constexpr GUID CATID_Quorlen731XXIviScopeDrivers = MakeGuid("a9183827-2b76-424c-a5b1-1ccccca8ad56");

inline constexpr char kQuorlen731XXProgId[] = "Quorlen731XX.Quorlen731XX.1";
inline constexpr char kQuorlen731XXVersionIndependentProgId[] = "Quorlen731XX.Quorlen731XX";
inline constexpr char kQuorlen731XXDescription[] = "Quorlen731XX Object";
// Default value of the AppID key, and the AppID key named after the module.
inline constexpr char kQuorlen731XXAppIdName[] = "Quorlen731XX";
inline constexpr char kQuorlen731XXModuleAppIdKey[] = "Quorlen731XX.DLL";
inline constexpr char kQuorlen731XXLibDescription[] = "Quorlen731XX 1.0 Type Library";

// ---------------------------------------------------------------------------
// Interface ids
//
// Every interface of the driver takes its id from here
// (QN_INTERFACE_IID(IID_<Interface>) inside the interface declaration).
// ---------------------------------------------------------------------------

// Inherent IVI driver interfaces (IviDriver.h).
constexpr IID IID_IIviComponentIdentity = MakeGuid("4c84a4a0-5a31-4c1e-9b6e-31a1c0a73101");
constexpr IID IID_IIviDriverIdentity = MakeGuid("4c84a4a0-5a31-4c1e-9b6e-31a1c0a73102");
constexpr IID IID_IIviDriverOperation = MakeGuid("4c84a4a0-5a31-4c1e-9b6e-31a1c0a73103");
constexpr IID IID_IIviDriverUtility = MakeGuid("4c84a4a0-5a31-4c1e-9b6e-31a1c0a73104");
constexpr IID IID_IIviDriver = MakeGuid("4c84a4a0-5a31-4c1e-9b6e-31a1c0a73105");
