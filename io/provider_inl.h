// Template members of CDriverIOProvider.
#pragma once

#include <type_traits>

#include "io/reply_number.h"
#include "platform/com/errorinfo.h"

namespace qn {

template <class Op>
HRESULT CDriverIOProvider::Run(const CErrorManagerBase& err, LONG timeout, bool poll, Op&& op) {
    timed_out_ = false;
    if (!initialized_) return ReportIOError(err, E_FAIL);
    LONG saved = 0;
    bool restore = false;
    if (timeout >= kTimeoutNone) {
        HRESULT hr = RawGetTimeout(&saved);
        if (SUCCEEDED(hr)) hr = RawSetTimeout(timeout);
        if (FAILED(hr)) return ReportIOError(err, hr);
        restore = true;
    }
    // Whatever error information the operation leaves is its own: the error
    // handler quotes it.
    SetErrorInfo(0, nullptr);
    // The operation ends by one deadline; the error handler's device clear
    // and the status check after it each have their own.
    HRESULT hr = AsOneOperation(op);
    if (FAILED(hr))
        hr = ReportIOError(err, hr);
    else if (poll)
        hr = PollInstrumentErrors(err);  // still under the per-call timeout
    if (restore) RawSetTimeout(saved);
    return hr;
}

template <class T>
HRESULT CDriverIOProvider::QueryNumber(const CErrorManagerBase& err, std::string_view cmd, T* out,
                                       LONG timeout) {
    // The value is stored before the status check runs: a caller sees the
    // reply even when the check then fails.
    return Run(err, timeout, true, [&] {
        std::string reply;
        HRESULT h = WriteWithTerminator(cmd);
        if (SUCCEEDED(h)) h = ReadReply(&reply, 100, true);
        if (FAILED(h)) return h;
        ReplyNumber n = ParseReplyNumber(reply);
        if constexpr (std::is_same_v<T, double>) *out = ReplyToDouble(n);
        else if constexpr (std::is_same_v<T, float>) *out = ReplyToFloat(n);
        else if constexpr (std::is_same_v<T, bool>) *out = ReplyToBool(n);
        else if constexpr (std::is_same_v<T, SHORT>) *out = ReplyToShort(n);
        else *out = static_cast<T>(ReplyToLong(n));
        return S_OK;
    });
}

}  // namespace qn
