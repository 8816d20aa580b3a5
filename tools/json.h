// A minimal JSON writer for the --json output of qn731xx (strings escaped,
// numbers printed with full precision).
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace qn::tools {

class JsonWriter {
public:
    void BeginObject() { Open('{'); }
    void EndObject() { Close('}'); }
    void BeginArray() { Open('['); }
    void EndArray() { Close(']'); }
    void Key(std::string_view k);
    void String(std::string_view s);
    void Number(double v);
    void Integer(long long v);
    void Bool(bool b);
    template <class T>
    void Field(std::string_view k, const T& v) {
        Key(k);
        Value(v);
    }
    void StringMap(const std::map<std::string, std::string>& m);
    void StringList(const std::vector<std::string>& v);
    const std::string& str() const { return out_; }

private:
    void Value(std::string_view s) { String(s); }
    void Value(const std::string& s) { String(s); }
    void Value(const char* s) { String(s); }
    void Value(bool b) { Bool(b); }
    void Value(double d) { Number(d); }
    void Value(int v) { Integer(v); }
    void Value(long v) { Integer(v); }
    void Open(char c);
    void Close(char c);
    void Separator();

    std::string out_;
    std::vector<bool> first_;  // per open container: no element written yet
    bool after_key_ = false;
};

}  // namespace qn::tools
