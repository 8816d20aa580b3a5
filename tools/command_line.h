// Command-line parsing of the qn731xx subcommands (CLI11): every command
// builds a CLI::App of its options, and Parse handles --help and usage
// errors the same way for all of them.
#pragma once

#include <CLI/CLI.hpp>

#include <memory>
#include <optional>
#include <span>
#include <string>

namespace qn::tools {

// The options every session-opening command accepts.
struct SessionOptions {
    std::string resource;
    std::string model = "QDS4032A";
    std::string options;
    bool simulate = false;
    bool id_query = false;
    bool reset = false;
    bool json = false;
    // The instrument's status is checked after every call unless this is set,
    // so a value the instrument refuses fails the command with its message.
    bool no_status_check = false;
};

// A parser for "qn731xx NAME", with the session options when `options` is
// not null.
std::unique_ptr<CLI::App> CommandApp(const std::string& name, const std::string& description,
                                     SessionOptions* options);

// Parses argv (without the command name). Returns the exit code when the
// command must stop: 0 after printing the help to stdout, 2 after a usage
// error that names the command's --help on stderr.
std::optional<int> ParseCommandLine(CLI::App& app, std::span<char*> argv);

}  // namespace qn::tools
