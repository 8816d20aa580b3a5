// Enumerations of the driver's interfaces. The class-compliant IviScope
// enumerations use the same numbers as the driver's own.
#pragma once

#include "platform/com/types.h"

enum Quorlen731XXInterpolationEnum : LONG {
    Quorlen731XXInterpolationNone = 1,
    Quorlen731XXInterpolationSineX = 2,
    Quorlen731XXInterpolationLinear = 3,
};
enum Quorlen731XXSampleModeEnum : LONG {
    Quorlen731XXSampleModeRealTime = 0,
    Quorlen731XXSampleModeEquivalentTime = 1,
};
enum Quorlen731XXAcquisitionTypeEnum : LONG {
    Quorlen731XXAcquisitionTypeNormal = 0,
    Quorlen731XXAcquisitionTypePeakDetect = 1,
    Quorlen731XXAcquisitionTypeHiRes = 2,
    Quorlen731XXAcquisitionTypeEnvelope = 3,
    Quorlen731XXAcquisitionTypeAverage = 4,
};
enum Quorlen731XXVerticalCouplingEnum : LONG {
    Quorlen731XXVerticalCouplingAC = 0,
    Quorlen731XXVerticalCouplingDC = 1,
    Quorlen731XXVerticalCouplingGnd = 2,
};
enum Quorlen731XXChannelProtectionEnum : LONG {
    Quorlen731XXChannelProtectionOK = 0,
    Quorlen731XXChannelProtectionTripped = 1,
};
enum Quorlen731XXChannelUnitsEnum : LONG {
    Quorlen731XXVolts = 0,
    Quorlen731XXAmps = 1,
};

enum IviScopeInterpolationEnum : LONG {
    IviScopeInterpolationNone = 1,
    IviScopeInterpolationSineX = 2,
    IviScopeInterpolationLinear = 3,
};
enum IviScopeSampleModeEnum : LONG {
    IviScopeSampleModeRealTime = 0,
    IviScopeSampleModeEquivalentTime = 1,
};
enum IviScopeAcquisitionTypeEnum : LONG {
    IviScopeAcquisitionTypeNormal = 0,
    IviScopeAcquisitionTypePeakDetect = 1,
    IviScopeAcquisitionTypeHiRes = 2,
    IviScopeAcquisitionTypeEnvelope = 3,
    IviScopeAcquisitionTypeAverage = 4,
};
enum IviScopeVerticalCouplingEnum : LONG {
    IviScopeVerticalCouplingAC = 0,
    IviScopeVerticalCouplingDC = 1,
    IviScopeVerticalCouplingGnd = 2,
};

// Status registers, service requests and acquisition control.
enum Quorlen731XXStatusRegisterEnum : LONG {
    Quorlen731XXStatusRegisterStatusByte = 0,
    Quorlen731XXStatusRegisterStandardEvent = 1,
    Quorlen731XXStatusRegisterOperation = 2,
    Quorlen731XXStatusRegisterOverloadEvent = 3,
    Quorlen731XXStatusRegisterTriggerEvent = 4,
    Quorlen731XXStatusRegisterArmEvent = 5,
};
enum Quorlen731XXStatusSubRegisterEnum : LONG {
    Quorlen731XXStatusSubRegisterCondition = 0,
    Quorlen731XXStatusSubRegisterEvent = 1,
    Quorlen731XXStatusSubRegisterEnable = 2,
};
enum Quorlen731XXSRQReasonEnum : LONG {
    Quorlen731XXSRQReasonStbMAV = 1,
    Quorlen731XXSRQReasonStbMSG = 2,
    Quorlen731XXSRQReasonEsrOPC = 4,
    Quorlen731XXSRQReasonEsrQueryError = 8,
    Quorlen731XXSRQReasonEsrDeviceError = 16,
    Quorlen731XXSRQReasonEsrExecutionError = 32,
    Quorlen731XXSRQReasonEsrCommandError = 64,
    Quorlen731XXSRQReasonEsrUserRequest = 128,
    Quorlen731XXSRQReasonEsrPowerOn = 256,
    Quorlen731XXSRQReasonStbUSR = 1024,
    Quorlen731XXSRQReasonStbTRG = 2048,
    Quorlen731XXSRQReasonOperRunning = 8192,
    Quorlen731XXSRQReasonOperWaitTrig = 16384,
    Quorlen731XXSRQReasonOverloadChan1 = 32768,
    Quorlen731XXSRQReasonOverloadChan2 = 65536,
    Quorlen731XXSRQReasonOverloadChan3 = 131072,
    Quorlen731XXSRQReasonOverloadChan4 = 262144,
    Quorlen731XXSRQReasonOverloadExternal = 524288,
    Quorlen731XXSRQReasonFaultChan1 = 1048576,
    Quorlen731XXSRQReasonFaultChan2 = 2097152,
    Quorlen731XXSRQReasonFaultChan3 = 4194304,
    Quorlen731XXSRQReasonFaultChan4 = 8388608,
    Quorlen731XXSRQReasonFaultExternal = 16777216,
};
enum Quorlen731XXAcquisitionStatusEnum : LONG {
    Quorlen731XXAcqInProgress = 0,
    Quorlen731XXAcqComplete = 1,
    Quorlen731XXAcqStatusUnknown = 2,
};
enum Quorlen731XXTimeOutEnum : LONG {
    Quorlen731XXTimeOutImmediate = 0,
    Quorlen731XXTimeOutInfinite = 1,
};
enum IviScopeAcquisitionStatusEnum : LONG {
    IviScopeAcqInProgress = 0,
    IviScopeAcqComplete = 1,
    IviScopeAcqStatusUnknown = 2,
};

// Automatic measurements. The class-compliant function values 0 to 19 are
// the same numbers.
enum Quorlen731XXMeasurementEnum : LONG {
    Quorlen731XXMeasurementRiseTime = 0,
    Quorlen731XXMeasurementFallTime = 1,
    Quorlen731XXMeasurementFrequency = 2,
    Quorlen731XXMeasurementPeriod = 3,
    Quorlen731XXMeasurementVoltageRMS = 4,
    Quorlen731XXMeasurementVoltagePeakToPeak = 5,
    Quorlen731XXMeasurementVoltageMax = 6,
    Quorlen731XXMeasurementVoltageMin = 7,
    Quorlen731XXMeasurementVoltageHigh = 8,
    Quorlen731XXMeasurementVoltageLow = 9,
    Quorlen731XXMeasurementVoltageAverage = 10,
    Quorlen731XXMeasurementWidthNeg = 11,
    Quorlen731XXMeasurementWidthPos = 12,
    Quorlen731XXMeasurementDutyCycleNeg = 13,
    Quorlen731XXMeasurementDutyCyclePos = 14,
    Quorlen731XXMeasurementAmplitude = 15,
    Quorlen731XXMeasurementVoltageCycleRMS = 16,
    Quorlen731XXMeasurementVoltageCycleAverage = 17,
    Quorlen731XXMeasurementOverShoot = 18,
    Quorlen731XXMeasurementPreshoot = 19,
    Quorlen731XXMeasurementFrequencyCounter = 20,
    Quorlen731XXMeasurementTimeAtMax = 21,
    Quorlen731XXMeasurementTimeAtMin = 22,
    Quorlen731XXMeasurementDelay = 23,
    Quorlen731XXMeasurementPhase = 24,
    Quorlen731XXMeasurementValueAtTime = 25,
    Quorlen731XXMeasurementTimeAtValue = 26,
    Quorlen731XXMeasurementTimeOfEdge = 27,
};
enum IviScopeMeasurementFunctionEnum : LONG {
    IviScopeMeasurementRiseTime = 0,
    IviScopeMeasurementFallTime = 1,
    IviScopeMeasurementFrequency = 2,
    IviScopeMeasurementPeriod = 3,
    IviScopeMeasurementVoltageRMS = 4,
    IviScopeMeasurementVoltagePeakToPeak = 5,
    IviScopeMeasurementVoltageMax = 6,
    IviScopeMeasurementVoltageMin = 7,
    IviScopeMeasurementVoltageHigh = 8,
    IviScopeMeasurementVoltageLow = 9,
    IviScopeMeasurementVoltageAverage = 10,
    IviScopeMeasurementWidthNeg = 11,
    IviScopeMeasurementWidthPos = 12,
    IviScopeMeasurementDutyCycleNeg = 13,
    IviScopeMeasurementDutyCyclePos = 14,
    IviScopeMeasurementAmplitude = 15,
    IviScopeMeasurementVoltageCycleRMS = 16,
    IviScopeMeasurementVoltageCycleAverage = 17,
    IviScopeMeasurementOvershoot = 18,
    IviScopeMeasurementPreshoot = 19,
};
enum Quorlen731XXMeasurementSlopeEnum : LONG {
    Quorlen731XXMeasurementSlopePositive = 0,
    Quorlen731XXMeasurementSlopeNegative = 1,
};
enum Quorlen731XXMeasurementReferenceModeEnum : LONG {
    Quorlen731XXMeasurementReferenceModePercent = 0,
    Quorlen731XXMeasurementReferenceModeAbsolute = 1,
};

enum Quorlen731XXExternalUnitsEnum : LONG {
    Quorlen731XXUnitsVolts = 0,
    Quorlen731XXUnitsAmps = 1,
};

// Triggering. The class-compliant enumerations share the driver's numbers
// except the trigger coupling, whose class values skip 2.
enum Quorlen731XXTriggerTypeEnum : LONG {
    Quorlen731XXTriggerEdge = 1,
    Quorlen731XXTriggerWidth = 2,
    Quorlen731XXTriggerRunt = 3,
    Quorlen731XXTriggerGlitch = 4,
    Quorlen731XXTriggerTV = 5,
    Quorlen731XXTriggerImmediate = 6,
    Quorlen731XXTriggerACLine = 7,
    Quorlen731XXTriggerPattern = 8,
    Quorlen731XXTriggerState = 9,
};
enum Quorlen731XXTriggerCouplingEnum : LONG {
    Quorlen731XXTriggerCouplingAC = 0,
    Quorlen731XXTriggerCouplingDC = 1,
    Quorlen731XXTriggerCouplingHFReject = 2,
    Quorlen731XXTriggerCouplingLFReject = 3,
    Quorlen731XXTriggerCouplingNoiseReject = 4,
    Quorlen731XXTriggerCouplingTV = 5,
};
enum Quorlen731XXTriggerModifierEnum : LONG {
    Quorlen731XXTriggerModifierNone = 1,
    Quorlen731XXTriggerModifierAuto = 2,
    Quorlen731XXTriggerModifierAutoLevel = 3,
};
enum Quorlen731XXTriggerSlopeEnum : LONG {
    Quorlen731XXTriggerSlopeNegative = 0,
    Quorlen731XXTriggerSlopePositive = 1,
    Quorlen731XXTriggerSlopeEither = 2,
    Quorlen731XXTriggerSlopeAlternate = 3,
};
enum Quorlen731XXACLineSlopeEnum : LONG {
    Quorlen731XXACLinePositive = 1,
    Quorlen731XXACLineNegative = 2,
    Quorlen731XXACLineEither = 3,
};
enum Quorlen731XXGlitchConditionEnum : LONG {
    Quorlen731XXGlitchLessThan = 1,
    Quorlen731XXGlitchGreaterThan = 2,
};
enum Quorlen731XXGlitchPolarityEnum : LONG {
    Quorlen731XXGlitchPositive = 1,
    Quorlen731XXGlitchNegative = 2,
    Quorlen731XXGlitchEither = 3,
};
enum Quorlen731XXWidthConditionEnum : LONG {
    Quorlen731XXWidthWithin = 1,
    Quorlen731XXWidthOutside = 2,
};
enum Quorlen731XXWidthPolarityEnum : LONG {
    Quorlen731XXWidthPositive = 1,
    Quorlen731XXWidthNegative = 2,
    Quorlen731XXWidthEither = 3,
};
enum Quorlen731XXRuntPolarityEnum : LONG {
    Quorlen731XXRuntPolarityPositive = 1,
    Quorlen731XXRuntPolarityNegative = 2,
    Quorlen731XXRuntPolarityEither = 3,
};
enum Quorlen731XXTVTriggerEventEnum : LONG {
    Quorlen731XXTVEventField1 = 1,
    Quorlen731XXTVEventField2 = 2,
    Quorlen731XXTVEventAnyField = 3,
    Quorlen731XXTVEventAnyLine = 4,
    Quorlen731XXTVEventLineNumber = 5,
    Quorlen731XXTVEventLineNumberAlternate = 6,
    Quorlen731XXTVEventLineNumberVertical = 7,
    Quorlen731XXTVEventVertical = 8,
};
enum Quorlen731XXTVTriggerPolarityEnum : LONG {
    Quorlen731XXTVTriggerPositive = 1,
    Quorlen731XXTVTriggerNegative = 2,
};
enum Quorlen731XXTVSignalFormatEnum : LONG {
    Quorlen731XXTVSignalFormatNTSC = 1,
    Quorlen731XXTVSignalFormatPAL = 2,
    Quorlen731XXTVSignalFormatSECAM = 3,
    Quorlen731XXTVSignalFormatPALM = 4,
    Quorlen731XXTVSignalFormatGeneric = 5,
    Quorlen731XXTVSignalFormatP480 = 6,
    Quorlen731XXTVSignalFormatP720 = 7,
    Quorlen731XXTVSignalFormatP1080 = 8,
    Quorlen731XXTVSignalFormatI1080 = 9,
};
enum Quorlen731XXPatternMatchingModeEnum : LONG {
    Quorlen731XXPatternEnter = 0,
    Quorlen731XXPatternExit = 1,
};

enum IviScopeTriggerTypeEnum : LONG {
    IviScopeTriggerEdge = 1,
    IviScopeTriggerWidth = 2,
    IviScopeTriggerRunt = 3,
    IviScopeTriggerGlitch = 4,
    IviScopeTriggerTV = 5,
    IviScopeTriggerImmediate = 6,
    IviScopeTriggerACLine = 7,
};
enum IviScopeTriggerCouplingEnum : LONG {
    IviScopeTriggerCouplingAC = 0,
    IviScopeTriggerCouplingDC = 1,
    IviScopeTriggerCouplingHFReject = 3,
    IviScopeTriggerCouplingLFReject = 4,
    IviScopeTriggerCouplingNoiseReject = 5,
};
// What IIviScopeTrigger.Coupling reads while the instrument is in TV
// coupling, which has no class-compliant value: outside the class range.
inline constexpr LONG IviScopeTriggerCouplingInstrumentTV = 1005;
enum IviScopeTriggerModifierEnum : LONG {
    IviScopeTriggerModifierNone = 1,
    IviScopeTriggerModifierAuto = 2,
    IviScopeTriggerModifierAutoLevel = 3,
};
enum IviScopeTriggerSlopeEnum : LONG {
    IviScopeTriggerSlopeNegative = 0,
    IviScopeTriggerSlopePositive = 1,
};
enum IviScopeACLineSlopeEnum : LONG {
    IviScopeACLinePositive = 1,
    IviScopeACLineNegative = 2,
    IviScopeACLineEither = 3,
};
enum IviScopeGlitchConditionEnum : LONG {
    IviScopeGlitchLessThan = 1,
    IviScopeGlitchGreaterThan = 2,
};
enum IviScopeGlitchPolarityEnum : LONG {
    IviScopeGlitchPositive = 1,
    IviScopeGlitchNegative = 2,
    IviScopeGlitchEither = 3,
};
enum IviScopeWidthConditionEnum : LONG {
    IviScopeWidthWithin = 1,
    IviScopeWidthOutside = 2,
};
enum IviScopeWidthPolarityEnum : LONG {
    IviScopeWidthPositive = 1,
    IviScopeWidthNegative = 2,
    IviScopeWidthEither = 3,
};
enum IviScopeRuntPolarityEnum : LONG {
    IviScopeRuntPositive = 1,
    IviScopeRuntNegative = 2,
    IviScopeRuntEither = 3,
};
enum IviScopeTVTriggerEventEnum : LONG {
    IviScopeTVEventField1 = 1,
    IviScopeTVEventField2 = 2,
    IviScopeTVEventAnyField = 3,
    IviScopeTVEventAnyLine = 4,
    IviScopeTVEventLineNumber = 5,
};
enum IviScopeTVTriggerPolarityEnum : LONG {
    IviScopeTVPositive = 1,
    IviScopeTVNegative = 2,
};
enum IviScopeTVSignalFormatEnum : LONG {
    IviScopeTVSignalFormatNTSC = 1,
    IviScopeTVSignalFormatPAL = 2,
    IviScopeTVSignalFormatSECAM = 3,
};
