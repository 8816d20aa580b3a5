// CErrorManagerBase: turns a message number and its inserts into the message
// text, maps it to the HRESULT the operation returns, and publishes the text
// as the calling thread's error information. Every COM object of the driver
// owns one; the method frame sets the IID of the interface being called.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>

#include "core/error_table.h"
#include "platform/com/types.h"

namespace qn {

// Formats a message: the table text of `id` with %1..%3 replaced by the
// inserts in order ("%%" is a literal percent), prefixed with
// "Quorlen731XX: " and trimmed. False when the table has no such message.
bool FormatMessageText(std::uint32_t id, std::initializer_list<std::string_view> inserts,
                       std::string* out);

// "%.15g", as the driver shows doubles in messages and commands.
std::string FormatDouble(double v);

class CErrorManagerBase {
public:
    // IID placed into the error information; the frame sets it per call.
    const GUID& ErrorIid() const { return iid_; }
    GUID SetErrorIid(const GUID& iid) {
        GUID old = iid_;
        iid_ = iid;
        return old;
    }

    // Reports message `m` with string inserts and returns its HRESULT.
    HRESULT Error(Msg m, std::initializer_list<std::string_view> inserts = {}) const;
    // As Error, with "\r\n" and `extra` appended to the text.
    HRESULT ErrorWithExtra(Msg m, std::string_view extra,
                           std::initializer_list<std::string_view> inserts = {}) const;

    // E_IVI_INVALID_VALUE, inserts (value text, method, parameter).
    HRESULT InvalidValue(std::string_view method, std::string_view param, std::int8_t v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param, std::int16_t v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param, std::int32_t v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param, float v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param, double v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param,
                         std::string_view v) const;
    HRESULT InvalidValue(std::string_view method, std::string_view param, const char* v) const {
        return InvalidValue(method, param, std::string_view(v ? v : ""));
    }
    HRESULT InvalidValueBstr(std::string_view method, std::string_view param, BSTR v) const;

    // E_IVI_NULL_POINTER, inserts (method, parameter).
    HRESULT NullPointer(std::string_view method, std::string_view param) const {
        return Error(Msg::E_IVI_NULL_POINTER, {method, param});
    }

    // Publishes a ready description with the given result (for texts that do
    // not come from the table, such as a transport's own message).
    HRESULT Publish(HRESULT hr, std::string_view description) const;

private:
    HRESULT Report(std::uint32_t id, std::string_view extra,
                   std::initializer_list<std::string_view> inserts) const;

    GUID iid_ = GUID_NULL;
};

}  // namespace qn
