// Session handles come from the IVI-C session library; the C layer keeps one
// counted reference to the driver object in each handle's data pointer. A
// call finds it without any lock and is counted as a reader of the pointer
// while it runs; a close taking the pointer out waits for the readers before
// it closes the object, so a call racing a close either completes or sees an
// invalid session, never a released or half-closed object.
#include "capi/c_session.h"

#include <cstdio>
#include <cstring>
#include <string>

#include "core/c_session_link.h"
#include "platform/com/errorinfo.h"
#include "platform/ivi/ivisession.h"

namespace qn::capi {

ViStatus Fail(ViSession vi, ViStatus status, std::string_view text) {
    IviSession_SetError(vi, status, std::string(text).c_str());
    return status;
}

ViStatus NullResult(ViSession vi, std::string_view parameter) {
    return Fail(vi, kFailure, "Null pointer passed for parameter " + std::string(parameter) + ".");
}

ViStatus Convert(ViSession vi, HRESULT hr) {
    // Plain success carries nothing to record: every member clears the
    // thread's error information when it is entered.
    if (hr == S_OK) return VI_SUCCESS;
    const ViStatus status = ToCStatus(hr);
    com::ErrorRecord record;
    if (com::TakeThreadError(&record)) {
        IviSession_SetError(vi, status, record.description.c_str());
    } else if (status < 0) {
        std::string_view text = StatusText(status);
        if (text.empty()) {
            char buf[64];
            std::snprintf(buf, sizeof buf, "Unexpected failure (result code 0x%08X).",
                          static_cast<unsigned>(hr));
            IviSession_SetError(vi, status, buf);
        } else {
            IviSession_SetError(vi, status, std::string(text).c_str());
        }
    }
    return status;
}

ViStatus SessionOf(ViSession vi, SessionRef* out) {
    void* data = nullptr;
    void* reader = nullptr;
    const ViStatus status = ivi::BeginDataRead(vi, &data, &reader);
    if (status != VI_SUCCESS) return status;
    out->Read(static_cast<SessionData*>(data), reader);
    return VI_SUCCESS;
}

ViStatus DriverOf(ViSession vi, ComPtr<IUnknown>* out) {
    SessionRef session;
    ViStatus status = SessionOf(vi, &session);
    if (status != VI_SUCCESS) return status;
    *out = ComPtr<IUnknown>(session->Driver());
    return VI_SUCCESS;
}

ViStatus Attach(IUnknown* driver, bool private_object, ViSession* vi) {
    *vi = 0;
    auto* data = new SessionData(driver, private_object);
    ViSession created = 0;
    ViStatus status = IviSession_New(&created);
    if (status != VI_SUCCESS) {
        data->Release();
        return status;
    }
    status = IviSession_SetDataPtr(created, data);
    if (status != VI_SUCCESS) {
        data->Release();
        IviSession_Dispose(created);
        return status;
    }
    LinkCSession(driver, static_cast<LONG>(created));
    *vi = created;
    return VI_SUCCESS;
}

ViStatus Detach(ViSession vi, ComPtr<IUnknown>* driver) {
    void* p = nullptr;
    ViStatus status = ivi::ExchangeDataPtr(vi, nullptr, &p);
    if (status != VI_SUCCESS) return status;
    if (!p) return IVISESSION_ERROR_INVALID_SESSION;  // closed by another thread
    auto* data = static_cast<SessionData*>(p);
    // No call can find the session now, and those that found it are done.
    UnlinkCSession(data->Driver(), static_cast<LONG>(vi));
    *driver = ComPtr<IUnknown>(data->Driver());
    data->Release();
    return VI_SUCCESS;
}

ViStatus CopyString(ViSession vi, std::string_view text, ViInt32 size, ViChar* buffer) {
    if (size < 0)
        return Fail(vi, static_cast<ViStatus>(0xBFFA0010u),
                    "Invalid value (" + std::to_string(size) + ") for parameter bufferSize.");
    const std::size_t n = text.size();
    // The size needed, capped so that it stays a positive status.
    const ViStatus needed = n >= 0x7FFFFFFFu ? 0x7FFFFFFF : static_cast<ViStatus>(n + 1);
    if (!buffer || size == 0) return needed;
    const auto capacity = static_cast<std::size_t>(size);
    if (n + 1 > capacity) {
        std::memcpy(buffer, text.data(), capacity - 1);
        buffer[capacity - 1] = '\0';
        return needed;
    }
    std::memcpy(buffer, text.data(), n);
    buffer[n] = '\0';
    return VI_SUCCESS;
}

}  // namespace qn::capi
