#include "tools/cli_args.h"

namespace qn::tools {

bool CliArgs::Parse(std::span<const OptionSpec> specs, std::span<char*> args, std::string* error) {
    for (std::size_t i = 0; i < args.size(); ++i) {
        std::string_view a = args[i];
        if (a.size() < 3 || a.substr(0, 2) != "--") {
            positionals_.emplace_back(a);
            continue;
        }
        std::string_view name = a.substr(2);
        std::optional<std::string> inline_value;
        if (auto eq = name.find('='); eq != std::string_view::npos) {
            inline_value = std::string(name.substr(eq + 1));
            name = name.substr(0, eq);
        }
        const OptionSpec* spec = nullptr;
        for (const OptionSpec& s : specs)
            if (s.name == name) spec = &s;
        if (!spec) {
            *error = "unknown option --" + std::string(name);
            return false;
        }
        if (!spec->takes_value) {
            values_[std::string(name)] = "";
            continue;
        }
        if (inline_value) {
            values_[std::string(name)] = *inline_value;
        } else if (i + 1 < args.size()) {
            values_[std::string(name)] = args[++i];
        } else {
            *error = "option --" + std::string(name) + " needs a value";
            return false;
        }
    }
    return true;
}

std::optional<std::string> CliArgs::Value(std::string_view name) const {
    auto it = values_.find(std::string(name));
    if (it == values_.end()) return std::nullopt;
    return it->second;
}

std::string OptionHelp(std::span<const OptionSpec> specs) {
    std::string out;
    for (const OptionSpec& s : specs) {
        std::string left = "  --" + std::string(s.name) + (s.takes_value ? " VALUE" : "");
        if (left.size() < 26) left.resize(26, ' ');
        out += left + std::string(s.help) + "\n";
    }
    return out;
}

}  // namespace qn::tools
