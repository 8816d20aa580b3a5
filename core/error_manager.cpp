#include "core/error_manager.h"

#include <cstdio>

#include "platform/com/bstr.h"
#include "platform/com/errorinfo.h"

namespace qn {

namespace {

constexpr std::string_view kSpaces = " \t\r\n";

std::string_view Trim(std::string_view s) {
    auto b = s.find_first_not_of(kSpaces);
    if (b == std::string_view::npos) return {};
    auto e = s.find_last_not_of(kSpaces);
    return s.substr(b, e - b + 1);
}

}  // namespace

std::string FormatDouble(double v) {
    char buf[64];
    int n = std::snprintf(buf, sizeof buf, "%.15g", v);
    return std::string(buf, n > 0 ? std::size_t(n) : 0);
}

bool FormatMessageText(std::uint32_t id, std::initializer_list<std::string_view> inserts,
                       std::string* out) {
    const ErrorEntry* e = FindErrorEntry(id);
    if (!e) return false;
    std::string text = kMessagePrefix;
    for (const char* p = e->text; *p; ++p) {
        if (p[0] == '%' && p[1] >= '1' && p[1] <= '9') {
            std::size_t i = std::size_t(p[1] - '1');
            if (i < inserts.size()) text += *(inserts.begin() + i);
            ++p;
        } else if (p[0] == '%' && p[1] == '%') {
            text += '%';
            ++p;
        } else {
            text += *p;
        }
    }
    *out = std::string(Trim(text));
    return true;
}

HRESULT CErrorManagerBase::Report(std::uint32_t id, std::string_view extra,
                                  std::initializer_list<std::string_view> inserts) const {
    std::string text;
    if (!FormatMessageText(id, inserts, &text)) {
        char buf[256];
        std::snprintf(buf, sizeof buf,
                      "Internal Error: Unable to retrieve and format error message from message "
                      "table.\nResource ID = %d\nLanguage ID = %d\nReason = '%s'",
                      static_cast<int>(id), 0, "The message number is not in the message table.");
        Publish(DISP_E_EXCEPTION, buf);
        return DISP_E_EXCEPTION;
    }
    if (!extra.empty()) {
        text += "\r\n";
        text += extra;
    }
    const ErrorEntry* e = FindErrorEntry(id);
    return Publish(e ? e->hr : E_FAIL, text);
}

HRESULT CErrorManagerBase::Publish(HRESULT hr, std::string_view description) const {
    // A failure to create the error object leaves no error information but
    // still returns the result of the operation.
    try {
        com::SetThreadError(iid_, kDriverProgId, description);
    } catch (...) {
    }
    return hr;
}

HRESULT CErrorManagerBase::Error(Msg m, std::initializer_list<std::string_view> inserts) const {
    return Report(static_cast<std::uint32_t>(m), {}, inserts);
}

HRESULT CErrorManagerBase::ErrorWithExtra(Msg m, std::string_view extra,
                                          std::initializer_list<std::string_view> inserts) const {
    return Report(static_cast<std::uint32_t>(m), extra, inserts);
}

HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        std::int8_t v) const {
    return InvalidValue(method, param, std::int32_t(v));
}
HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        std::int16_t v) const {
    return InvalidValue(method, param, std::int32_t(v));
}
HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        std::int32_t v) const {
    return InvalidValue(method, param, std::string_view(std::to_string(v)));
}
HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        float v) const {
    return InvalidValue(method, param, double(v));
}
HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        double v) const {
    return InvalidValue(method, param, std::string_view(FormatDouble(v)));
}
HRESULT CErrorManagerBase::InvalidValue(std::string_view method, std::string_view param,
                                        std::string_view v) const {
    return Error(Msg::E_IVI_INVALID_VALUE, {v, method, param});
}
HRESULT CErrorManagerBase::InvalidValueBstr(std::string_view method, std::string_view param,
                                            BSTR v) const {
    return InvalidValue(method, param, std::string_view(com::BstrToUtf8(v)));
}

}  // namespace qn
