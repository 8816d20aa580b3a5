// qn731xx system, screenshot, setup save|load and scpi: the instrument's
// clock and identity, its screen image, its whole setup kept in a file, and
// direct I/O through the driver's formatted-I/O object.
#include <cstdio>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "platform/com/safearray.h"
#include "tools/commands.h"
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

int UsageError(const char* command, const std::string& error, const char* usage) {
    std::fprintf(stderr, "qn731xx %s: %s\nusage: %s\n%s", command, error.c_str(), usage,
                 OptionHelp(kSessionOptions).c_str());
    return 2;
}

// Parses the session options and exactly `words` positionals.
bool ParseWords(std::span<char*> argv, std::size_t words, CliArgs* args, std::string* error) {
    if (!args->Parse(kSessionOptions, argv, error)) return false;
    if (args->Positionals().size() != words) {
        *error = "expected " + std::to_string(words) + " argument(s)";
        return false;
    }
    return true;
}

int CloseSession(ToolSession& session) {
    HRESULT hr = session.driver->Close();
    return FAILED(hr) ? ReportFailure("Close", hr) : 0;
}

bool WriteFile(const std::string& path, std::string_view head, const com::SafeArray& bytes) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out.write(head.data(), std::streamsize(head.size()));
    out.write(bytes.data<char>(), std::streamsize(bytes.size()));
    return bool(out.flush());
}

int SaveBytes(HRESULT (Sys::*get)(SAFEARRAY**), const char* what, const CliArgs& args,
              std::string_view head) {
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    SAFEARRAY* raw = nullptr;
    hr = (static_cast<Sys*>(session.driver.get())->*get)(&raw);
    com::SafeArray bytes(raw);
    if (FAILED(hr)) return ReportFailure(what, hr);
    const std::string& path = args.Positionals().back();
    if (!WriteFile(path, head, bytes)) {
        std::fprintf(stderr, "qn731xx: cannot write %s\n", path.c_str());
        return 1;
    }
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

int LoadSetup(const CliArgs& args) {
    std::string block, error;
    if (!ReadSetupFile(args.Positionals().back(), &block, &error)) {
        std::fprintf(stderr, "qn731xx setup load: %s\n", error.c_str());
        return 1;
    }
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
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
    std::printf("setup loaded from %s\n", args.Positionals().back().c_str());
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
    SettingTable<Sys> table(kSystemSettings);
    if (WantsHelp(argv)) {
        std::printf("usage: qn731xx system [options]\n%s", table.Help().c_str());
        return 0;
    }
    const std::vector<OptionSpec> options = table.Options();
    CliArgs args;
    std::string error;
    if (!args.Parse(options, argv, &error) || !args.Positionals().empty() ||
        !table.ParseRequests(args, &error)) {
        if (error.empty()) error = "unexpected word " + args.Positionals().front();
        std::fprintf(stderr, "qn731xx system: %s\nusage: qn731xx system [options]\n%s",
                     error.c_str(), table.Help().c_str());
        return 2;
    }
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    Sys* system = session.driver.get();
    std::string failed;
    hr = table.Apply(system, &failed);
    if (FAILED(hr)) return ReportFailure(failed.c_str(), hr);
    PrintReadings("System", table.ReadAll(system), args.Has("json"), "", 0);
    return CloseSession(session);
}

int ScreenshotCommand(std::span<char*> argv) {
    constexpr const char* kUsage = "qn731xx screenshot FILE.bmp [session options]";
    CliArgs args;
    std::string error;
    if (!ParseWords(argv, 1, &args, &error)) return UsageError("screenshot", error, kUsage);
    return SaveBytes(&Sys::GetScreenBitmap, "GetScreenBitmap", args, {});
}

int SetupCommand(std::span<char*> argv) {
    constexpr const char* kUsage = "qn731xx setup save|load FILE [session options]";
    CliArgs args;
    std::string error;
    if (!ParseWords(argv, 2, &args, &error)) return UsageError("setup", error, kUsage);
    const std::string& verb = args.Positionals().front();
    if (verb == "save") return SaveBytes(&Sys::GetState, "GetState", args, kSetupMagic);
    if (verb == "load") return LoadSetup(args);
    return UsageError("setup", "unknown action " + verb, kUsage);
}

int ScpiCommand(std::span<char*> argv) {
    constexpr const char* kUsage = "qn731xx scpi \"COMMAND\" [session options]";
    CliArgs args;
    std::string error;
    if (!ParseWords(argv, 1, &args, &error)) return UsageError("scpi", error, kUsage);
    const std::string& command = args.Positionals().front();
    // argv strings end at their first NUL, so only a line feed can reach here.
    if (command.empty() || command.find_first_of(std::string_view("\n\0", 2)) != std::string::npos)
        return UsageError("scpi", "the command must be one line of text", kUsage);
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    ComPtr<IFormattedIO488> io;
    hr = static_cast<Sys*>(session.driver.get())->get_IO(io.Out());
    if (FAILED(hr)) return ReportFailure("IO", hr);
    com::Bstr text(command + "\n");
    hr = io->WriteString(text.get(), VARIANT_TRUE);
    if (FAILED(hr)) return ReportFailure("WriteString", hr);
    if (IsQuery(command)) {
        com::Bstr reply;
        hr = io->ReadString(reply.Out());
        if (FAILED(hr)) return ReportFailure("ReadString", hr);
        std::fputs(reply.utf8().c_str(), stdout);
    }
    return CloseSession(session);
}

}  // namespace qn::tools
