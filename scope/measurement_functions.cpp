#include "scope/measurement_functions.h"

#include "Quorlen731XXEnums.h"

namespace qn {

namespace {

using F = MeasurementForm;
constexpr unsigned kDM = kOnDigital | kOnMath;
constexpr unsigned kXM = kOnExternal | kOnMath;

constexpr MeasurementFunction kFunctions[] = {
    {Quorlen731XXMeasurementRiseTime, F::kPlain, "Rise Time", kOnMath},
    {Quorlen731XXMeasurementFallTime, F::kPlain, "Fall Time", kOnMath},
    {Quorlen731XXMeasurementFrequency, F::kPlain, "Frequency", kDM},
    {Quorlen731XXMeasurementPeriod, F::kPlain, "Period", kDM},
    {Quorlen731XXMeasurementVoltageRMS, F::kPlain, "RMS", kOnMath},
    {Quorlen731XXMeasurementVoltagePeakToPeak, F::kPlain, "Peak-To-Peak", kXM},
    {Quorlen731XXMeasurementVoltageMax, F::kPlain, "Maximum", kXM},
    {Quorlen731XXMeasurementVoltageMin, F::kPlain, "Minimum", kXM},
    {Quorlen731XXMeasurementVoltageHigh, F::kPlain, "Top", kOnMath},
    {Quorlen731XXMeasurementVoltageLow, F::kPlain, "Base", kOnMath},
    {Quorlen731XXMeasurementVoltageAverage, F::kPlain, "Y Average", kXM},
    {Quorlen731XXMeasurementWidthNeg, F::kPlain, "Neg Width", kDM},
    {Quorlen731XXMeasurementWidthPos, F::kPlain, "Pos Width", kDM},
    {Quorlen731XXMeasurementDutyCycleNeg, F::kComplement, "Neg Duty Cycle", kDM},
    {Quorlen731XXMeasurementDutyCyclePos, F::kPlain, "Pos Duty Cycle", kDM},
    {Quorlen731XXMeasurementAmplitude, F::kPlain, "Amplitude", kOnMath},
    {Quorlen731XXMeasurementVoltageCycleRMS, F::kPlain, "Cycle Y RMS", kOnMath},
    {Quorlen731XXMeasurementVoltageCycleAverage, F::kPlain, "Cycle Y Average", kOnMath},
    {Quorlen731XXMeasurementOverShoot, F::kPlain, "OverShoot", kOnMath},
    {Quorlen731XXMeasurementPreshoot, F::kPlain, "Preshoot", kOnMath},
    {Quorlen731XXMeasurementFrequencyCounter, F::kPlain, "Frequency Counter", kOnDigital},
    {Quorlen731XXMeasurementTimeAtMax, F::kPlain, "X At Max", kXM},
    {Quorlen731XXMeasurementTimeAtMin, F::kPlain, "X At Min", kXM},
    {Quorlen731XXMeasurementDelay, F::kTwoSources, "Delay", kOnMath},
    {Quorlen731XXMeasurementPhase, F::kTwoSources, "Phase", kOnMath},
    {Quorlen731XXMeasurementValueAtTime, F::kValueAtTime, "Value At X", kOnMath},
    {Quorlen731XXMeasurementTimeAtValue, F::kTimeAtValue, "X At Value", kOnMath},
    {Quorlen731XXMeasurementTimeOfEdge, F::kTimeOfEdge, "X Of Edge", kDM},
};

}  // namespace

const MeasurementFunction* FindMeasurementFunction(LONG value) {
    for (const MeasurementFunction& f : kFunctions)
        if (f.value == value) return &f;
    return nullptr;
}

const CEnumCommandTable& MeasurementTokens() {
    static const CEnumCommandTable t{
        {"", Quorlen731XXMeasurementRiseTime, "RIS"},
        {"", Quorlen731XXMeasurementFallTime, "FALL"},
        {"", Quorlen731XXMeasurementFrequency, "FREQ"},
        {"", Quorlen731XXMeasurementPeriod, "PER"},
        {"", Quorlen731XXMeasurementVoltageRMS, "VRMS"},
        {"", Quorlen731XXMeasurementVoltagePeakToPeak, "VPP"},
        {"", Quorlen731XXMeasurementVoltageMax, "VMAX"},
        {"", Quorlen731XXMeasurementVoltageMin, "VMIN"},
        {"", Quorlen731XXMeasurementVoltageHigh, "VTOP"},
        {"", Quorlen731XXMeasurementVoltageLow, "VBAS"},
        {"", Quorlen731XXMeasurementVoltageAverage, "VAV"},
        {"", Quorlen731XXMeasurementWidthNeg, "NWID"},
        {"", Quorlen731XXMeasurementWidthPos, "PWID"},
        {"", Quorlen731XXMeasurementDutyCycleNeg, "DUTY"},
        {"", Quorlen731XXMeasurementDutyCyclePos, "DUTY"},
        {"", Quorlen731XXMeasurementAmplitude, "VAMP"},
        {"", Quorlen731XXMeasurementVoltageCycleRMS, "VRMS"},
        {"", Quorlen731XXMeasurementVoltageCycleAverage, "VAV"},
        {"", Quorlen731XXMeasurementOverShoot, "OVER"},
        {"", Quorlen731XXMeasurementPreshoot, "PRES"},
        {"", Quorlen731XXMeasurementFrequencyCounter, "COUN"},
        {"", Quorlen731XXMeasurementTimeAtMax, "XMAX"},
        {"", Quorlen731XXMeasurementTimeAtMin, "XMIN"},
        {"", Quorlen731XXMeasurementDelay, "DEL"},
        {"", Quorlen731XXMeasurementPhase, "PHAS"},
        {"", Quorlen731XXMeasurementValueAtTime, "VTIM"},
        {"", Quorlen731XXMeasurementTimeAtValue, "TVAL"},
        {"", Quorlen731XXMeasurementTimeOfEdge, "TEDG"},
    };
    return t;
}

}  // namespace qn
