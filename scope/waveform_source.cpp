#include "scope/waveform_source.h"

#include <string>

#include "Quorlen731XXErrors.h"
#include "io/io_manager.h"

namespace qn {

namespace {

constexpr LONG kSourceReplyChars = 79;
constexpr LONG kReferenceReplyChars = 127;
constexpr LONG kChannelsPerPod = 8;

struct ReferenceToken {
    std::string_view token;
    TimeReference reference;
};
constexpr ReferenceToken kReferences[] = {
    {"LEFT", TimeReference::kLeft},
    {"CENT", TimeReference::kCenter},
    {"RIGHT", TimeReference::kRight},
    {"RIGH", TimeReference::kRight},
};

// A source name the instrument reported can be put into ":STAT? %s" only
// when it is a plain word; anything else (empty, blanks, control bytes)
// cannot name a displayed source.
bool IsPlainWord(std::string_view s) {
    if (s.empty()) return false;
    for (char c : s)
        if (static_cast<unsigned char>(c) <= ' ' || c == ';' || c == 0x7f) return false;
    return true;
}

std::string_view TrimBlanks(std::string_view s) {
    while (!s.empty() && (s.front() == ' ' || s.front() == '\t' || s.front() == '\r'))
        s.remove_prefix(1);
    while (!s.empty() && (s.back() == ' ' || s.back() == '\t' || s.back() == '\r'))
        s.remove_suffix(1);
    return s;
}

// Selects `source` when displayed; *selected tells whether it was.
HRESULT SelectIfDisplayed(CDriverNode& root, const std::string& source, bool* selected) {
    HRESULT hr = IsSourceDisplayed(root, source, selected);
    if (FAILED(hr) || !*selected) return hr;
    return CDriverIOManager(root).InstrPrintf(":WAV:SOUR %s", source);
}

}  // namespace

double TimeReferenceFraction(TimeReference reference) {
    switch (reference) {
        case TimeReference::kLeft: return 0.1;
        case TimeReference::kCenter: return 0.5;
        case TimeReference::kRight: return 0.9;
    }
    return 0.5;
}

HRESULT IsSourceDisplayed(CDriverNode& root, std::string_view source, bool* displayed) {
    *displayed = false;
    LONG state = 0;
    HRESULT hr = CDriverIOManager(root).InstrQueryf(":STAT? %s", &state, std::string(source));
    if (SUCCEEDED(hr)) *displayed = state == 1;
    return hr;
}

HRESULT SetWaveformSource(CDriverNode& root, std::string_view source) {
    bool displayed = false;
    HRESULT hr = IsSourceDisplayed(root, source, &displayed);
    if (FAILED(hr)) return hr;
    if (!displayed) return root.Errors().Error(Msg::E_IVISCOPE_CHANNEL_NOT_ENABLED);
    return CDriverIOManager(root).InstrPrintf(":WAV:SOUR %s", std::string(source));
}

HRESULT EnsureWaveformSourceDisplayed(CDriverNode& root) {
    std::string current;
    HRESULT hr = CDriverIOManager(root).InstrQuery(":WAV:SOUR?", &current, kSourceReplyChars);
    if (FAILED(hr)) return hr;
    const std::string_view name = TrimBlanks(current);
    bool done = false;
    if (IsPlainWord(name)) {
        hr = IsSourceDisplayed(root, name, &done);
        if (FAILED(hr) || done) return hr;
    }
    const FeatureRecord& f = root.Core().features;
    for (LONG i = 1; i <= f.analog_channel_count; ++i) {
        hr = SelectIfDisplayed(root, "CHAN" + std::to_string(i), &done);
        if (FAILED(hr) || done) return hr;
    }
    for (LONG d = 0; d < f.digital_channel_count; ++d) {
        hr = SelectIfDisplayed(root, "POD" + std::to_string(d / kChannelsPerPod + 1), &done);
        if (FAILED(hr) || done) return hr;
    }
    hr = SelectIfDisplayed(root, "MATH", &done);
    if (FAILED(hr) || done) return hr;
    return root.Errors().Error(Msg::E_IVISCOPE_CHANNEL_NOT_ENABLED);
}

HRESULT GetTimeReference(CDriverNode& root, TimeReference* reference) {
    std::string reply;
    HRESULT hr = CDriverIOManager(root).InstrQuery(":TIM:REF?", &reply, kReferenceReplyChars);
    if (FAILED(hr)) return hr;
    for (const ReferenceToken& r : kReferences) {
        if (reply == r.token) {
            *reference = r.reference;
            return hr;
        }
    }
    return root.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
}

}  // namespace qn
