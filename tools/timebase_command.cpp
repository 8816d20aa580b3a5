// qn731xx timebase [--time-per-record S ...]: writes the given horizontal
// and acquisition settings and prints them as the instrument reports them.
#include <cstdio>
#include <string>

#include "tools/commands.h"
#include "tools/session_util.h"
#include "tools/setting_table.h"

namespace qn::tools {

namespace {

using Acq = IQuorlen731XXAcquisition;

constexpr Choice kInterpolations[] = {{"NONE", Quorlen731XXInterpolationNone},
                                      {"SINEX", Quorlen731XXInterpolationSineX},
                                      {"LINEAR", Quorlen731XXInterpolationLinear}};
constexpr Choice kTypes[] = {{"NORMAL", Quorlen731XXAcquisitionTypeNormal},
                             {"PEAK", Quorlen731XXAcquisitionTypePeakDetect},
                             {"HIRES", Quorlen731XXAcquisitionTypeHiRes},
                             {"ENVELOPE", Quorlen731XXAcquisitionTypeEnvelope},
                             {"AVERAGE", Quorlen731XXAcquisitionTypeAverage}};
constexpr Choice kSampleModes[] = {{"REALTIME", Quorlen731XXSampleModeRealTime},
                                   {"EQUIVALENT", Quorlen731XXSampleModeEquivalentTime}};

// Written in this order: the record as ConfigureRecord writes it, then the
// average count before the type, so that Average starts with that count.
constexpr Setting<Acq> kTimebaseSettings[] = {
    {"time-per-record", "TimePerRecord", "record duration in s", SettingKind::kReal, {},
     Read<Acq, double, &Acq::get_TimePerRecord>, Write<Acq, double, &Acq::put_TimePerRecord>},
    {"points", "NumberOfPointsMin", "minimum number of points", SettingKind::kInteger, {},
     Read<Acq, LONG, &Acq::get_NumberOfPointsMin>, Write<Acq, LONG, &Acq::put_NumberOfPointsMin>},
    {"start-time", "StartTime", "time of the first point relative to the trigger in s",
     SettingKind::kReal, {}, Read<Acq, double, &Acq::get_StartTime>,
     Write<Acq, double, &Acq::put_StartTime>},
    {"interpolation", "Interpolation", "interpolation between samples", SettingKind::kChoice,
     kInterpolations, Read<Acq, Quorlen731XXInterpolationEnum, &Acq::get_Interpolation>,
     Write<Acq, Quorlen731XXInterpolationEnum, &Acq::put_Interpolation>},
    {"averages", "NumberOfAverages", "acquisitions averaged", SettingKind::kInteger, {},
     Read<Acq, LONG, &Acq::get_NumberOfAverages>, Write<Acq, LONG, &Acq::put_NumberOfAverages>},
    {"type", "Type", "acquisition type", SettingKind::kChoice, kTypes,
     Read<Acq, Quorlen731XXAcquisitionTypeEnum, &Acq::get_Type>,
     Write<Acq, Quorlen731XXAcquisitionTypeEnum, &Acq::put_Type>},
    {"record-length", "RecordLength", "", SettingKind::kInteger, {},
     Read<Acq, LONG, &Acq::get_RecordLength>, nullptr},
    {"sample-rate", "SampleRate", "", SettingKind::kReal, {},
     Read<Acq, double, &Acq::get_SampleRate>, nullptr},
    {"sample-mode", "SampleMode", "", SettingKind::kChoice, kSampleModes,
     Read<Acq, Quorlen731XXSampleModeEnum, &Acq::get_SampleMode>, nullptr},
};

}  // namespace

int TimebaseCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("timebase", "Set and print the horizontal record and acquisition mode.",
                          &options);
    SettingTable<Acq> table(kTimebaseSettings);
    table.AddOptions(*app);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    return RunSettings(table, options, DriverItself<Acq>, "Timebase", "", 0);
}

}  // namespace qn::tools
