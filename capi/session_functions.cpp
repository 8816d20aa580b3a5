// Session functions of the C API: creating the driver object in-process and
// binding it to a session handle, closing, locking, the error record and the
// message texts.
#include <cstring>

#include "IviDriver.h"
#include "Qn731XX.h"
#include "capi/c_session.h"
#include "core/root_factory.h"
#include "platform/com/activation.h"
#include "platform/ivi/ivisession.h"

using namespace qn;
using namespace qn::capi;

extern "C" {

ViStatus Qn731XX_init(ViRsrc resourceName, ViBoolean idQuery, ViBoolean reset, ViSession* vi) {
    return Qn731XX_InitWithOptions(resourceName, idQuery, reset, "", vi);
}

ViStatus Qn731XX_InitWithOptions(ViRsrc resourceName, ViBoolean idQuery, ViBoolean reset,
                                 ViConstString optionString, ViSession* vi) {
    return Guard(0, [&]() -> ViStatus {
        if (!vi) return NullResult(0, "vi");
        *vi = 0;
        if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)) &&
            FAILED(CoInitializeEx(nullptr, COINIT_MULTITHREADED)))
            return Fail(0, kFailure, "The COM layer could not be initialized for this thread.");
        // The driver object is created directly, not through the registry, so
        // the C API works on a machine where the driver was never registered.
        ComPtr<IUnknown> object;
        if (FAILED(CreateQuorlen731XX(nullptr, iid_of<IUnknown>, object.OutVoid())))
            return Fail(0, kFailure, "The driver object could not be created.");
        ComPtr<IIviDriver> driver;
        ViStatus status = Convert(0, object.As(driver));
        if (status < 0) return status;
        com::Bstr resource(resourceName ? resourceName : "");
        com::Bstr options(optionString ? optionString : "");
        const HRESULT hr = driver->Initialize(resource.get(), idQuery ? VARIANT_TRUE : VARIANT_FALSE,
                                              reset ? VARIANT_TRUE : VARIANT_FALSE, options.get());
        ViSession session = 0;
        if (SUCCEEDED(hr)) {
            status = Attach(object.get(), true, &session);
            if (status != VI_SUCCESS) {
                driver->Close();
                return status;
            }
        }
        status = Convert(session, hr);
        *vi = session;
        return status;
    });
}

ViStatus Qn731XX_close(ViSession vi) {
    return Guard(vi, [&]() -> ViStatus {
        ComPtr<IUnknown> object;
        ViStatus status = Detach(vi, &object);
        if (status != VI_SUCCESS) return status;
        ComPtr<IIviDriver> driver;
        ViStatus first = Convert(vi, object.As(driver));
        if (driver) first = First(first, Convert(vi, driver->Close()));
        driver.reset();
        object.reset();
        const ViStatus disposed = IviSession_Dispose(vi);
        CoUninitialize();
        return First(first, disposed);
    });
}

ViStatus Qn731XX_AttachToExistingCOMSession(void* existingIUnknown, ViSession* vi) {
    return Guard(0, [&]() -> ViStatus {
        if (!vi) return NullResult(0, "vi");
        *vi = 0;
        if (!existingIUnknown) return NullResult(0, "existingIUnknown");
        return Attach(static_cast<IUnknown*>(existingIUnknown), false, vi);
    });
}

ViStatus Qn731XX_GetNativeIUnknownPtr(ViSession vi, void** nativeIUnknown) {
    return Guard(vi, [&]() -> ViStatus {
        if (!nativeIUnknown) return NullResult(vi, "nativeIUnknown");
        *nativeIUnknown = nullptr;
        SessionRef session;
        ViStatus status = SessionOf(vi, &session);
        if (status != VI_SUCCESS) return status;
        session->Expose();
        IUnknown* driver = session->Driver();
        driver->AddRef();
        *nativeIUnknown = driver;
        return VI_SUCCESS;
    });
}

ViStatus Qn731XX_LockSession(ViSession vi, ViBoolean* callerHasLock) {
    return IviSession_Lock(vi, callerHasLock);
}

ViStatus Qn731XX_UnlockSession(ViSession vi, ViBoolean* callerHasLock) {
    return IviSession_Unlock(vi, callerHasLock);
}

ViStatus Qn731XX_GetError(ViSession vi, ViStatus* errorCode, ViInt32 bufferSize,
                          ViChar description[]) {
    return IviSession_GetError(vi, errorCode, bufferSize, description);
}

ViStatus Qn731XX_ClearError(ViSession vi) { return IviSession_ClearError(vi); }

ViStatus Qn731XX_error_message(ViSession, ViStatus errorCode, ViChar errorMessage[256]) {
    std::string_view text = StatusText(errorCode);
    if (text.empty() || !errorMessage) return VI_SUCCESS;
    const std::size_t n = text.size() < 255 ? text.size() : 255;
    std::memcpy(errorMessage, text.data(), n);
    errorMessage[n] = '\0';
    return VI_SUCCESS;
}

}  // extern "C"
