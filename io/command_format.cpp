#include "io/command_format.h"

#include <cstdio>

namespace qn {

// The format handed to snprintf is rebuilt here from checked flags and a
// known conversion character, with an argument of the matching type.
#pragma GCC diagnostic ignored "-Wformat-nonliteral"

namespace {

// Appends the text of one snprintf conversion, however long it is: the
// first try uses a stack buffer, a longer text is formatted again into the
// output at its measured size.
template <class T>
void AppendPrintf(std::string& out, const std::string& format, T value) {
    char buf[128];
    const int n = std::snprintf(buf, sizeof buf, format.c_str(), value);
    if (n <= 0) return;
    if (static_cast<std::size_t>(n) < sizeof buf) {
        out.append(buf, static_cast<std::size_t>(n));
        return;
    }
    const std::size_t at = out.size();
    out.resize(at + static_cast<std::size_t>(n) + 1);
    std::snprintf(out.data() + at, static_cast<std::size_t>(n) + 1, format.c_str(), value);
    out.resize(at + static_cast<std::size_t>(n));
}

// Appends one conversion. `spec` is the whole conversion text ("%.15g");
// `conv` its conversion character.
void AppendConversion(std::string& out, std::string spec, char conv, const CommandArg& arg) {
    const bool integral = conv == 'd' || conv == 'i' || conv == 'u' || conv == 'x' ||
                          conv == 'X' || conv == 'c';
    const bool floating = conv == 'g' || conv == 'G' || conv == 'f' || conv == 'e' || conv == 'E';
    // Normalise length modifiers: integers print as long long, doubles as double.
    std::string flags;
    for (char c : spec.substr(1, spec.size() - 2))
        if (c != 'l' && c != 'h' && c != 'L' && c != 'z' && c != 'j') flags += c;
    if (const auto* s = std::get_if<std::string_view>(&arg)) {
        out += *s;  // a string (also where a number was expected) is inserted as text
        return;
    }
    if (integral) {
        long long v = std::holds_alternative<std::int64_t>(arg)
                          ? std::get<std::int64_t>(arg)
                          : static_cast<long long>(std::get<double>(arg));
        if (conv == 'c') {
            out += static_cast<char>(v);
            return;
        }
        AppendPrintf(out, "%" + flags + "ll" + conv, v);
    } else if (floating) {
        double v = std::holds_alternative<double>(arg)
                       ? std::get<double>(arg)
                       : static_cast<double>(std::get<std::int64_t>(arg));
        AppendPrintf(out, "%" + flags + conv, v);
    } else if (std::holds_alternative<double>(arg)) {  // %s with a number
        AppendPrintf(out, "%.15g", std::get<double>(arg));
    } else {
        AppendPrintf(out, "%lld", static_cast<long long>(std::get<std::int64_t>(arg)));
    }
}

}  // namespace

std::string FormatCommand(std::string_view format, const CommandArg* args, std::size_t count) {
    std::string out;
    out.reserve(format.size() + 16);
    std::size_t next = 0;
    for (std::size_t i = 0; i < format.size(); ++i) {
        char c = format[i];
        if (c != '%') {
            out += c;
            continue;
        }
        if (i + 1 < format.size() && format[i + 1] == '%') {
            out += '%';
            ++i;
            continue;
        }
        // Scan flags, width, precision and length up to the conversion character.
        std::size_t j = i + 1;
        while (j < format.size() && std::string_view("-+ #0123456789.lhLzj").find(format[j]) !=
                                        std::string_view::npos)
            ++j;
        if (j >= format.size() || (j - i) > 8) {  // malformed or absurd width: copy literally
            out.append(format.substr(i));
            break;
        }
        char conv = format[j];
        std::string spec(format.substr(i, j - i + 1));
        if (std::string_view("diuxXcgGfeEs").find(conv) == std::string_view::npos) {
            out += spec;  // unknown conversion: copy literally
        } else if (next < count) {
            AppendConversion(out, spec, conv, args[next++]);
        }
        i = j;
    }
    return out;
}

}  // namespace qn
