// The settings a qn731xx command reads and writes by name: one row per
// option, tying the option to a property of a driver interface. A command
// is its table plus RunSettings (setting_table.cpp does the parsing and
// printing shared by every table).
#pragma once

#include <cstdio>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/com/bstr.h"
#include "platform/com/types.h"
#include "tools/command_line.h"
#include "tools/session_util.h"

namespace qn::tools {

// A setting's value: a real, an integer, a switch, an enumeration value or
// a text.
using SettingValue = std::variant<double, LONG, bool, std::string>;

enum class SettingKind { kReal, kInteger, kSwitch, kChoice, kText, kQuotedText };

// One name of an enumeration value, as typed on the command line.
struct Choice {
    std::string_view name;
    LONG value;
};

template <class Itf>
struct Setting {
    std::string_view option;  // command-line option without "--"
    std::string_view label;   // property name as printed
    std::string_view help;
    SettingKind kind;
    std::span<const Choice> choices;  // kChoice only
    HRESULT (*get)(Itf*, SettingValue*);
    HRESULT (*put)(Itf*, const SettingValue&);  // nullptr: read-only
};

// Property accessors for the rows: Read<Itf, T, &Itf::get_X>, Write<...>.
template <class T>
SettingValue ToSetting(T v) {
    if constexpr (std::is_same_v<T, double>) return v;
    else if constexpr (std::is_same_v<T, VARIANT_BOOL>) return v != VARIANT_FALSE;
    else return static_cast<LONG>(v);
}

template <class Itf, class T, HRESULT (Itf::*Get)(T*)>
HRESULT Read(Itf* itf, SettingValue* out) {
    if constexpr (std::is_same_v<T, BSTR>) {
        com::Bstr text;
        HRESULT hr = (itf->*Get)(text.Out());
        *out = text.utf8();
        return hr;
    } else {
        T v{};
        HRESULT hr = (itf->*Get)(&v);
        *out = ToSetting(v);
        return hr;
    }
}

template <class Itf, class T, HRESULT (Itf::*Put)(T)>
HRESULT Write(Itf* itf, const SettingValue& v) {
    if constexpr (std::is_same_v<T, BSTR>) {
        com::Bstr text(std::get<std::string>(v));
        return (itf->*Put)(text.get());
    } else if constexpr (std::is_same_v<T, double>) {
        return (itf->*Put)(std::get<double>(v));
    } else if constexpr (std::is_same_v<T, VARIANT_BOOL>) {
        return (itf->*Put)(std::get<bool>(v) ? VARIANT_TRUE : VARIANT_FALSE);
    } else {
        return (itf->*Put)(static_cast<T>(std::get<LONG>(v)));
    }
}

// The table-independent part of a row.
struct SettingInfo {
    std::string_view option;
    std::string_view label;
    std::string_view help;
    SettingKind kind;
    std::span<const Choice> choices;
    bool writable;
};

// Parses the text of an option into a value of its kind; false with a
// message when the text does not fit.
bool ParseSetting(const SettingInfo& s, const std::string& text, SettingValue* out,
                  std::string* error);
// The value as printed ("on"/"off", the choice name, "%.15g").
std::string FormatSetting(const SettingInfo& s, const SettingValue& v);

// Adds one option per writable row (read-only rows are only printed); the
// text given to row i lands in (*texts)[i], and (*given)[i] tells whether
// the option was given at all.
void AddSettingOptions(CLI::App& app, std::span<const SettingInfo> rows,
                       std::vector<std::string>* texts, std::vector<CLI::Option*>* given);

// One read of a row: its value, or why it could not be read.
struct SettingReading {
    const SettingInfo* info;
    bool ok;
    SettingValue value;
    std::string failure;  // error text when !ok
};
// Prints the readings as an aligned list under `title`, or as one JSON
// object whose first field is `id_key` (when not empty) with `id`.
void PrintReadings(const std::string& title, const std::vector<SettingReading>& readings,
                   bool json, std::string_view id_key, long id);

template <class Itf>
SettingInfo InfoOf(const Setting<Itf>& s) {
    return {s.option, s.label, s.help, s.kind, s.choices, s.put != nullptr};
}

// The table of a settings command, its options and help, its parsed
// requests and the run over an interface.
template <class Itf>
class SettingTable {
public:
    explicit SettingTable(std::span<const Setting<Itf>> rows) : rows_(rows) {
        for (const Setting<Itf>& r : rows_) infos_.push_back(InfoOf(r));
    }
    // Adds the options of the writable rows to `app`.
    void AddOptions(CLI::App& app) { AddSettingOptions(app, infos_, &texts_, &given_); }

    // Parses the value of every option given; false with a message on the
    // first that does not fit.
    bool ParseRequests(std::string* error) {
        requests_.assign(rows_.size(), std::nullopt);
        for (std::size_t i = 0; i < rows_.size(); ++i) {
            if (!given_[i] || given_[i]->count() == 0) continue;
            SettingValue v;
            if (!ParseSetting(infos_[i], texts_[i], &v, error)) return false;
            requests_[i] = std::move(v);
        }
        return true;
    }

    // Writes the requested values in table order; the first failure ends
    // the writes. *failed names the option that failed.
    HRESULT Apply(Itf* itf, std::string* failed) const {
        for (std::size_t i = 0; i < rows_.size(); ++i) {
            if (!requests_[i]) continue;
            HRESULT hr = rows_[i].put(itf, *requests_[i]);
            if (FAILED(hr)) {
                *failed = "--" + std::string(rows_[i].option);
                return hr;
            }
        }
        return S_OK;
    }

    // Reads every row; a row the model does not support reads as a failure
    // with its error text.
    std::vector<SettingReading> ReadAll(Itf* itf) const {
        std::vector<SettingReading> out;
        for (std::size_t i = 0; i < rows_.size(); ++i) {
            SettingReading r{&infos_[i], false, SettingValue{}, {}};
            HRESULT hr = rows_[i].get(itf, &r.value);
            r.ok = SUCCEEDED(hr);
            if (!r.ok) r.failure = LastErrorText();
            out.push_back(std::move(r));
        }
        return out;
    }

private:
    std::span<const Setting<Itf>> rows_;
    std::vector<SettingInfo> infos_;
    std::vector<std::string> texts_;
    std::vector<CLI::Option*> given_;
    std::vector<std::optional<SettingValue>> requests_;
};

// A settings command after its command line was parsed: opens the session,
// finds the interface with target(driver, &itf, &what), writes the given
// values (the instrument's errors are printed when it refuses one), prints
// every row under `title` (or as JSON with `id_key`: `id` first) and closes.
template <class Itf, class Target>
int RunSettings(SettingTable<Itf>& table, const SessionOptions& options, Target target,
                const std::string& title, std::string_view id_key, long id) {
    std::string error;
    if (!table.ParseRequests(&error)) {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 2;
    }
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    ComPtr<Itf> itf;
    std::string what;
    hr = target(session.driver.get(), &itf, &what);
    if (FAILED(hr)) return ReportFailure(what, hr);
    std::string failed;
    hr = table.Apply(itf.get(), &failed);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), failed, hr);
    PrintReadings(title, table.ReadAll(itf.get()), options.json, id_key, id);
    return CloseSession(session);
}

// The target of the settings that live on the driver object itself.
template <class Itf>
HRESULT DriverItself(Quorlen731XX* driver, ComPtr<Itf>* itf, std::string*) {
    *itf = ComPtr<Itf>(static_cast<Itf*>(driver));
    return S_OK;
}

}  // namespace qn::tools
