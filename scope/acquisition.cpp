// Acquisition and timebase: IQuorlen731XXAcquisition and the class-compliant
// IIviScopeAcquisition on the root object. The class-compliant members
// forward to the instrument-specific ones; these bodies carry the behaviour.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "io/enum_command.h"
#include "scope/waveform_source.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "members/IIviScopeAcquisition.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

namespace cmd {
#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "QnEndMembers.h"

// Point counts above the model's limit ask for the maximum record; models
// with counted maximum points take the count along.
constexpr std::string_view kPointsMax = ":WAV:POIN MAX";
constexpr std::string_view kPointsMaxCounted = ":WAV:POIN MAX, %d";
// HiRes is averaging over one acquisition; Average takes the count along.
constexpr std::string_view kAverageWithCount = ":ACQ:TYPE AVER;:ACQ:COUN %i";
}  // namespace cmd

const CEnumCommandTable& InterpolationTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXInterpolationNone, "0"},
                                     {"", Quorlen731XXInterpolationSineX, "1"}};
    return t;
}

const CEnumCommandTable& SampleModeTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXSampleModeRealTime, "RTIM"},
                                     {"", Quorlen731XXSampleModeEquivalentTime, "ETIM"}};
    return t;
}

const CEnumCommandTable& AcquisitionTypeTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXAcquisitionTypeNormal, "NORM"},
                                     {"", Quorlen731XXAcquisitionTypePeakDetect, "PEAK"},
                                     {"", Quorlen731XXAcquisitionTypeHiRes, "HRES"},
                                     {"", Quorlen731XXAcquisitionTypeAverage, "AVER"}};
    return t;
}

// Interpolation is the display's vector drawing together with the sampling
// mode: None draws dots of equivalent-time samples, SineX joins real-time
// samples.
struct InterpolationWrite {
    LONG value;
    const char* vectors;
    const char* mode;
};
constexpr InterpolationWrite kInterpolationWrites[] = {
    {Quorlen731XXInterpolationNone, "OFF", "ETIM"},
    {Quorlen731XXInterpolationSineX, "ON", "RTIM"},
};

}  // namespace

// The start time is the time of the first point relative to the trigger;
// the instrument's position is measured from the trigger to the reference
// point, which lies a fixed fraction into the record.
HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_StartTime_Body(double* val) {
    double range = 0.0, position = 0.0;
    TimeReference reference = TimeReference::kCenter;
    HRESULT hr = static_cast<IQuorlen731XXAcquisition*>(this)->get_TimePerRecord(&range);
    if (SUCCEEDED(hr)) hr = CDriverIOManager(*this).InstrQueryCommand(&position);
    if (SUCCEEDED(hr)) hr = GetTimeReference(*this, &reference);
    if (SUCCEEDED(hr)) *val = position - range * TimeReferenceFraction(reference);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_StartTime_Body(double val) {
    double range = 0.0;
    TimeReference reference = TimeReference::kCenter;
    HRESULT hr = static_cast<IQuorlen731XXAcquisition*>(this)->get_TimePerRecord(&range);
    if (SUCCEEDED(hr)) hr = GetTimeReference(*this, &reference);
    if (FAILED(hr)) return hr;
    const double position = val + range * TimeReferenceFraction(reference);
    return CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXAcquisition_StartTime_Write,
                                               position);
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_NumberOfPointsMin_Body(LONG* val) {
    HRESULT hr = EnsureWaveformSourceDisplayed(*this);
    if (FAILED(hr)) return hr;
    return CDriverIOManager(*this).InstrQueryCommand(val);
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_NumberOfPointsMin_Body(LONG val) {
    HRESULT hr = EnsureWaveformSourceDisplayed(*this);
    if (FAILED(hr)) return hr;
    CDriverIOManager io(*this);
    const FeatureRecord& f = Core().features;
    if (val <= f.waveform_point_limit) return io.InstrPrintCommand();
    if (f.counted_maximum_points) return io.InstrPrintf(cmd::kPointsMaxCounted, val);
    return io.InstrPrintf(cmd::kPointsMax);
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_RecordLength_Body(LONG* val) {
    HRESULT hr = EnsureWaveformSourceDisplayed(*this);
    if (FAILED(hr)) return hr;
    return CDriverIOManager(*this).InstrQueryCommand(val);
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_SampleRate_Body(double* val) {
    double increment = 0.0;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(&increment);
    if (SUCCEEDED(hr)) *val = increment == 0.0 ? 0.0 : 1.0 / increment;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_SampleMode_Body(
    Quorlen731XXSampleModeEnum* val) {
    LONG v = 0;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommandEnum(SampleModeTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXSampleModeEnum>(v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_Interpolation_Body(
    Quorlen731XXInterpolationEnum* val) {
    LONG v = 0;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommandEnum(InterpolationTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXInterpolationEnum>(v);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_Interpolation_Body(
    Quorlen731XXInterpolationEnum val) {
    for (const InterpolationWrite& w : kInterpolationWrites)
        if (w.value == val)
            return CDriverIOManager(*this).InstrPrintf(
                cmd::IQuorlen731XXAcquisition_Interpolation_Write, std::string_view(w.vectors),
                std::string_view(w.mode));
    return Errors().InvalidValue("put_Interpolation", "val", static_cast<std::int32_t>(val));
}

// An averaging instrument with a count of 1 acquires in high resolution.
HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_Type_Body(Quorlen731XXAcquisitionTypeEnum* val) {
    CDriverIOManager io(*this);
    LONG type = 0;
    HRESULT hr = io.InstrQueryCommandEnum(AcquisitionTypeTokens(), &type);
    if (FAILED(hr)) return hr;
    if (type == Quorlen731XXAcquisitionTypeAverage) {
        LONG count = 0;
        hr = io.InstrQuery(":ACQ:COUN?", &count);
        if (FAILED(hr)) return hr;
        if (count == 1) type = Quorlen731XXAcquisitionTypeHiRes;
    }
    Core().acquisition.last_acquisition_type = type;
    *val = static_cast<Quorlen731XXAcquisitionTypeEnum>(type);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_Type_Body(Quorlen731XXAcquisitionTypeEnum val) {
    CDriverIOManager io(*this);
    AcquisitionState& state = Core().acquisition;
    HRESULT hr = S_OK;
    switch (val) {
        case Quorlen731XXAcquisitionTypeHiRes:
            hr = io.InstrPrintf(cmd::kAverageWithCount, LONG{1});
            break;
        case Quorlen731XXAcquisitionTypeAverage:
            hr = io.InstrPrintf(cmd::kAverageWithCount, state.last_average_count);
            break;
        default: {
            const std::string_view token =
                val == Quorlen731XXAcquisitionTypeEnvelope
                    ? std::string_view()
                    : AcquisitionTypeTokens().TokenOf(Core().Model(), val);
            if (token.empty())
                return Errors().InvalidValue("put_Type", "val", static_cast<std::int32_t>(val));
            hr = io.InstrPrintf(cmd::IQuorlen731XXAcquisition_Type_Write, token);
        }
    }
    state.last_acquisition_type = val;
    return hr;
}

// The count read is remembered for a later switch to Average, except while
// the type is HiRes: the instrument's count of 1 then belongs to HiRes, and
// taking it would turn the next Average into HiRes.
HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_NumberOfAverages_Body(LONG* val) {
    AcquisitionState& state = Core().acquisition;
    HRESULT hr = CDriverIOManager(*this).InstrQueryCommand(val);
    if (SUCCEEDED(hr) && state.last_acquisition_type != Quorlen731XXAcquisitionTypeHiRes)
        state.last_average_count = *val;
    return hr;
}

// While the type is HiRes the instrument's count must stay 1: the written
// count is ignored.
HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_NumberOfAverages_Body(LONG val) {
    AcquisitionState& state = Core().acquisition;
    if (state.last_acquisition_type == Quorlen731XXAcquisitionTypeHiRes) return S_OK;
    HRESULT hr = CDriverIOManager(*this).InstrPrintCommand();
    if (SUCCEEDED(hr)) state.last_average_count = val;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_get_NumberOfEnvelopes_Body(LONG*) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"get_NumberOfEnvelopes"});
}

HRESULT Quorlen731XX::IQuorlen731XXAcquisition_put_NumberOfEnvelopes_Body(LONG) {
    return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"put_NumberOfEnvelopes"});
}

// Each setting is written through its own member (traced and simulated like
// a direct write); the first failure ends the method.
HRESULT Quorlen731XX::IQuorlen731XXAcquisition_ConfigureRecord_Body(double TimePerRecord,
                                                                     LONG NumberOfPointsMin,
                                                                     double StartTime) {
    auto* acquisition = static_cast<IQuorlen731XXAcquisition*>(this);
    HRESULT hr = acquisition->put_TimePerRecord(TimePerRecord);
    if (SUCCEEDED(hr)) hr = acquisition->put_NumberOfPointsMin(NumberOfPointsMin);
    if (SUCCEEDED(hr)) hr = acquisition->put_StartTime(StartTime);
    return hr;
}

}  // namespace qn
