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
#include "tools/json.h"
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

std::vector<OptionSpec> Options() {
    std::vector<OptionSpec> o(std::begin(kSessionOptions), std::end(kSessionOptions));
    o.push_back({"channel", true, "analog channel number (default 1)"});
    o.push_back({"function", true, "measurement: its number or name, e.g. Frequency, DutyCycleNeg"});
    o.push_back({"all", false, "every measurement of the channel"});
    return o;
}

int Usage(const std::string& error) {
    std::fprintf(stderr,
                 "qn731xx measure: %s\nusage: qn731xx measure --channel N (--function F | --all) "
                 "[--json]\n%s",
                 error.c_str(), OptionHelp(Options()).c_str());
    return 2;
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
        JsonWriter w;
        w.BeginObject();
        w.Field("channel", channel);
        w.Key("measurements");
        w.BeginArray();
        for (const Result& r : results) {
            w.BeginObject();
            w.Field("function", r.row->name);
            w.Field("name", r.label);
            if (SUCCEEDED(r.hr)) {
                w.Field("value", r.value);
                w.Field("unit", r.row->unit);
            } else {
                w.Field("error", r.failure);
            }
            w.EndObject();
        }
        w.EndArray();
        w.EndObject();
        std::printf("%s\n", w.str().c_str());
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
    CliArgs args;
    std::string error;
    if (!args.Parse(Options(), argv, &error)) return Usage(error);
    char* end = nullptr;
    const std::string channel_text = args.Value("channel").value_or("1");
    const long channel = std::strtol(channel_text.c_str(), &end, 10);
    if (*end != '\0' || channel < 1 || channel > 64) return Usage("--channel takes a number from 1");
    const FunctionRow* one = nullptr;
    if (auto f = args.Value("function")) {
        one = FindFunction(*f);
        if (!one) return Usage("unknown measurement function " + *f);
    }
    if (!one == !args.Has("all")) return Usage("give --function F or --all");

    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    ComPtr<IQuorlen731XXMeasurement> m;
    hr = ShowChannel(session, channel, &m);
    if (FAILED(hr)) return ReportFailure(("channel " + std::to_string(channel)).c_str(), hr);
    std::vector<Result> results;
    if (one) {
        results.push_back(Measure(m.get(), *one));
    } else {
        for (const FunctionRow& f : kFunctions) results.push_back(Measure(m.get(), f));
    }
    Print(results, channel, args.Has("json"));
    hr = session.driver->Close();
    if (FAILED(hr)) return ReportFailure("Close", hr);
    // A single measurement that could not be made fails the command; --all
    // shows which ones could not be made.
    return one && FAILED(results.front().hr) ? 1 : 0;
}

}  // namespace qn::tools
