// qn731xx fetch and qn731xx demo: waveform transfer through the driver's
// interfaces, with a summary, a CSV table and an SVG plot.
#include <algorithm>
#include <chrono>
#include <climits>
#include <cstdint>
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
#include "tools/json_output.h"
#include "tools/measure_util.h"
#include "tools/progress.h"
#include "tools/session_util.h"
#include "tools/waveform_files.h"

namespace qn::tools {

namespace {

// The waveform options of fetch and demo.
struct WaveformOptions {
    long channel = 1;
    long digital = 0;
    long points = 0;
    std::string csv, plot;
    double trigger_level = 0.0;
    std::string trigger_source;
    CLI::Option* digital_given = nullptr;
    CLI::Option* points_given = nullptr;
    CLI::Option* level_given = nullptr;
    CLI::Option* source_given = nullptr;
};

void AddWaveformOptions(CLI::App& app, WaveformOptions* w) {
    app.add_option("--channel", w->channel, "analog channel number (fetch)")
        ->check(CLI::Range(1, 64))
        ->capture_default_str();
    w->digital_given = app.add_option("--digital", w->digital,
                                      "digital channel number from 0 (fetch: its states)")
                           ->check(CLI::Range(0, 1023));
    w->points_given = app.add_option("--points", w->points, "minimum number of points of the record")
                          ->check(CLI::Range(1, INT32_MAX));
    app.add_option("--csv", w->csv, "write the waveform(s) to this CSV file");
    app.add_option("--plot", w->plot, "write an SVG plot to this file");
    w->level_given = app.add_option("--trigger-level", w->trigger_level,
                                    "acquire on an edge trigger at this level in V")
                         ->check(CLI::Validator(
                             [](std::string& text) {
                                 char* end = nullptr;
                                 const double v = std::strtod(text.c_str(), &end);
                                 const bool ok = !text.empty() && *end == '\0' && std::isfinite(v);
                                 return ok ? std::string() : text + " is not a finite number";
                             },
                             ""));
    w->source_given = app.add_option("--trigger-source", w->trigger_source,
                                     "acquire on an edge trigger on this source");
}

bool WantsTrigger(const WaveformOptions& w) {
    return w.level_given->count() || w.source_given->count();
}

// --trigger-level and --trigger-source: an edge trigger with a normal sweep,
// so the acquisition waits for the level to be crossed.
HRESULT ApplyTrigger(Quorlen731XX* driver, const WaveformOptions& w, const char** what) {
    if (!WantsTrigger(w)) return S_OK;
    auto* trigger = static_cast<IQuorlen731XXTrigger*>(driver);
    *what = "trigger Type";
    HRESULT hr = trigger->put_Type(Quorlen731XXTriggerEdge);
    if (SUCCEEDED(hr) && w.source_given->count()) {
        *what = "--trigger-source";
        com::Bstr source(w.trigger_source);
        hr = trigger->put_Source(source.get());
    }
    if (SUCCEEDED(hr) && w.level_given->count()) {
        *what = "--trigger-level";
        hr = trigger->put_Level(w.trigger_level);
    }
    if (SUCCEEDED(hr)) {
        *what = "trigger Modifier";
        hr = trigger->put_Modifier(Quorlen731XXTriggerModifierNone);
    }
    return hr;
}

// Fetches the current record of analog channel `channel` (1-based); the
// points stay in the driver's array.
HRESULT FetchChannel(Quorlen731XX* driver, long channel, Trace* trace) {
    trace->name = "Channel" + std::to_string(channel);
    ComPtr<IQuorlen731XXMeasurement> m;
    com::Bstr name(trace->name);
    HRESULT hr = static_cast<IQuorlen731XXMeasurements*>(driver)->get_Item(name.get(), m.Out());
    if (FAILED(hr)) return hr;
    SAFEARRAY* raw = nullptr;
    {
        Progress progress("fetching " + trace->name);
        hr = m->FetchWaveform(&raw, &trace->initial_x, &trace->x_increment);
    }
    trace->array = com::SafeArray(raw);
    if (FAILED(hr)) return hr;
    trace->y = {trace->array.data<double>(), trace->array.size()};
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
    {
        Progress progress("fetching " + trace->name);
        hr = ch->FetchDigitalWaveform(&raw, &trace->initial_x, &trace->x_increment);
    }
    com::SafeArray bytes(raw);
    if (FAILED(hr)) return hr;
    const std::uint8_t* b = bytes.data<std::uint8_t>();
    trace->states.resize(bytes.size());
    for (std::size_t i = 0; i < trace->states.size(); ++i) trace->states[i] = (b[i] >> (d % 8)) & 1;
    trace->y = trace->states;
    return hr;
}

// Frequency, peak-to-peak and RMS of analog channel `channel`: a value, or
// the reason the instrument could not measure it.
Json Measurements(Quorlen731XX* driver, long channel) {
    Json out = {{"channel", channel}};
    ComPtr<IQuorlen731XXMeasurement> m;
    if (FAILED(MeasurementNamed(driver, "UserChannel" + std::to_string(channel), &m))) {
        out["error"] = LastErrorText();
        return out;
    }
    struct Row {
        Quorlen731XXMeasurementEnum function;
        const char* label;
        const char* unit;
    };
    constexpr Row kRows[] = {{Quorlen731XXMeasurementFrequency, "frequency", "Hz"},
                             {Quorlen731XXMeasurementVoltagePeakToPeak, "peak-to-peak", "V"},
                             {Quorlen731XXMeasurementVoltageRMS, "RMS", "V"}};
    for (const Row& r : kRows) {
        double v = 0;
        if (SUCCEEDED(m->FetchWaveformMeasurement(r.function, &v)))
            out[r.label] = {{"value", v}, {"unit", r.unit}};
        else
            out[r.label] = {{"error", LastErrorText()}};
    }
    return out;
}

void PrintMeasurements(const Json& m) {
    std::printf("Channel%-3ld", m["channel"].get<long>());
    for (const auto& [label, v] : m.items()) {
        if (label == "channel") continue;
        if (v.is_string())
            std::printf("  %s", v.get<std::string>().c_str());
        else if (v.contains("value"))
            std::printf("  %s %.6g %s", label.c_str(), v["value"].get<double>(),
                        v["unit"].get<std::string>().c_str());
        else
            std::printf("  %s: %s", label.c_str(), v["error"].get<std::string>().c_str());
    }
    std::printf("\n");
}

// Points, time span and the range and mean of the points with data.
Json Summary(const Trace& t) {
    double lo = INFINITY, hi = -INFINITY, sum = 0;
    std::size_t valid = 0;
    for (double v : t.y) {
        if (std::isnan(v)) continue;
        lo = std::min(lo, v), hi = std::max(hi, v), sum += v, ++valid;
    }
    const double span = t.y.empty() ? 0.0 : t.x_increment * double(t.y.size() - 1);
    Json j = {{"name", t.name},       {"points", t.y.size()}, {"initial_x", t.initial_x},
              {"x_increment", t.x_increment}, {"span", span},
              {"points_without_data", t.y.size() - valid}};
    // Without a point with data there is no range: null in JSON.
    j["min"] = valid ? Json(lo) : Json(nullptr);
    j["max"] = valid ? Json(hi) : Json(nullptr);
    j["mean"] = valid ? Json(sum / double(valid)) : Json(nullptr);
    return j;
}

void PrintSummary(const Json& s) {
    auto number = [&](const char* key) { return s[key].is_null() ? NAN : s[key].get<double>(); };
    std::printf("%-10s %8zu points  t0 %.6g s  span %.6g s  min %.6g V  max %.6g V  mean %.6g V",
                s["name"].get<std::string>().c_str(), s["points"].get<std::size_t>(),
                number("initial_x"), number("span"), number("min"), number("max"),
                number("mean"));
    if (const auto missing = s["points_without_data"].get<std::size_t>())
        std::printf("  (%zu points without data)", missing);
    std::printf("\n");
}

// Writes the files asked for; their names go to `written`.
int WriteFiles(const std::string& csv, const std::string& svg, const std::vector<Trace>& traces,
               Json* written) {
    if (!csv.empty()) {
        if (!WriteCsv(csv, traces)) return std::fprintf(stderr, "cannot write %s\n", csv.c_str()), 1;
        written->push_back(csv);
    }
    if (!svg.empty()) {
        if (!WriteSvg(svg, traces)) return std::fprintf(stderr, "cannot write %s\n", svg.c_str()), 1;
        written->push_back(svg);
    }
    return 0;
}

HRESULT SetPoints(Quorlen731XX* driver, const WaveformOptions& w) {
    if (!w.points_given->count()) return S_OK;
    return static_cast<IQuorlen731XXAcquisition*>(driver)->put_NumberOfPointsMin(
        static_cast<LONG>(w.points));
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

// Starts one acquisition and polls its status until it completes (about
// 10 s at most), showing progress while it waits for the trigger.
HRESULT AcquireOnce(Quorlen731XX* driver) {
    auto* acq = static_cast<IQuorlen731XXMeasurements*>(driver);
    HRESULT hr = acq->Initiate();
    if (FAILED(hr)) return hr;
    Progress progress("waiting for the trigger");
    Quorlen731XXAcquisitionStatusEnum status = Quorlen731XXAcqInProgress;
    for (int i = 0; i < 500; ++i) {
        hr = acq->Status(&status);
        if (FAILED(hr) || status == Quorlen731XXAcqComplete) break;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    if (SUCCEEDED(hr) && status != Quorlen731XXAcqComplete) {
        acq->Abort();
        return E_IVISCOPE_MAX_TIME_EXCEEDED;
    }
    return hr;
}

// Prints the summaries and the files written, as text or as one object.
void PrintTraces(const Json& report, bool json) {
    if (json) return PrintJson(report);
    for (const Json& t : report["traces"]) PrintSummary(t);
    if (report.contains("measurements"))
        for (const Json& m : report["measurements"]) PrintMeasurements(m);
    for (const Json& f : report["files"]) std::printf("wrote %s\n", f.get<std::string>().c_str());
}

}  // namespace

int FetchCommand(std::span<char*> argv) {
    SessionOptions options;
    WaveformOptions w;
    auto app = CommandApp("fetch", "Fetch one channel's waveform and summarise it.", &options);
    AddWaveformOptions(*app, &w);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    Quorlen731XX* driver = session.driver.get();
    std::vector<Trace> traces(1);
    if (w.digital_given->count()) {
        if (session.emulator) {
            // The embedded emulator starts with its pods off and no record.
            ComPtr<IQuorlen731XXDigitalChannel> ch;
            com::Bstr name("UserDigitalChannel" + std::to_string(w.digital));
            hr = static_cast<IQuorlen731XXDigitalChannels*>(driver)->get_Item(name.get(), ch.Out());
            if (SUCCEEDED(hr)) hr = ch->put_Enabled(VARIANT_TRUE);
            if (SUCCEEDED(hr)) hr = AcquireOnce(driver);
            if (FAILED(hr)) return ReportFailure(driver, "Acquire", hr);
        }
        hr = FetchDigital(driver, w.digital, &traces[0]);
        if (FAILED(hr)) return ReportFailure(driver, "FetchDigitalWaveform", hr);
    } else {
        const char* what = "";
        if (FAILED(hr = ApplyTrigger(driver, w, &what))) return ReportFailure(driver, what, hr);
        if (session.emulator || WantsTrigger(w)) {
            // The embedded emulator has no record until something acquired
            // one; a trigger asks for a new acquisition.
            if (session.emulator) hr = ConfigureChannel(driver, w.channel, 8.0, 0.0);
            if (SUCCEEDED(hr)) hr = AcquireOnce(driver);
            if (FAILED(hr)) return ReportFailure(driver, "Acquire", hr);
        }
        if (FAILED(hr = SetPoints(driver, w))) return ReportFailure(driver, "NumberOfPointsMin", hr);
        hr = FetchChannel(driver, w.channel, &traces[0]);
        if (FAILED(hr)) return ReportFailure(driver, "FetchWaveform", hr);
    }
    Json report = {{"traces", {Summary(traces[0])}}, {"files", Json::array()}};
    const int rc = WriteFiles(w.csv, w.plot, traces, &report["files"]);
    PrintTraces(report, options.json);
    if (const int close_rc = CloseSession(session)) return close_rc;
    return rc;
}

// A complete test-program flow: identify, reset, configure, acquire, fetch,
// summarise, save, close.
int DemoCommand(std::span<char*> argv) {
    SessionOptions options;
    WaveformOptions w;
    w.csv = "qn731xx-demo.csv";
    w.plot = "qn731xx-demo.svg";
    auto app = CommandApp(
        "demo", "Identify, reset, configure two channels, acquire, fetch, summarise, write CSV and SVG.",
        &options);
    AddWaveformOptions(*app, &w);
    app->get_option("--csv")->capture_default_str();
    app->get_option("--plot")->capture_default_str();
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    Quorlen731XX* driver = session.driver.get();
    com::Bstr maker, model, firmware;
    driver->get_InstrumentManufacturer(maker.Out());
    driver->get_InstrumentModel(model.Out());
    driver->get_InstrumentFirmwareRevision(firmware.Out());
    Json report = {{"instrument",
                    {{"manufacturer", maker.utf8()},
                     {"model", model.utf8()},
                     {"firmware_revision", firmware.utf8()},
                     {"embedded_emulator", session.emulator != nullptr}}}};
    if (!options.json)
        std::printf("instrument: %s %s, firmware %s%s\n", maker.utf8().c_str(),
                    model.utf8().c_str(), firmware.utf8().c_str(),
                    session.emulator ? " (embedded emulator)" : "");
    if (FAILED(hr = driver->Reset())) return ReportFailure(driver, "Reset", hr);
    auto* acq = static_cast<IQuorlen731XXAcquisition*>(driver);
    if (FAILED(hr = acq->put_TimePerRecord(1e-3))) return ReportFailure(driver, "TimePerRecord", hr);
    if (FAILED(hr = SetPoints(driver, w))) return ReportFailure(driver, "NumberOfPointsMin", hr);
    const std::pair<double, double> settings[] = {{8.0, 0.0}, {4.0, 0.5}};  // range, offset (V)
    for (long ch = 1; ch <= 2; ++ch)
        if (FAILED(hr = ConfigureChannel(driver, ch, settings[ch - 1].first,
                                         settings[ch - 1].second)))
            return ReportFailure(driver, "Configure channel", hr);
    if (!options.json)
        std::printf("reset; configured: 1 ms per record, channel 1 8 V / 0 V, channel 2 4 V / 0.5 V\n");
    const char* what = "";
    if (FAILED(hr = ApplyTrigger(driver, w, &what))) return ReportFailure(driver, what, hr);
    if (FAILED(hr = AcquireOnce(driver))) return ReportFailure(driver, "Acquire", hr);
    std::vector<Trace> traces(2);
    for (long ch = 1; ch <= 2; ++ch)
        if (FAILED(hr = FetchChannel(driver, ch, &traces[std::size_t(ch - 1)])))
            return ReportFailure(driver, "FetchWaveform", hr);
    report["traces"] = {Summary(traces[0]), Summary(traces[1])};
    report["measurements"] = {Measurements(driver, 1), Measurements(driver, 2)};
    report["files"] = Json::array();
    const int rc = WriteFiles(w.csv, w.plot, traces, &report["files"]);
    PrintTraces(report, options.json);
    if (const int close_rc = CloseSession(session)) return close_rc;
    return rc;
}

}  // namespace qn::tools
