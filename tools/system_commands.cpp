// qn731xx system, screenshot, setup save|load and scpi: the instrument's
// clock and identity, its screen image, its whole setup kept in a file, and
// direct I/O through the driver's formatted-I/O object.
#include <cstdio>
#include <fstream>
#include <iterator>
#include <optional>
#include <string>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "platform/com/safearray.h"
#include "tools/commands.h"
#include "tools/json_output.h"
#include "tools/session_util.h"
#include "tools/setting_table.h"

namespace qn::tools {

namespace {

using Sys = IQuorlen731XXSystem;

constexpr Setting<Sys> kSystemSettings[] = {
    {"date", "Date", "instrument date as +YYYY,+M,+D", SettingKind::kText, {},
     Read<Sys, BSTR, &Sys::get_Date>, Write<Sys, BSTR, &Sys::put_Date>},
    {"time", "Time", "instrument time as +h,+m,+s", SettingKind::kText, {},
     Read<Sys, BSTR, &Sys::get_Time>, Write<Sys, BSTR, &Sys::put_Time>},
    {"serial", "SerialNumber", "", SettingKind::kText, {},
     Read<Sys, BSTR, &Sys::get_SerialNumber>, nullptr},
    {"timeout", "TimeoutMilliseconds", "I/O timeout in ms (at least 100)", SettingKind::kInteger,
     {}, Read<Sys, LONG, &Sys::get_TimeoutMilliseconds>,
     Write<Sys, LONG, &Sys::put_TimeoutMilliseconds>},
};

// First line of a setup file; the instrument's setup block follows it.
constexpr std::string_view kSetupMagic = "qn731xx-setup 1\n";
// Largest setup file read back (bytes).
constexpr std::uintmax_t kMaxSetupFile = 16 * 1024 * 1024;

bool WriteFile(const std::string& path, std::string_view head, const com::SafeArray& bytes) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out.write(head.data(), std::streamsize(head.size()));
    out.write(bytes.data<char>(), std::streamsize(bytes.size()));
    return bool(out.flush());
}

int SaveBytes(HRESULT (Sys::*get)(SAFEARRAY**), const char* what, const SessionOptions& options,
              const std::string& path, std::string_view head) {
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    SAFEARRAY* raw = nullptr;
    hr = (static_cast<Sys*>(session.driver.get())->*get)(&raw);
    com::SafeArray bytes(raw);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), what, hr);
    if (!WriteFile(path, head, bytes)) {
        std::fprintf(stderr, "qn731xx: cannot write %s\n", path.c_str());
        return 1;
    }
    if (options.json)
        PrintJson({{"file", path}, {"bytes", bytes.size()}});
    else
        std::printf("%s: %u bytes\n", path.c_str(), unsigned(bytes.size()));
    return CloseSession(session);
}

// The setup block of a file written by "setup save"; false with a reason
// for anything else.
bool ReadSetupFile(const std::string& path, std::string* block, std::string* error) {
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        *error = "cannot read " + path;
        return false;
    }
    std::string head(kSetupMagic.size(), '\0');
    in.read(head.data(), std::streamsize(head.size()));
    if (head != kSetupMagic) {
        *error = path + " is not a setup file written by qn731xx setup save";
        return false;
    }
    block->assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
    if (block->empty() || block->size() > kMaxSetupFile) {
        *error = path + " holds no setup of a plausible size";
        return false;
    }
    return true;
}

int LoadSetup(const SessionOptions& options, const std::string& path) {
    std::string block, error;
    if (!ReadSetupFile(path, &block, &error)) {
        std::fprintf(stderr, "qn731xx setup load: %s\n", error.c_str());
        return 1;
    }
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    com::SafeArray data = com::SafeArray::Vector(VT_UI1, ULONG(block.size()));
    if (!data) return ReportFailure("PutState", E_OUTOFMEMORY);
    std::copy(block.begin(), block.end(), data.data<char>());
    const HRESULT put = static_cast<Sys*>(session.driver.get())->PutState(data.get());
    if (FAILED(put) && put != E_IVI_INSTRUMENT_STATUS) return ReportFailure("PutState", put);
    // The instrument tells through its error queue whether it took the setup
    // (with status checking on, PutState has already seen that it did not).
    LONG code = 0;
    com::Bstr message;
    hr = session.driver->ErrorQuery(&code, message.Out());
    if (FAILED(hr)) return ReportFailure("ErrorQuery", hr);
    if (code != 0 || FAILED(put)) {
        std::fprintf(stderr, "qn731xx setup load: the instrument refused the setup: %ld, %s\n",
                     long(code), message.utf8().c_str());
        return 1;
    }
    if (options.json)
        PrintJson({{"file", path}, {"loaded", true}});
    else
        std::printf("setup loaded from %s\n", path.c_str());
    return CloseSession(session);
}

// A query is a command with a '?' outside quoted strings.
bool IsQuery(std::string_view command) {
    char quote = 0;
    for (char c : command) {
        if (quote) {
            if (c == quote) quote = 0;
        } else if (c == '"' || c == '\'') {
            quote = c;
        } else if (c == '?') {
            return true;
        }
    }
    return false;
}

}  // namespace

int SystemCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp(
        "system", "Set and print the instrument's date and time, serial number and I/O timeout.",
        &options);
    SettingTable<Sys> table(kSystemSettings);
    table.AddOptions(*app);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    return RunSettings(table, options, DriverItself<Sys>, "System", "", 0);
}

int ScreenshotCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("screenshot", "Write the instrument's screen to a bitmap file.", &options);
    std::string path;
    app->add_option("FILE", path, "bitmap file to write, e.g. screen.bmp")->required();
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    return SaveBytes(&Sys::GetScreenBitmap, "GetScreenBitmap", options, path, {});
}

int SetupCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp(
        "setup", "save: keep the instrument's setup in FILE; load: put it back from FILE.",
        &options);
    std::string action, path;
    app->add_option("ACTION", action, "save or load")
        ->required()
        ->check(CLI::IsMember({"save", "load"}));
    app->add_option("FILE", path, "setup file")->required();
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    if (action == "save") return SaveBytes(&Sys::GetState, "GetState", options, path, kSetupMagic);
    return LoadSetup(options, path);
}

int ScpiCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp(
        "scpi", "Send one SCPI command through the driver's I/O object; a query prints its reply.",
        &options);
    std::string command;
    app->add_option("COMMAND", command, "one line of SCPI, e.g. \":CHAN1:RANG?\"")->required();
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    // argv strings end at their first NUL, so only a line feed can reach here.
    if (command.empty() || command.find('\n') != std::string::npos) {
        std::fprintf(stderr, "qn731xx scpi: the command must be one line of text\n");
        return 2;
    }
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    ComPtr<IFormattedIO488> io;
    hr = static_cast<Sys*>(session.driver.get())->get_IO(io.Out());
    if (FAILED(hr)) return ReportFailure("IO", hr);
    com::Bstr text(command + "\n");
    hr = io->WriteString(text.get(), VARIANT_TRUE);
    if (FAILED(hr)) return ReportFailure("WriteString", hr);
    std::optional<std::string> reply;
    if (IsQuery(command)) {
        com::Bstr r;
        hr = io->ReadString(r.Out());
        if (FAILED(hr)) return ReportFailure("ReadString", hr);
        reply = r.utf8();
    }
    // Direct I/O bypasses the driver's status check: ask the instrument
    // whether it took the command.
    if (!options.no_status_check && PrintInstrumentErrors(session.driver.get()) > 0) {
        std::fprintf(stderr, "qn731xx scpi: the instrument reported errors for %s\n",
                     command.c_str());
        return 1;
    }
    if (options.json) {
        Json j = {{"command", command}, {"reply", nullptr}};
        // The reply's own line feed is not part of its text.
        if (reply && !reply->empty() && reply->back() == '\n') reply->pop_back();
        if (reply) j["reply"] = *reply;
        PrintJson(j);
    } else if (reply) {
        std::fputs(reply->c_str(), stdout);
    }
    return CloseSession(session);
}

}  // namespace qn::tools
