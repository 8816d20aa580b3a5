#include "emulator/handler_util.h"

#include <cctype>
#include <cmath>
#include <cstdio>
#include <cstdlib>

namespace qn::emu {
namespace {

std::string Upper(std::string_view s) {
    std::string out(s);
    for (char& c : out) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

bool MatchesPattern(const std::string& word, std::string_view pattern) {
    std::size_t n = 0;
    while (n < pattern.size() && !std::islower(static_cast<unsigned char>(pattern[n]))) ++n;
    return word == Upper(pattern.substr(0, n)) || word == Upper(pattern);
}

}  // namespace

bool ExpectArgs(Instrument& inst, const Call& call, std::size_t count) {
    return ExpectArgs(inst, call, count, count);
}

bool ExpectArgs(Instrument& inst, const Call& call, std::size_t min, std::size_t max) {
    if (call.arg_count() < min) {
        inst.Error(err::kMissingParameter);
        return false;
    }
    if (call.arg_count() > max) {
        inst.Error(err::kParameterNotAllowed);
        return false;
    }
    return true;
}

bool NoArgs(Instrument& inst, const Call& call) {
    return ExpectArgs(inst, call, 0);
}

std::optional<double> NumberArg(Instrument& inst, const Argument& arg) {
    if (arg.kind == Argument::Kind::kText && !arg.value.empty()) {
        const char* begin = arg.value.c_str();
        char* end = nullptr;
        const double value = std::strtod(begin, &end);
        // strtod also reads hex, "inf" and "nan", which are not SCPI numbers
        const bool digits_only =
            arg.value.find_first_of("xXnN") == std::string::npos &&
            (std::isdigit(static_cast<unsigned char>(arg.value.back())) || arg.value.back() == '.');
        if (end == begin + arg.value.size() && digits_only && std::isfinite(value)) return value;
    }
    inst.Error(err::kDataType);
    return std::nullopt;
}

std::optional<double> NumberInRange(Instrument& inst, const Argument& arg, double min, double max) {
    const auto value = NumberArg(inst, arg);
    if (!value) return std::nullopt;
    if (*value < min || *value > max) {
        inst.Error(err::kDataOutOfRange);
        return std::nullopt;
    }
    return value;
}

std::optional<int> IntegerInRange(Instrument& inst, const Argument& arg, int min, int max) {
    const auto value = NumberInRange(inst, arg, min, max);
    if (!value) return std::nullopt;
    return static_cast<int>(std::lround(*value));
}

std::optional<bool> BoolArg(Instrument& inst, const Argument& arg) {
    if (arg.kind == Argument::Kind::kText) {
        const std::string word = Upper(arg.value);
        if (word == "ON") return true;
        if (word == "OFF") return false;
    }
    const auto value = NumberArg(inst, arg);
    if (!value) return std::nullopt;
    return std::lround(*value) != 0;
}

std::optional<std::string> StringArg(Instrument& inst, const Argument& arg) {
    if (arg.kind == Argument::Kind::kString) return arg.value;
    inst.Error(err::kDataType);
    return std::nullopt;
}

std::optional<std::string> TokenArg(Instrument& inst, const Argument& arg,
                                    std::span<const char* const> patterns) {
    if (arg.kind != Argument::Kind::kText) {
        inst.Error(err::kDataType);
        return std::nullopt;
    }
    const std::string word = Upper(arg.value);
    for (const char* pattern : patterns) {
        if (!MatchesPattern(word, pattern)) continue;
        std::string_view p(pattern);
        std::size_t n = 0;
        while (n < p.size() && !std::islower(static_cast<unsigned char>(p[n]))) ++n;
        return std::string(p.substr(0, n));
    }
    inst.Error(err::kIllegalParameter);
    return std::nullopt;
}

std::string FormatNumber(double value) {
    char text[40];
    std::snprintf(text, sizeof text, "%.15G", value);
    return text;
}

std::string FormatBool(bool value) {
    return value ? "1" : "0";
}

std::string Quote(std::string_view text) {
    std::string out = "\"";
    for (char c : text) {
        out += c;
        if (c == '"') out += '"';
    }
    return out + "\"";
}

}  // namespace qn::emu
