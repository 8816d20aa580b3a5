// qn731xx measure: one automatic measurement of an analog channel, or every
// measurement that applies to it, with units.
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "Quorlen731XX.h"
#include "Quorlen731XXErrors.h"
#include "tools/commands.h"
#include "tools/json_output.h"
#include "tools/measure_util.h"
#include "tools/session_util.h"

namespace qn::tools {

namespace {

// The functions by their enumeration names (without the Quorlen731XXMeasurement
// prefix) and the unit of their result.
struct FunctionRow {
    const char* name;
    Quorlen731XXMeasurementEnum value;
    const char* unit;
};
constexpr FunctionRow kFunctions[] = {
    {"RiseTime", Quorlen731XXMeasurementRiseTime, "s"},
    {"FallTime", Quorlen731XXMeasurementFallTime, "s"},
    {"Frequency", Quorlen731XXMeasurementFrequency, "Hz"},
    {"Period", Quorlen731XXMeasurementPeriod, "s"},
    {"VoltageRMS", Quorlen731XXMeasurementVoltageRMS, "V"},
    {"VoltagePeakToPeak", Quorlen731XXMeasurementVoltagePeakToPeak, "V"},
    {"VoltageMax", Quorlen731XXMeasurementVoltageMax, "V"},
    {"VoltageMin", Quorlen731XXMeasurementVoltageMin, "V"},
    {"VoltageHigh", Quorlen731XXMeasurementVoltageHigh, "V"},
    {"VoltageLow", Quorlen731XXMeasurementVoltageLow, "V"},
    {"VoltageAverage", Quorlen731XXMeasurementVoltageAverage, "V"},
    {"WidthNeg", Quorlen731XXMeasurementWidthNeg, "s"},
    {"WidthPos", Quorlen731XXMeasurementWidthPos, "s"},
    {"DutyCycleNeg", Quorlen731XXMeasurementDutyCycleNeg, "%"},
    {"DutyCyclePos", Quorlen731XXMeasurementDutyCyclePos, "%"},
    {"Amplitude", Quorlen731XXMeasurementAmplitude, "V"},
    {"VoltageCycleRMS", Quorlen731XXMeasurementVoltageCycleRMS, "V"},
    {"VoltageCycleAverage", Quorlen731XXMeasurementVoltageCycleAverage, "V"},
    {"OverShoot", Quorlen731XXMeasurementOverShoot, "%"},
    {"Preshoot", Quorlen731XXMeasurementPreshoot, "%"},
    {"FrequencyCounter", Quorlen731XXMeasurementFrequencyCounter, "Hz"},
    {"TimeAtMax", Quorlen731XXMeasurementTimeAtMax, "s"},
    {"TimeAtMin", Quorlen731XXMeasurementTimeAtMin, "s"},
    {"Delay", Quorlen731XXMeasurementDelay, "s"},
    {"Phase", Quorlen731XXMeasurementPhase, "deg"},
    {"ValueAtTime", Quorlen731XXMeasurementValueAtTime, "V"},
    {"TimeAtValue", Quorlen731XXMeasurementTimeAtValue, "s"},
    {"TimeOfEdge", Quorlen731XXMeasurementTimeOfEdge, "s"},
};

bool SameWord(const std::string& a, const char* b) {
    std::size_t i = 0;
    for (; i < a.size() && b[i]; ++i)
        if (std::tolower(static_cast<unsigned char>(a[i])) !=
            std::tolower(static_cast<unsigned char>(b[i])))
            return false;
    return i == a.size() && !b[i];
}

// The row named by its number or (case-insensitively) its name.
const FunctionRow* FindFunction(const std::string& text) {
    char* end = nullptr;
    const long n = std::strtol(text.c_str(), &end, 10);
    const bool number = !text.empty() && *end == '\0';
    for (const FunctionRow& f : kFunctions)
        if (number ? f.value == n : SameWord(text, f.name)) return &f;
    return nullptr;
}

struct Result {
    const FunctionRow* row;
    std::string label;  // the driver's name of the function
    HRESULT hr;
    double value;
    std::string failure;
};

Result Measure(IQuorlen731XXMeasurement* m, const FunctionRow& f) {
    Result r{&f, f.name, S_OK, 0.0, {}};
    com::Bstr label;
    if (SUCCEEDED(m->FunctionName(f.value, label.Out())) && label.get()) r.label = label.utf8();
    r.hr = m->FetchWaveformMeasurement(f.value, &r.value);
    if (FAILED(r.hr)) r.failure = LastErrorText();
    return r;
}

void Print(const std::vector<Result>& results, long channel, bool json) {
    if (json) {
        Json list = Json::array();
        for (const Result& r : results) {
            Json m = {{"function", r.row->name}, {"name", r.label}};
            if (SUCCEEDED(r.hr)) {
                m["value"] = r.value;
                m["unit"] = r.row->unit;
            } else {
                m["error"] = r.failure;
            }
            list.push_back(std::move(m));
        }
        PrintJson({{"channel", channel}, {"measurements", std::move(list)}});
        return;
    }
    for (const Result& r : results) {
        if (SUCCEEDED(r.hr))
            std::printf("%-18s %.9g %s\n", r.label.c_str(), r.value, r.row->unit);
        else
            std::printf("%-18s %s\n", r.label.c_str(), r.failure.c_str());
    }
}

}  // namespace

int MeasureCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("measure", "One measurement of an analog channel, or all of them.",
                          &options);
    long channel = 1;
    std::string function;
    app->add_option("--channel", channel, "analog channel number")
        ->check(CLI::Range(1, 64))
        ->capture_default_str();
    auto* one_opt = app->add_option("--function", function,
                                    "measurement: its number or name, e.g. Frequency, DutyCycleNeg");
    bool all = false;
    auto* all_opt = app->add_flag("--all", all, "every measurement of the channel");
    one_opt->excludes(all_opt);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    const FunctionRow* one = nullptr;
    if (one_opt->count()) {
        one = FindFunction(function);
        if (!one) {
            std::fprintf(stderr, "qn731xx measure: unknown measurement function %s\n",
                         function.c_str());
            return 2;
        }
    } else if (!all) {
        std::fprintf(stderr, "qn731xx measure: give --function F or --all\n");
        return 2;
    }

    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    ComPtr<IQuorlen731XXMeasurement> m;
    hr = ShowChannel(session, channel, &m);
    if (FAILED(hr))
        return ReportFailure(session.driver.get(), "channel " + std::to_string(channel), hr);
    std::vector<Result> results;
    if (one) {
        results.push_back(Measure(m.get(), *one));
    } else {
        for (const FunctionRow& f : kFunctions) results.push_back(Measure(m.get(), f));
    }
    Print(results, channel, options.json);
    if (const int rc = CloseSession(session)) return rc;
    // A single measurement that could not be made fails the command; --all
    // shows which ones could not be made.
    return one && FAILED(results.front().hr) ? 1 : 0;
}

}  // namespace qn::tools
