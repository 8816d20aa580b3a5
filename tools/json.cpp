#include "tools/json.h"

#include <cmath>
#include <cstdio>

namespace qn::tools {

void JsonWriter::Separator() {
    if (after_key_) {
        after_key_ = false;
        return;
    }
    if (!first_.empty()) {
        if (!first_.back()) out_ += ',';
        first_.back() = false;
    }
}

void JsonWriter::Open(char c) {
    Separator();
    out_ += c;
    first_.push_back(true);
}

void JsonWriter::Close(char c) {
    out_ += c;
    if (!first_.empty()) first_.pop_back();
}

void JsonWriter::Key(std::string_view k) {
    String(k);
    out_ += ':';
    after_key_ = true;
}

void JsonWriter::String(std::string_view s) {
    Separator();
    out_ += '"';
    for (char ch : s) {
        auto c = static_cast<unsigned char>(ch);
        switch (c) {
            case '"': out_ += "\\\""; break;
            case '\\': out_ += "\\\\"; break;
            case '\n': out_ += "\\n"; break;
            case '\r': out_ += "\\r"; break;
            case '\t': out_ += "\\t"; break;
            default:
                if (c < 0x20) {
                    char buf[8];
                    std::snprintf(buf, sizeof buf, "\\u%04x", c);
                    out_ += buf;
                } else {
                    out_ += ch;
                }
        }
    }
    out_ += '"';
}

void JsonWriter::Number(double v) {
    Separator();
    if (!std::isfinite(v)) {
        out_ += "null";
        return;
    }
    char buf[32];
    std::snprintf(buf, sizeof buf, "%.17g", v);
    out_ += buf;
}

void JsonWriter::Integer(long long v) {
    Separator();
    out_ += std::to_string(v);
}

void JsonWriter::Bool(bool b) {
    Separator();
    out_ += b ? "true" : "false";
}

void JsonWriter::StringMap(const std::map<std::string, std::string>& m) {
    BeginObject();
    for (const auto& [k, v] : m) Field(k, v);
    EndObject();
}

void JsonWriter::StringList(const std::vector<std::string>& v) {
    BeginArray();
    for (const std::string& s : v) String(s);
    EndArray();
}

}  // namespace qn::tools
