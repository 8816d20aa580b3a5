// qn731xx fetch and qn731xx demo: waveform transfer through the driver's
// interfaces, with a summary, a CSV table and an SVG plot.
#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "Quorlen731XX.h"
#include "Quorlen731XXErrors.h"
#include "tools/commands.h"
#include "tools/measure_util.h"
#include "tools/session_util.h"
#include "tools/waveform_files.h"

namespace qn::tools {

namespace {

// The session options plus the waveform options.
std::vector<OptionSpec> WaveformOptions() {
    std::vector<OptionSpec> o(std::begin(kSessionOptions), std::end(kSessionOptions));
    o.push_back({"channel", true, "analog channel number (fetch; default 1)"});
    o.push_back({"digital", true, "digital channel number from 0 (fetch: its states)"});
    o.push_back({"points", true, "minimum number of points of the record"});
    o.push_back({"csv", true, "write the waveform(s) to this CSV file"});
    o.push_back({"plot", true, "write an SVG plot to this file"});
    o.push_back({"trigger-level", true, "acquire on an edge trigger at this level in V"});
    o.push_back({"trigger-source", true, "acquire on an edge trigger on this source"});
    return o;
}

// The trigger level of --trigger-level, when given and a number.
bool TriggerLevel(const CliArgs& args, std::optional<double>* level, std::string* error) {
    const auto text = args.Value("trigger-level");
    if (!text) return true;
    char* end = nullptr;
    const double v = std::strtod(text->c_str(), &end);
    if (text->empty() || *end != '\0' || !std::isfinite(v)) {
        *error = "--trigger-level " + *text + ": not a number";
        return false;
    }
    *level = v;
    return true;
}

bool ParseArgs(const char* command, std::span<char*> argv, CliArgs* args) {
    const std::vector<OptionSpec> specs = WaveformOptions();
    std::string error;
    std::optional<double> level;
    if (args->Parse(specs, argv, &error) && TriggerLevel(*args, &level, &error)) return true;
    std::fprintf(stderr, "qn731xx %s: %s\n%s", command, error.c_str(), OptionHelp(specs).c_str());
    return false;
}

bool WantsTrigger(const CliArgs& args) {
    return args.Has("trigger-level") || args.Has("trigger-source");
}

// --trigger-level and --trigger-source: an edge trigger with a normal sweep,
// so the acquisition waits for the level to be crossed.
HRESULT ApplyTrigger(Quorlen731XX* driver, const CliArgs& args, const char** what) {
    if (!WantsTrigger(args)) return S_OK;
    auto* trigger = static_cast<IQuorlen731XXTrigger*>(driver);
    *what = "trigger Type";
    HRESULT hr = trigger->put_Type(Quorlen731XXTriggerEdge);
    if (SUCCEEDED(hr) && args.Has("trigger-source")) {
        *what = "--trigger-source";
        com::Bstr source(*args.Value("trigger-source"));
        hr = trigger->put_Source(source.get());
    }
    if (SUCCEEDED(hr) && args.Has("trigger-level")) {
        *what = "--trigger-level";
        hr = trigger->put_Level(std::strtod(args.Value("trigger-level")->c_str(), nullptr));
    }
    if (SUCCEEDED(hr)) {
        *what = "trigger Modifier";
        hr = trigger->put_Modifier(Quorlen731XXTriggerModifierNone);
    }
    return hr;
}

// Fetches the current record of analog channel `channel` (1-based).
HRESULT FetchChannel(Quorlen731XX* driver, long channel, Trace* trace) {
    trace->name = "Channel" + std::to_string(channel);
    ComPtr<IQuorlen731XXMeasurement> m;
    com::Bstr name(trace->name);
    HRESULT hr = static_cast<IQuorlen731XXMeasurements*>(driver)->get_Item(name.get(), m.Out());
    if (FAILED(hr)) return hr;
    SAFEARRAY* raw = nullptr;
    hr = m->FetchWaveform(&raw, &trace->initial_x, &trace->x_increment);
    com::SafeArray data(raw);
    if (FAILED(hr)) return hr;
    trace->y.assign(data.data<double>(), data.data<double>() + data.size());
    return hr;  // S_IVISCOPE_INVALID_WFM_ELEMENT: delivered, some points NaN
}

// The states of digital channel `d` (0/1 per point) from its pod's bytes.
HRESULT FetchDigital(Quorlen731XX* driver, long d, Trace* trace) {
    trace->name = "UserDigitalChannel" + std::to_string(d);
    ComPtr<IQuorlen731XXDigitalChannel> ch;
    com::Bstr name(trace->name);
    HRESULT hr =
        static_cast<IQuorlen731XXDigitalChannels*>(driver)->get_Item(name.get(), ch.Out());
    if (FAILED(hr)) return hr;
    SAFEARRAY* raw = nullptr;
    hr = ch->FetchDigitalWaveform(&raw, &trace->initial_x, &trace->x_increment);
    com::SafeArray bytes(raw);
    if (FAILED(hr)) return hr;
    trace->y.clear();
    for (std::size_t i = 0; i < bytes.size(); ++i)
        trace->y.push_back((bytes.data<std::uint8_t>()[i] >> (d % 8)) & 1);
    return hr;
}

// Frequency, peak-to-peak and RMS of analog channel `channel`; a value the
// instrument could not measure is shown with its reason.
void PrintMeasurements(Quorlen731XX* driver, long channel) {
    ComPtr<IQuorlen731XXMeasurement> m;
    if (FAILED(MeasurementNamed(driver, "UserChannel" + std::to_string(channel), &m))) return;
    struct Row {
        Quorlen731XXMeasurementEnum function;
        const char* label;
        const char* unit;
    };
    constexpr Row kRows[] = {{Quorlen731XXMeasurementFrequency, "frequency", "Hz"},
                             {Quorlen731XXMeasurementVoltagePeakToPeak, "peak-to-peak", "V"},
                             {Quorlen731XXMeasurementVoltageRMS, "RMS", "V"}};
    std::printf("Channel%-3ld", channel);
    for (const Row& r : kRows) {
        double v = 0;
        if (SUCCEEDED(m->FetchWaveformMeasurement(r.function, &v)))
            std::printf("  %s %.6g %s", r.label, v, r.unit);
        else
            std::printf("  %s: %s", r.label, LastErrorText().c_str());
    }
    std::printf("\n");
}

void PrintSummary(const Trace& t) {
    double lo = INFINITY, hi = -INFINITY, sum = 0;
    std::size_t valid = 0;
    for (double v : t.y) {
        if (std::isnan(v)) continue;
        lo = std::min(lo, v), hi = std::max(hi, v), sum += v, ++valid;
    }
    const double span = t.y.empty() ? 0.0 : t.x_increment * double(t.y.size() - 1);
    std::printf("%-10s %8zu points  t0 %.6g s  span %.6g s  min %.6g V  max %.6g V  mean %.6g V",
                t.name.c_str(), t.y.size(), t.initial_x, span, valid ? lo : NAN,
                valid ? hi : NAN, valid ? sum / double(valid) : NAN);
    if (valid < t.y.size()) std::printf("  (%zu points without data)", t.y.size() - valid);
    std::printf("\n");
}

int WriteFiles(std::optional<std::string> csv, std::optional<std::string> svg,
               const std::vector<Trace>& traces) {
    if (csv) {
        if (!WriteCsv(*csv, traces)) return std::fprintf(stderr, "cannot write %s\n", csv->c_str()), 1;
        std::printf("wrote %s\n", csv->c_str());
    }
    if (svg) {
        if (!WriteSvg(*svg, traces)) return std::fprintf(stderr, "cannot write %s\n", svg->c_str()), 1;
        std::printf("wrote %s\n", svg->c_str());
    }
    return 0;
}

HRESULT SetPoints(Quorlen731XX* driver, const CliArgs& args) {
    auto points = args.Value("points");
    if (!points) return S_OK;
    return static_cast<IQuorlen731XXAcquisition*>(driver)->put_NumberOfPointsMin(
        static_cast<LONG>(std::stol(*points)));
}

// One channel's settings, through the instrument-specific channel.
HRESULT ConfigureChannel(Quorlen731XX* driver, long channel, double range, double offset) {
    ComPtr<IQuorlen731XXChannel> ch;
    com::Bstr name("UserChannel" + std::to_string(channel));
    HRESULT hr = static_cast<IQuorlen731XXChannels*>(driver)->get_Item(name.get(), ch.Out());
    if (SUCCEEDED(hr)) hr = ch->put_Enabled(VARIANT_TRUE);
    if (SUCCEEDED(hr)) hr = ch->put_Range(range);
    if (SUCCEEDED(hr)) hr = ch->put_Offset(offset);
    return hr;
}

// Starts one acquisition and polls its status with a progress indicator.
HRESULT AcquireOnce(Quorlen731XX* driver) {
    auto* acq = static_cast<IQuorlen731XXMeasurements*>(driver);
    HRESULT hr = acq->Initiate();
    if (FAILED(hr)) return hr;
    std::printf("acquiring ");
    Quorlen731XXAcquisitionStatusEnum status = Quorlen731XXAcqInProgress;
    for (int i = 0; i < 500; ++i) {
        hr = acq->Status(&status);
        if (FAILED(hr) || status == Quorlen731XXAcqComplete) break;
        std::printf(".");
        std::fflush(stdout);
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    std::printf(FAILED(hr) ? " failed\n" : status == Quorlen731XXAcqComplete ? " done\n"
                                                                              : " gave up\n");
    if (SUCCEEDED(hr) && status != Quorlen731XXAcqComplete) {
        acq->Abort();
        return E_IVISCOPE_MAX_TIME_EXCEEDED;
    }
    return hr;
}

}  // namespace

int FetchCommand(std::span<char*> argv) {
    CliArgs args;
    if (!ParseArgs("fetch", argv, &args)) return 2;
    const long channel = std::stol(args.Value("channel").value_or("1"));
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    Quorlen731XX* driver = session.driver.get();
    if (auto digital = args.Value("digital")) {
        std::vector<Trace> traces(1);
        const long d = std::stol(*digital);
        if (session.emulator) {
            // The embedded emulator starts with its pods off and no record.
            ComPtr<IQuorlen731XXDigitalChannel> ch;
            com::Bstr name("UserDigitalChannel" + std::to_string(d));
            hr = static_cast<IQuorlen731XXDigitalChannels*>(driver)->get_Item(name.get(), ch.Out());
            if (SUCCEEDED(hr)) hr = ch->put_Enabled(VARIANT_TRUE);
            if (SUCCEEDED(hr)) hr = AcquireOnce(driver);
            if (FAILED(hr)) return ReportFailure("Acquire", hr);
        }
        hr = FetchDigital(driver, d, &traces[0]);
        if (FAILED(hr)) return ReportFailure("FetchDigitalWaveform", hr);
        PrintSummary(traces[0]);
        const int rc = WriteFiles(args.Value("csv"), args.Value("plot"), traces);
        hr = driver->Close();
        return FAILED(hr) ? ReportFailure("Close", hr) : rc;
    }
    const char* what = "";
    if (FAILED(hr = ApplyTrigger(driver, args, &what))) return ReportFailure(what, hr);
    if (session.emulator || WantsTrigger(args)) {
        // The embedded emulator has no record until something acquired one;
        // a trigger asks for a new acquisition.
        if (session.emulator) hr = ConfigureChannel(driver, channel, 8.0, 0.0);
        if (SUCCEEDED(hr)) hr = AcquireOnce(driver);
        if (FAILED(hr)) return ReportFailure("Acquire", hr);
    }
    if (FAILED(hr = SetPoints(driver, args))) return ReportFailure("NumberOfPointsMin", hr);
    std::vector<Trace> traces(1);
    hr = FetchChannel(driver, channel, &traces[0]);
    if (FAILED(hr)) return ReportFailure("FetchWaveform", hr);
    PrintSummary(traces[0]);
    const int rc = WriteFiles(args.Value("csv"), args.Value("plot"), traces);
    hr = driver->Close();
    return FAILED(hr) ? ReportFailure("Close", hr) : rc;
}

// A complete test-program flow: identify, reset, configure, acquire, fetch,
// summarise, save, close.
int DemoCommand(std::span<char*> argv) {
    CliArgs args;
    if (!ParseArgs("demo", argv, &args)) return 2;
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    Quorlen731XX* driver = session.driver.get();
    com::Bstr maker, model, firmware;
    driver->get_InstrumentManufacturer(maker.Out());
    driver->get_InstrumentModel(model.Out());
    driver->get_InstrumentFirmwareRevision(firmware.Out());
    std::printf("instrument: %s %s, firmware %s%s\n", maker.utf8().c_str(), model.utf8().c_str(),
                firmware.utf8().c_str(), session.emulator ? " (embedded emulator)" : "");
    if (FAILED(hr = driver->Reset())) return ReportFailure("Reset", hr);
    std::printf("reset\n");
    auto* acq = static_cast<IQuorlen731XXAcquisition*>(driver);
    if (FAILED(hr = acq->put_TimePerRecord(1e-3))) return ReportFailure("TimePerRecord", hr);
    if (FAILED(hr = SetPoints(driver, args))) return ReportFailure("NumberOfPointsMin", hr);
    const std::pair<double, double> settings[] = {{8.0, 0.0}, {4.0, 0.5}};  // range, offset (V)
    for (long ch = 1; ch <= 2; ++ch)
        if (FAILED(hr = ConfigureChannel(driver, ch, settings[ch - 1].first,
                                         settings[ch - 1].second)))
            return ReportFailure("Configure channel", hr);
    std::printf("configured: 1 ms per record, channel 1 8 V / 0 V, channel 2 4 V / 0.5 V\n");
    const char* what = "";
    if (FAILED(hr = ApplyTrigger(driver, args, &what))) return ReportFailure(what, hr);
    if (FAILED(hr = AcquireOnce(driver))) return ReportFailure("Acquire", hr);
    std::vector<Trace> traces(2);
    for (long ch = 1; ch <= 2; ++ch)
        if (FAILED(hr = FetchChannel(driver, ch, &traces[std::size_t(ch - 1)])))
            return ReportFailure("FetchWaveform", hr);
    for (const Trace& t : traces) PrintSummary(t);
    for (long ch = 1; ch <= 2; ++ch) PrintMeasurements(driver, ch);
    const int rc = WriteFiles(args.Value("csv").value_or("qn731xx-demo.csv"),
                              args.Value("plot").value_or("qn731xx-demo.svg"), traces);
    if (FAILED(hr = driver->Close())) return ReportFailure("Close", hr);
    std::printf("closed\n");
    return rc;
}

}  // namespace qn::tools
