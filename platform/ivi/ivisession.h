/* The IVI-C shared session library: session handles with a data pointer, a
 * re-entrant per-handle lock and one recorded error (status and text) per
 * handle. Handle 0 exists only for its error record, so that an error can be
 * recorded before any session is created. All functions are thread-safe. */
#ifndef QN_IVISESSION_H
#define QN_IVISESSION_H

#include "visatype.h"

/* Statuses of the library itself. */
#define IVISESSION_ERROR_INVALID_SESSION ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFF000EL))
#define IVISESSION_ERROR_TIMEOUT ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFF0015L))
#define IVISESSION_ERROR_NOT_LOCKED ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFF009CL))
#define IVISESSION_ERROR_INVALID_VALUE ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFA0010L))
#define IVISESSION_ERROR_OUT_OF_MEMORY ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFA0056L))
#define IVISESSION_ERROR_NULL_POINTER ((ViStatus)(VI_STATUS_ERROR_BASE + 0x3FFA0058L))

#ifdef __cplusplus
extern "C" {
#endif

/* Creates a session; *newVi receives its handle (never 0, never reused while
 * the process runs unless 2^31 sessions were created). */
ViStatus IviSession_New(ViSession* newVi);
/* Ends a session: its handle becomes invalid at once. Threads waiting for its
 * lock return IVISESSION_ERROR_INVALID_SESSION. */
ViStatus IviSession_Dispose(ViSession vi);

/* Replaces the data pointer; returns once no IviSession_GetDataPtr call can
 * still be holding the previous one. */
ViStatus IviSession_SetDataPtr(ViSession vi, void* dataPtr);
/* *dataPtr is set to null on failure. */
ViStatus IviSession_GetDataPtr(ViSession vi, void** dataPtr);

/* Re-entrant per-handle lock, waiting as long as it takes. callerHasLock may
 * be null; when given, Lock does nothing if *callerHasLock is VI_TRUE and
 * otherwise sets it to VI_TRUE; Unlock does nothing if it is VI_FALSE and
 * otherwise sets it to VI_FALSE. Unlocking a session that the calling thread
 * does not hold fails with IVISESSION_ERROR_NOT_LOCKED. */
ViStatus IviSession_Lock(ViSession vi, ViBoolean* callerHasLock);
ViStatus IviSession_Unlock(ViSession vi, ViBoolean* callerHasLock);

/* Records a status and text for vi (or for 0), replacing what was there. A
 * null text records "". */
ViStatus IviSession_SetError(ViSession vi, ViStatus errorCode, ViConstString errorDescription);
/* Reads the recorded status and text. errorCode may be null. The text is
 * copied by the usual buffer rule: with bufferSize 0 (or a null buffer)
 * nothing is copied and the needed size (length + 1) is returned; a buffer too
 * small receives a truncated, terminated text and the needed size is
 * returned; otherwise the whole text is copied, the record is cleared and
 * VI_SUCCESS is returned. A negative bufferSize is IVISESSION_ERROR_INVALID_VALUE. */
ViStatus IviSession_GetError(ViSession vi, ViStatus* errorCode, ViInt32 bufferSize,
                             ViChar description[]);
ViStatus IviSession_ClearError(ViSession vi);

#ifdef __cplusplus
}

#include <chrono>

namespace qn::ivi {
/* IviSession_Lock that gives up after `timeout` with IVISESSION_ERROR_TIMEOUT
 * (a zero timeout only tries). */
ViStatus LockSessionFor(ViSession vi, std::chrono::milliseconds timeout, ViBoolean* callerHasLock);

/* Reads the data pointer without taking any lock and counts the caller as
 * its reader until EndDataRead(*reader): a concurrent ExchangeDataPtr,
 * SetDataPtr or Dispose returns only after that, so the pointer stays valid
 * for the reader without a reference of its own. A null data pointer (a
 * session being closed) is IVISESSION_ERROR_INVALID_SESSION; on failure
 * *dataPtr and *reader are null and nothing needs ending. */
ViStatus BeginDataRead(ViSession vi, void** dataPtr, void** reader);
void EndDataRead(void* reader);
/* Replaces the data pointer and gives the previous one in *previous, once no
 * reader can still be holding it; the caller may then release it. */
ViStatus ExchangeDataPtr(ViSession vi, void* dataPtr, void** previous);
}  // namespace qn::ivi
#endif

#endif /* QN_IVISESSION_H */
