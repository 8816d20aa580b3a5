#include "emulator/scope_sources.h"

#include <cctype>

#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

std::string Upper(std::string s) {
    for (char& c : s) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return s;
}

// "CHANNEL3" -> ("CHANNEL", 3); suffix 0 when absent.
std::pair<std::string, int> Split(const std::string& word) {
    std::size_t n = word.size();
    while (n > 0 && std::isdigit(static_cast<unsigned char>(word[n - 1]))) --n;
    const std::string digits = word.substr(n);
    const int suffix = digits.empty() || digits.size() > 3 ? 0 : std::stoi(digits);
    return {word.substr(0, n), suffix};
}

}  // namespace

std::optional<std::string> SourceArg(Instrument& inst, const Argument& arg) {
    if (arg.kind == Argument::Kind::kText) {
        const auto [letters, n] = Split(Upper(arg.value));
        const ModelInfo& m = inst.model();
        if ((letters == "CHAN" || letters == "CHANNEL") && n >= 1 && n <= m.analog_channels) {
            return "CHAN" + std::to_string(n);
        }
        if (letters == "POD" && n >= 1 && n <= m.pods) return "POD" + std::to_string(n);
        if ((letters == "DIG" || letters == "DIGITAL") && n >= 0 && n < 8 * m.pods &&
            std::isdigit(static_cast<unsigned char>(arg.value.back()))) {
            return "DIG" + std::to_string(n);
        }
        if ((letters == "MATH" || letters == "FUNC" || letters == "FUNCTION") && n == 0) {
            return std::string("MATH");
        }
    }
    inst.Error(err::kIllegalParameter);
    return std::nullopt;
}

bool IsDisplayed(Instrument& inst, const std::string& source) {
    const ScopeSettings& s = inst.settings();
    if (source.starts_with("DIG")) return s.digital[static_cast<std::size_t>(std::stoi(source.substr(3)))].display;
    const int n = source.back() - '0';
    if (source.starts_with("CHAN")) return s.channels[static_cast<std::size_t>(n - 1)].display;
    if (source.starts_with("POD")) return s.pod_display[static_cast<std::size_t>(n - 1)];
    return s.math_display;
}

ChannelSettings* ChannelOf(Instrument& inst, const Call& call) {
    const int n = call.suffix(0);
    if (n < 1 || n > inst.model().analog_channels) {
        inst.Error(err::kSuffixOutOfRange);
        return nullptr;
    }
    return &inst.settings().channels[static_cast<std::size_t>(n - 1)];
}

}  // namespace qn::emu
