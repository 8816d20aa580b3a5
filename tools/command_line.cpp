#include "tools/command_line.h"

#include <cstdio>
#include <vector>

namespace qn::tools {

std::unique_ptr<CLI::App> CommandApp(const std::string& name, const std::string& description,
                                     SessionOptions* options) {
    auto app = std::make_unique<CLI::App>(description, "qn731xx " + name);
    app->get_formatter()->column_width(28);
    if (!options) return app;
    app->add_option("--resource", options->resource,
                    "VISA resource or logical name (default: the embedded emulator)");
    app->add_option("--model", options->model, "model of the embedded emulator")
        ->capture_default_str();
    app->add_option("--options", options->options,
                    "option string, e.g. \"Simulate=true,DriverSetup=Model=QDS4032A\"");
    app->add_flag("--simulate", options->simulate, "simulate the instrument");
    app->add_flag("--id-query", options->id_query, "check the instrument model");
    app->add_flag("--reset", options->reset, "reset the instrument after opening");
    app->add_flag("--json", options->json, "print one JSON object");
    app->add_flag("--no-status-check", options->no_status_check,
                  "do not ask the instrument for errors after each call");
    return app;
}

std::optional<int> ParseCommandLine(CLI::App& app, std::span<char*> argv) {
    // CLI11 takes the words in reverse order.
    std::vector<std::string> words(argv.rbegin(), argv.rend());
    try {
        app.parse(std::move(words));
    } catch (const CLI::CallForHelp&) {
        std::fputs(app.help().c_str(), stdout);
        return 0;
    } catch (const CLI::ParseError& e) {
        std::fprintf(stderr, "%s: %s\nRun '%s --help' for its options.\n",
                     app.get_name().c_str(), e.what(), app.get_name().c_str());
        return 2;
    }
    return std::nullopt;
}

}  // namespace qn::tools
