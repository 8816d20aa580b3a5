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

// The IviScope class interfaces and the instrument-specific interfaces.
constexpr IID IID_IIviScope = MakeGuid("67bb36e0-3f0c-53d7-8bf6-9de7126b807b");
constexpr IID IID_IIviScopeAcquisition = MakeGuid("f0938a7e-eb12-5169-bb04-99f8135e6401");
constexpr IID IID_IIviScopeChannels = MakeGuid("4c2ec75e-c1e4-52c2-b52a-ba659765e94c");
constexpr IID IID_IIviScopeChannel = MakeGuid("981e9988-7932-5901-9d2d-32adb546d375");
constexpr IID IID_IIviScopeMeasurements = MakeGuid("90a4237c-5cd9-5923-a77f-1f09a14cfb3b");
constexpr IID IID_IIviScopeMeasurement = MakeGuid("50c8438c-5885-5563-9f0a-301081021e59");
constexpr IID IID_IIviScopeReferenceLevel = MakeGuid("1f3efd4e-790f-51a9-93ab-8177c14462d2");
constexpr IID IID_IIviScopeTrigger = MakeGuid("e505bc01-d717-579c-abfd-86ca955ce3d2");
constexpr IID IID_IIviScopeTriggerAcLine = MakeGuid("256abb97-794a-5611-b563-0d7392d1577b");
constexpr IID IID_IIviScopeTriggerEdge = MakeGuid("d82c9e0d-310a-5f18-abb3-be2001abfade");
constexpr IID IID_IIviScopeTriggerGlitch = MakeGuid("49080129-d173-5f1e-80ef-ffa0e451aaad");
constexpr IID IID_IIviScopeTriggerRunt = MakeGuid("c990857f-c1b2-5a87-bf49-04cff10662f9");
constexpr IID IID_IIviScopeTriggerTv = MakeGuid("0073dec7-3ff0-59ca-b0ba-519830503c08");
constexpr IID IID_IIviScopeTriggerWidth = MakeGuid("517e4cf5-39d0-5d97-960a-6829abb90f47");
constexpr IID IID_IQuorlen731XX = MakeGuid("23798094-2077-5968-b88c-c304f7d5e799");
constexpr IID IID_IQuorlen731XXAcquisition = MakeGuid("f54803e4-7523-54f4-af65-d4b1c597c4d9");
constexpr IID IID_IQuorlen731XXChannels = MakeGuid("b2a322d0-c321-5821-afb6-122c94a6ba30");
constexpr IID IID_IQuorlen731XXChannel = MakeGuid("c3a512ab-d7ac-5fc6-8e8d-e7db9c72a8f6");
constexpr IID IID_IQuorlen731XXConfigurableMeasurement = MakeGuid("81c791be-01fb-55ff-92e7-fb207dcf2ad8");
constexpr IID IID_IQuorlen731XXCursors = MakeGuid("780f9e33-5054-5a10-a203-ec51c52e3295");
constexpr IID IID_IQuorlen731XXDigitalChannels = MakeGuid("4c45e2f8-fcb6-5ca0-85d9-c7a9936cbf9e");
constexpr IID IID_IQuorlen731XXDigitalChannel = MakeGuid("c984bcf2-e33a-5154-a028-c8c901a8a1d0");
constexpr IID IID_IQuorlen731XXDisplay = MakeGuid("e4a25b4b-9220-5336-ab9e-26fd6a0ceb2f");
constexpr IID IID_IQuorlen731XXExternal = MakeGuid("da44d608-c6d1-5445-a40e-4d18578a7881");
constexpr IID IID_IQuorlen731XXMeasurements = MakeGuid("6efef03b-0604-55a8-ba62-329be299b539");
constexpr IID IID_IQuorlen731XXMeasurement = MakeGuid("d4b30dfe-e2f2-57cd-854c-aa52a859cbed");
constexpr IID IID_IQuorlen731XXMultiWaveformMeasurement = MakeGuid("8e63cd2d-7dc6-5f65-adb4-9a8b052349a9");
constexpr IID IID_IQuorlen731XXReferenceLevel = MakeGuid("f2364f2b-84cd-54dc-81ef-0444db7055a6");
constexpr IID IID_IQuorlen731XXSetupMemory = MakeGuid("ed38c8f9-05bf-5e5c-bf20-11e879f28f0f");
constexpr IID IID_IQuorlen731XXStatus = MakeGuid("16628c88-d33e-5bb2-9967-e22727a0496c");
constexpr IID IID_IQuorlen731XXSystem = MakeGuid("4b6a78f4-8791-5f18-89a8-b83183f46575");
constexpr IID IID_IQuorlen731XXTrigger = MakeGuid("0399743b-2119-5847-9cd6-896ef015f208");
constexpr IID IID_IQuorlen731XXTriggerAcLine = MakeGuid("2920006a-7f0c-5679-a89d-6c0dc24d3093");
constexpr IID IID_IQuorlen731XXTriggerEdge = MakeGuid("2b8b95cd-29b3-5c97-a12e-6d285fb6798d");
constexpr IID IID_IQuorlen731XXTriggerGlitch = MakeGuid("894f21f4-5a02-5ba8-8d74-d3b3b2372636");
constexpr IID IID_IQuorlen731XXTriggerPattern = MakeGuid("11e3f303-929c-5771-ac04-df269c41bca0");
constexpr IID IID_IQuorlen731XXTriggerRunt = MakeGuid("eb90d7b2-1bc0-5e29-933e-d12458f7ca75");
constexpr IID IID_IQuorlen731XXTriggerState = MakeGuid("4aca0ae0-6b4f-5aaf-bf7a-9026f66532ae");
constexpr IID IID_IQuorlen731XXTriggerTv = MakeGuid("cbd894b3-4065-5fa6-80b1-103aca460513");
constexpr IID IID_IQuorlen731XXTriggerWidth = MakeGuid("cc7f4f0f-2a0e-56bc-8d94-c074d6612fe3");
