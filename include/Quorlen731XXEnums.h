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
