// CDriverIOManager: the instrument operations every driver object uses.
// Each operation records a trace entry under the interface name
// "CDriverIOManager", reaches the session's provider and reports failures
// through the calling object's error manager. Operations marked "poll" run
// the instrument-status check after they succeeded.
//
// Timeouts: -1 no timeout, -2 (kTimeoutSession) keeps the session timeout.
#pragma once

#include <string>
#include <string_view>

#include "core/node.h"
#include "io/command_format.h"
#include "io/enum_command.h"
#include "io/provider.h"

namespace qn {

class CDriverIOManager {
public:
    explicit CDriverIOManager(CDriverNode& node);

    // Session controls.
    HRESULT PollInstrumentErrors();
    HRESULT DeviceClear();                      // no error handler, no poll
    HRESULT ReadSTB(SHORT* stb);                // no error handler, no poll
    HRESULT SetIOTimeout(LONG timeout);
    HRESULT GetIOTimeout(LONG* timeout);
    HRESULT IsTimeout(bool* timed_out);
    HRESULT GetVisaInterfaceType(LONG* type);
    HRESULT SetSendEndEnabled(bool on);
    HRESULT GetSendEndEnabled(bool* on);
    HRESULT SetTerminationCharacter(BYTE c);
    HRESULT GetTerminationCharacter(BYTE* c);
    HRESULT SetTerminationCharacterEnabled(bool on);
    HRESULT GetTerminationCharacterEnabled(bool* on);

    // Formatted writes and queries (printf conventions: %.15g, %d, %s).
    template <class... A>
    HRESULT InstrPrintf(std::string_view format, const A&... a) {
        return Write("InstrPrintf", FormatCommandArgs(format, a...), kTimeoutSession, true);
    }
    template <class... A>
    HRESULT InstrPrintfNoPoll(std::string_view format, const A&... a) {
        return Write("InstrPrintfNoPoll", FormatCommandArgs(format, a...), kTimeoutSession, false);
    }
    template <class T, class... A>
    HRESULT InstrQueryf(std::string_view format, T* out, const A&... a) {
        return QueryValue("InstrQueryf", FormatCommandArgs(format, a...), out, kTimeoutSession);
    }
    template <class... A>
    HRESULT InstrQueryfText(std::string_view format, std::string* out, LONG max_chars,
                            const A&... a) {
        return QueryText("InstrQueryf", FormatCommandArgs(format, a...), out, max_chars,
                         kTimeoutSession);
    }

    // Queries: text of at most max_chars characters (one terminator
    // stripped), or a number (bool, SHORT, LONG, float, double).
    HRESULT InstrQuery(std::string_view cmd, std::string* out, LONG max_chars,
                       LONG timeout = kTimeoutSession) {
        return QueryText("InstrQuery", std::string(cmd), out, max_chars, timeout);
    }
    template <class T>
    HRESULT InstrQuery(std::string_view cmd, T* out, LONG timeout = kTimeoutSession) {
        return QueryValue("InstrQuery", std::string(cmd), out, timeout);
    }

    // Reads and writes.
    HRESULT InstrRead(SAFEARRAY** out, LONG count, LONG timeout = kTimeoutSession);
    HRESULT InstrRead(std::string* out, LONG max_chars, LONG timeout, bool remove_trailing);
    HRESULT InstrRead(BYTE* buf, LONG count, LONG* actual, LONG timeout = kTimeoutSession);
    HRESULT InstrWrite(std::string_view cmd, LONG timeout = kTimeoutSession);
    HRESULT InstrWrite(SAFEARRAY* bytes, LONG count, LONG timeout = kTimeoutSession);
    HRESULT InstrWrite(const BYTE* buf, LONG count, LONG* actual, LONG timeout = kTimeoutSession);
    HRESULT InstrWriteNoPoll(std::string_view cmd, LONG timeout = kTimeoutSession);
    HRESULT InstrWriteNoPoll(SAFEARRAY* bytes, LONG count, LONG timeout = kTimeoutSession);
    HRESULT InstrWriteNoPoll(const BYTE* buf, LONG count, LONG* actual,
                             LONG timeout = kTimeoutSession);

    // The command stack: the current command is the one the method frame
    // pushed for the running member.
    HRESULT InstrPrintCommand();
    HRESULT InstrPrintCommandNoPoll();
    HRESULT InstrQueryCommand(std::string* out, LONG max_chars = 1024,
                              LONG timeout = kTimeoutSession);
    template <class T>
    HRESULT InstrQueryCommand(T* out, LONG timeout = kTimeoutSession) {
        return QueryValue("InstrQueryCommand", CurrentCommand(), out, timeout);
    }
    // "1" / "0" (white space trimmed); anything else is an unexpected response.
    HRESULT InstrQueryCommandBool(VARIANT_BOOL* out, LONG timeout = kTimeoutSession);
    // The trimmed reply looked up as a token of `table`; a miss is an
    // unexpected response and leaves *out unchanged.
    HRESULT InstrQueryCommandEnum(const CEnumCommandTable& table, LONG* out,
                                  LONG timeout = kTimeoutSession);

    // Pass-through to the session's IEEE 488.2 formatted I/O.
    HRESULT FormattedWriteString(std::string_view data, bool flush_and_end,
                                 LONG timeout = kTimeoutSession);
    HRESULT FormattedWriteNumber(const VARIANT& data, LONG type, bool flush_and_end,
                                 LONG timeout = kTimeoutSession);
    HRESULT FormattedWriteList(VARIANT* data, LONG type, std::string_view separator,
                               bool flush_and_end, LONG timeout = kTimeoutSession);
    HRESULT FormattedWriteIEEEBlock(std::string_view command, const VARIANT& data,
                                    bool flush_and_end, LONG timeout = kTimeoutSession);
    HRESULT FormattedReadString(std::string* out, LONG timeout = kTimeoutSession);
    HRESULT FormattedReadNumber(LONG type, bool flush_to_end, VARIANT* out,
                                LONG timeout = kTimeoutSession);
    HRESULT FormattedReadList(LONG type, std::string_view separator, VARIANT* out,
                              LONG timeout = kTimeoutSession);
    HRESULT FormattedReadIEEEBlock(LONG type, bool seek_to_block, bool flush_to_end, VARIANT* out,
                                   LONG timeout = kTimeoutSession);
    // A binary block straight into the caller's memory (elements of `type`).
    HRESULT FormattedReadIEEEBlockInto(LONG type, void* buf, LONG max_count, LONG* actual,
                                       bool seek_to_block, bool flush_to_end,
                                       LONG timeout = kTimeoutSession, bool poll = true);
    HRESULT FormattedFlushWrite(bool send_end, LONG timeout = kTimeoutSession);
    HRESULT FormattedFlushRead(LONG timeout = kTimeoutSession);
    HRESULT FormattedSetBufferSize(LONG mask, LONG size);  // no poll, no error handler

    // Pass-through to the session's register interface (none on a scope:
    // E_FAIL through the error handler).
    HRESULT RegisterIn8(SHORT space, LONG offset, BYTE* val);
    HRESULT RegisterIn16(SHORT space, LONG offset, SHORT* val);
    HRESULT RegisterIn32(SHORT space, LONG offset, LONG* val);
    HRESULT RegisterOut8(SHORT space, LONG offset, BYTE val);
    HRESULT RegisterOut16(SHORT space, LONG offset, SHORT val);
    HRESULT RegisterOut32(SHORT space, LONG offset, LONG val);

    // Element-type codes passed on to the formatted operations.
    static LONG AsciiType(LONG type);   // 2,3,4,5,8,12,17 pass, anything else 2
    static LONG BinaryType(LONG type);  // 2,3,4,5,17 pass, anything else 2

private:
    const std::string& CurrentCommand() const;
    CDriverIOProvider& Provider() const;
    HRESULT Write(const char* op, std::string cmd, LONG timeout, bool poll);
    HRESULT QueryText(const char* op, std::string cmd, std::string* out, LONG max_chars,
                      LONG timeout);
    template <class T>
    HRESULT QueryValue(const char* op, std::string cmd, T* out, LONG timeout);
    template <class Op>
    HRESULT Formatted(const char* op, LONG timeout, bool poll, Op&& f);
    template <class Op>
    HRESULT Register(const char* op, Op&& f);

    CDriverNode& node_;
};

// The I/O manager of a driver object.
inline CDriverIOManager Io(CDriverNode& node) { return CDriverIOManager(node); }

}  // namespace qn
