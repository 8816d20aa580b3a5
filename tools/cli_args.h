// A small command-line parser for the qn731xx subcommands: "--name value"
// options and "--flag" switches, declared as data by each command.
#pragma once

#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qn::tools {

struct OptionSpec {
    std::string_view name;  // without the leading "--"
    bool takes_value;
    std::string_view help;
};

class CliArgs {
public:
    // Parses args against specs; false with a message on an unknown option or
    // a missing value. Words that are not options are kept as positionals.
    bool Parse(std::span<const OptionSpec> specs, std::span<char*> args, std::string* error);
    bool Has(std::string_view name) const { return values_.count(std::string(name)) != 0; }
    std::optional<std::string> Value(std::string_view name) const;
    const std::vector<std::string>& Positionals() const { return positionals_; }

private:
    std::map<std::string, std::string> values_;
    std::vector<std::string> positionals_;
};

std::string OptionHelp(std::span<const OptionSpec> specs);

}  // namespace qn::tools
