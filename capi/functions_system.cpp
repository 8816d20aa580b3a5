// System and display functions of the C API: operation complete, setup
// memory, the saved state and the screen bitmap as byte arrays, local
// controls, direct writes and reads through the session's formatted I/O,
// and erasing the display.
#include <algorithm>
#include <cstring>
#include <string>

#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/call.h"
#include "platform/com/safearray.h"

using namespace qn;
using namespace qn::capi;

namespace {

// A byte result of `member` copied into the caller's array of `size` bytes;
// *actual is the number of bytes copied.
ViStatus Bytes(ViSession vi, HRESULT (IQuorlen731XXSystem::*member)(SAFEARRAY**), ViInt32 size,
               ViByte data[], ViInt32* actual) {
    return Guard(vi, [&]() -> ViStatus {
        if (size < 0)
            return Fail(vi, static_cast<ViStatus>(0xBFFA0010u),
                        "Invalid value (" + std::to_string(size) + ") for the array size.");
        if (size > 0 && !data) return NullResult(vi, "data");
        if (!actual) return NullResult(vi, "actualSize");
        com::SafeArray bytes;
        ViStatus status = CallOn<IQuorlen731XXSystem>(
            vi, [&](IQuorlen731XXSystem* s) { return (s->*member)(bytes.Out()); });
        if (status < 0) return status;
        const ULONG count = bytes ? bytes.size() : 0;
        const auto n = std::min<ULONG>(count, static_cast<ULONG>(size));
        if (n > 0) std::memcpy(data, bytes.data<unsigned char>(), n);
        *actual = static_cast<ViInt32>(n);
        return status;
    });
}

}  // namespace

extern "C" {

ViStatus Qn731XX_SystemWaitForOperationComplete(ViSession vi, ViInt32 maxTimeMilliseconds) {
    return CallMethod(vi, &IQuorlen731XXSystem::WaitForOperationComplete, maxTimeMilliseconds);
}
ViStatus Qn731XX_SystemSaveState(ViSession vi, ViConstString identifier) {
    return CallMethod(vi, &IQuorlen731XXSystem::SaveState, identifier);
}
ViStatus Qn731XX_SystemRecallState(ViSession vi, ViConstString identifier) {
    return CallMethod(vi, &IQuorlen731XXSystem::RecallState, identifier);
}
ViStatus Qn731XX_SystemEnableLocalControls(ViSession vi) {
    return CallSimple(vi, &IQuorlen731XXSystem::EnableLocalControls);
}
ViStatus Qn731XX_SystemDisableLocalControls(ViSession vi) {
    return CallSimple(vi, &IQuorlen731XXSystem::DisableLocalControls);
}
ViStatus Qn731XX_DisplayErase(ViSession vi) { return CallSimple(vi, &IQuorlen731XXDisplay::Erase); }

ViStatus Qn731XX_SystemPutState(ViSession vi, ViInt32 size, ViByte data[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (size < 0)
            return Fail(vi, static_cast<ViStatus>(0xBFFA0010u),
                        "Invalid value (" + std::to_string(size) + ") for the array size.");
        if (size > 0 && !data) return NullResult(vi, "data");
        com::SafeArray bytes = com::SafeArray::Vector(VT_UI1, static_cast<ULONG>(size));
        if (!bytes) throw std::bad_alloc();
        if (size > 0) std::memcpy(bytes.data<unsigned char>(), data, static_cast<std::size_t>(size));
        return CallOn<IQuorlen731XXSystem>(
            vi, [&](IQuorlen731XXSystem* s) { return s->PutState(bytes.get()); });
    });
}

ViStatus Qn731XX_SystemGetState(ViSession vi, ViInt32 size, ViByte data[], ViInt32* actualSize) {
    return Bytes(vi, &IQuorlen731XXSystem::GetState, size, data, actualSize);
}

ViStatus Qn731XX_SystemGetScreenBitmap(ViSession vi, ViInt32 size, ViByte data[],
                                       ViInt32* actualSize) {
    return Bytes(vi, &IQuorlen731XXSystem::GetScreenBitmap, size, data, actualSize);
}

ViStatus Qn731XX_SystemWrite(ViSession vi, ViConstString command) {
    return Guard(vi, [&] {
        com::Bstr text(command);
        return CallOn<IQuorlen731XXSystem>(vi, [&](IQuorlen731XXSystem* s) {
            ComPtr<IFormattedIO488> io;
            HRESULT hr = s->get_IO(io.Out());
            if (FAILED(hr)) return hr;
            return io->WriteString(text.get(), VARIANT_TRUE);
        });
    });
}

ViStatus Qn731XX_SystemRead(ViSession vi, ViInt32 bufferSize, ViChar buffer[]) {
    // A reply longer than the buffer is kept whole for the next call.
    return DeliverText(vi, SessionData::Queue::kSystemRead, bufferSize, buffer,
                       [&](std::string* text) {
                           return CallOn<IQuorlen731XXSystem>(vi, [&](IQuorlen731XXSystem* s) {
                               ComPtr<IFormattedIO488> io;
                               HRESULT hr = s->get_IO(io.Out());
                               if (FAILED(hr)) return hr;
                               com::Bstr reply;
                               hr = io->ReadString(reply.Out());
                               *text = reply.utf8();
                               return hr;
                           });
                       });
}

}  // extern "C"
