#include "tools/setting_table.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <strings.h>

#include "tools/json_output.h"

namespace qn::tools {

namespace {

bool ParseReal(const std::string& text, double* out) {
    if (text.empty()) return false;
    char* end = nullptr;
    errno = 0;
    *out = std::strtod(text.c_str(), &end);
    return errno == 0 && *end == '\0';
}

bool ParseInteger(const std::string& text, LONG* out) {
    if (text.empty()) return false;
    char* end = nullptr;
    errno = 0;
    const long v = std::strtol(text.c_str(), &end, 10);
    if (errno != 0 || *end != '\0' || v < INT32_MIN || v > INT32_MAX) return false;
    *out = static_cast<LONG>(v);
    return true;
}

bool SameWord(std::string_view a, std::string_view b) {
    return a.size() == b.size() && strncasecmp(a.data(), b.data(), a.size()) == 0;
}

constexpr Choice kSwitchWords[] = {{"on", 1},  {"off", 0}, {"true", 1},
                                   {"false", 0}, {"1", 1},   {"0", 0}};

std::string ChoiceNames(std::span<const Choice> choices) {
    std::string out;
    for (const Choice& c : choices) out += (out.empty() ? "" : "|") + std::string(c.name);
    return out;
}

const Choice* FindChoice(std::span<const Choice> choices, std::string_view text) {
    for (const Choice& c : choices)
        if (SameWord(c.name, text)) return &c;
    return nullptr;
}

bool Fail(std::string* error, std::string text) {
    *error = std::move(text);
    return false;
}

// The value placeholder of an option in the help.
const char* KindName(SettingKind kind) {
    switch (kind) {
        case SettingKind::kReal: return "REAL";
        case SettingKind::kInteger: return "INT";
        case SettingKind::kSwitch: return "on|off";
        case SettingKind::kChoice: return "CHOICE";
        case SettingKind::kText:
        case SettingKind::kQuotedText: return "TEXT";
    }
    return "TEXT";
}

}  // namespace

bool ParseSetting(const SettingInfo& s, const std::string& text, SettingValue* out,
                  std::string* error) {
    const std::string where = "--" + std::string(s.option) + " " + text + ": ";
    switch (s.kind) {
        case SettingKind::kReal: {
            double v = 0;
            if (!ParseReal(text, &v)) return Fail(error, where + "not a number");
            *out = v;
            return true;
        }
        case SettingKind::kInteger: {
            LONG v = 0;
            if (!ParseInteger(text, &v)) return Fail(error, where + "not an integer");
            *out = v;
            return true;
        }
        case SettingKind::kSwitch: {
            const Choice* c = FindChoice(kSwitchWords, text);
            if (!c) return Fail(error, where + "expected on or off");
            *out = c->value != 0;
            return true;
        }
        case SettingKind::kChoice: {
            const Choice* c = FindChoice(s.choices, text);
            if (!c) return Fail(error, where + "expected one of " + ChoiceNames(s.choices));
            *out = c->value;
            return true;
        }
        case SettingKind::kText:
            *out = text;
            return true;
        case SettingKind::kQuotedText:
            // The instrument takes a quoted string; quote plain text.
            *out = text.size() >= 2 && text.front() == '"' && text.back() == '"'
                       ? text
                       : "\"" + text + "\"";
            return true;
    }
    return false;
}

std::string FormatSetting(const SettingInfo& s, const SettingValue& v) {
    if (const auto* d = std::get_if<double>(&v)) {
        char buf[32];
        std::snprintf(buf, sizeof buf, "%.15g", *d);
        return buf;
    }
    if (const auto* b = std::get_if<bool>(&v)) return *b ? "on" : "off";
    if (const auto* t = std::get_if<std::string>(&v)) return *t;
    const LONG n = std::get<LONG>(v);
    if (s.kind == SettingKind::kChoice) {
        for (const Choice& c : s.choices)
            if (c.value == n) return std::string(c.name);
    }
    return std::to_string(n);
}

void AddSettingOptions(CLI::App& app, std::span<const SettingInfo> rows,
                       std::vector<std::string>* texts, std::vector<CLI::Option*>* given) {
    texts->assign(rows.size(), std::string());
    given->assign(rows.size(), nullptr);
    for (std::size_t i = 0; i < rows.size(); ++i) {
        const SettingInfo& r = rows[i];
        if (!r.writable) continue;
        std::string help(r.help);
        if (r.kind == SettingKind::kChoice) help += ": " + ChoiceNames(r.choices);
        (*given)[i] = app.add_option("--" + std::string(r.option), (*texts)[i], help)
                          ->type_name(KindName(r.kind));
    }
}

void PrintReadings(const std::string& title, const std::vector<SettingReading>& readings,
                   bool json, std::string_view id_key, long id) {
    if (!json) {
        std::printf("%s\n", title.c_str());
        for (const SettingReading& r : readings) {
            const std::string text = r.ok ? FormatSetting(*r.info, r.value) : "n/a";
            std::printf("  %-20.*s %s\n", int(r.info->label.size()), r.info->label.data(),
                        text.c_str());
        }
        return;
    }
    Json j = Json::object();
    if (!id_key.empty()) j[std::string(id_key)] = id;
    for (const SettingReading& r : readings) {
        Json& field = j[std::string(r.info->option)];
        if (!r.ok) {
            field = "n/a";
        } else if (const auto* d = std::get_if<double>(&r.value)) {
            field = *d;
        } else if (const auto* b = std::get_if<bool>(&r.value)) {
            field = *b;
        } else if (r.info->kind == SettingKind::kChoice ||
                   std::holds_alternative<std::string>(r.value)) {
            field = FormatSetting(*r.info, r.value);
        } else {
            field = std::get<LONG>(r.value);
        }
    }
    PrintJson(j);
}

}  // namespace qn::tools
