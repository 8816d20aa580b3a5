// Inherent operations of the C API: reset, self-test, error and revision
// queries, and the operation functions of the driver session.
#include "IviDriver.h"
#include "Qn731XX.h"
#include "capi/call.h"

using namespace qn;
using namespace qn::capi;

namespace {

// Fixed buffer sizes the C functions assume for their text results.
constexpr ViInt32 kQueryTextSize = 1024;
constexpr ViInt32 kRevisionTextSize = 256;

// The next record of one of the driver's queues by the string rule; a record
// that does not fit stays with the session for the next call.
ViStatus NextRecord(ViSession vi, SessionData::Queue queue, ViInt32 bufferSize, ViChar buffer[],
                    HRESULT (IIviDriverOperation::*next)(BSTR*)) {
    return DeliverText(vi, queue, bufferSize, buffer, [&](std::string* text) {
        return CallOn<IIviDriverOperation>(vi, [&](IIviDriverOperation* op) {
            com::Bstr record;
            HRESULT hr = (op->*next)(record.Out());
            *text = record.utf8();
            return hr;
        });
    });
}

}  // namespace

extern "C" {

ViStatus Qn731XX_reset(ViSession vi) { return CallSimple(vi, &IIviDriverUtility::Reset); }
ViStatus Qn731XX_ResetWithDefaults(ViSession vi) {
    return CallSimple(vi, &IIviDriverUtility::ResetWithDefaults);
}
ViStatus Qn731XX_Disable(ViSession vi) { return CallSimple(vi, &IIviDriverUtility::Disable); }

ViStatus Qn731XX_self_test(ViSession vi, ViInt16* testResult, ViChar testMessage[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (!testResult) return NullResult(vi, "testResult");
        if (!testMessage) return NullResult(vi, "testMessage");
        LONG result = 0;
        TextResult message{kQueryTextSize, testMessage};
        ViStatus status = CallOn<IIviDriverUtility>(
            vi, [&](IIviDriverUtility* u) { return u->SelfTest(&result, &message.text); });
        if (status < 0) return status;
        *testResult = ToInt16(result);
        return First(status, message.CopyOut(vi));
    });
}

ViStatus Qn731XX_error_query(ViSession vi, ViInt32* errorCode, ViChar errorMessage[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (!errorCode) return NullResult(vi, "errorCode");
        if (!errorMessage) return NullResult(vi, "errorMessage");
        LONG code = 0;
        TextResult message{kQueryTextSize, errorMessage};
        ViStatus status = CallOn<IIviDriverUtility>(
            vi, [&](IIviDriverUtility* u) { return u->ErrorQuery(&code, &message.text); });
        if (status < 0) return status;
        *errorCode = code;
        return First(status, message.CopyOut(vi));
    });
}

ViStatus Qn731XX_revision_query(ViSession vi, ViChar driverRev[], ViChar instrRev[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (!driverRev) return NullResult(vi, "driverRev");
        if (!instrRev) return NullResult(vi, "instrRev");
        TextResult driver{kRevisionTextSize, driverRev};
        TextResult instrument{kRevisionTextSize, instrRev};
        ViStatus status = CallOn<IIviDriverIdentity>(vi, [&](IIviDriverIdentity* id) {
            HRESULT hr = id->get_Revision(&driver.text);
            return FAILED(hr) ? hr : id->get_InstrumentFirmwareRevision(&instrument.text);
        });
        if (status < 0) return status;
        status = First(status, driver.CopyOut(vi));
        return First(status, instrument.CopyOut(vi));
    });
}

ViStatus Qn731XX_InvalidateAllAttributes(ViSession vi) {
    return CallSimple(vi, &IIviDriverOperation::InvalidateAllAttributes);
}
ViStatus Qn731XX_ResetInterchangeCheck(ViSession vi) {
    return CallSimple(vi, &IIviDriverOperation::ResetInterchangeCheck);
}
ViStatus Qn731XX_ClearInterchangeWarnings(ViSession vi) {
    return CallSimple(vi, &IIviDriverOperation::ClearInterchangeWarnings);
}

ViStatus Qn731XX_GetNextInterchangeWarning(ViSession vi, ViInt32 bufferSize, ViChar warning[]) {
    return NextRecord(vi, SessionData::Queue::kInterchange, bufferSize, warning,
                      &IIviDriverOperation::GetNextInterchangeWarning);
}

ViStatus Qn731XX_GetNextCoercionRecord(ViSession vi, ViInt32 bufferSize, ViChar record[]) {
    return NextRecord(vi, SessionData::Queue::kCoercion, bufferSize, record,
                      &IIviDriverOperation::GetNextCoercionRecord);
}

}  // extern "C"
