// printf-style formatting of SCPI commands from a runtime format string and
// typed arguments. Only the conversions the driver's command tables use are
// interpreted (%d %i %ld %u %x %g %.15g %f %e %s %c %%); an argument is
// converted by its own type, so a table whose format does not match its
// arguments yields a wrong text, never undefined behaviour.
#pragma once

#include <cstdint>
#include <deque>
#include <string>
#include <vector>
#include <string_view>
#include <variant>

namespace qn {

using CommandArg = std::variant<std::int64_t, double, std::string_view>;

std::string FormatCommand(std::string_view format, const CommandArg* args, std::size_t count);

template <class... A>
std::string FormatCommandArgs(std::string_view format, const A&... a) {
    const CommandArg args[] = {CommandArg(a)..., CommandArg(std::int64_t{0})};
    return FormatCommand(format, args, sizeof...(A));
}

// Arguments collected for one command; owns the texts it was given.
class CommandArgList {
public:
    void Add(CommandArg a) { args_.push_back(a); }
    void AddText(std::string s) {
        texts_.push_back(std::move(s));
        args_.push_back(CommandArg(std::string_view(texts_.back())));
    }
    std::string Format(std::string_view format) const {
        return FormatCommand(format, args_.data(), args_.size());
    }

private:
    std::deque<std::string> texts_;  // stable addresses for the views in args_
    std::vector<CommandArg> args_;
};

}  // namespace qn
