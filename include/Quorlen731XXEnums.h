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
