// CDriverIOProvider: the transport-independent part of a session's I/O. It
// applies per-call timeouts, appends and strips the message terminator,
// converts replies, reports transport failures (ReportIOError) and runs the
// instrument-status check after each operation (PollInstrumentErrors).
// A concrete provider (CVisaComIOProvider) supplies the raw operations.
//
// Every operation reports its failures through the error manager of the
// object whose member is running, so that the error information names that
// object's interface.
#pragma once

#include <string>
#include <string_view>

#include "core/error_manager.h"
#include "core/session.h"
#include "io/receive_buffer.h"
#include "platform/com/com.h"
#include "platform/visa/visa.h"

namespace qn {

// Timeout arguments: -1 no timeout, -2 (or below) leaves the session timeout.
inline constexpr LONG kTimeoutNone = -1;
inline constexpr LONG kTimeoutSession = -2;
// VISA-COM's timeout result, and the provider's own code it becomes.
inline constexpr HRESULT kVisaTimeout = HRESULT_FROM_BITS(0x80040015);
inline constexpr HRESULT kProviderTimeout = HRESULT_FROM_BITS(0x80040604);

class CDriverIOProvider {
public:
    virtual ~CDriverIOProvider() = default;

    bool IsOpen() const { return initialized_; }
    // The session flags whose QueryInstrumentStatus decides the status check.
    void SetOwnerFlags(const SessionFlags* flags) { flags_ = flags; }
    bool IsTimeout() const { return timed_out_; }
    const std::string& ReadTermination() const { return read_term_; }
    const std::string& WriteTermination() const { return write_term_; }
    void SetReadTermination(std::string t) { read_term_ = std::move(t); }
    void SetWriteTermination(std::string t) { write_term_ = std::move(t); }

    // Session controls.
    HRESULT PollInstrumentErrors(const CErrorManagerBase& err);
    HRESULT DeviceClear();
    HRESULT ReadSTB(SHORT* stb);
    HRESULT SetIOTimeout(const CErrorManagerBase& err, LONG timeout);
    HRESULT GetIOTimeout(const CErrorManagerBase& err, LONG* timeout);
    HRESULT GetVisaInterfaceType(const CErrorManagerBase& err, LONG* type);
    HRESULT SetSendEndEnabled(const CErrorManagerBase& err, bool on);
    HRESULT GetSendEndEnabled(const CErrorManagerBase& err, bool* on);
    HRESULT SetTerminationCharacter(const CErrorManagerBase& err, BYTE c);
    HRESULT GetTerminationCharacter(const CErrorManagerBase& err, BYTE* c);
    HRESULT SetTerminationCharacterEnabled(const CErrorManagerBase& err, bool on);
    HRESULT GetTerminationCharacterEnabled(const CErrorManagerBase& err, bool* on);

    // String and byte I/O. `poll` runs the status check after success.
    HRESULT Write(const CErrorManagerBase& err, std::string_view cmd, LONG timeout, bool poll);
    // Writes cmd and reads its reply as ReadText does (terminator stripped).
    HRESULT Query(const CErrorManagerBase& err, std::string_view cmd, std::string* reply,
                  LONG max_chars, LONG timeout, bool poll = true);
    // Numeric query: at most 100 characters read, parsed as a decimal number.
    template <class T>
    HRESULT QueryNumber(const CErrorManagerBase& err, std::string_view cmd, T* out, LONG timeout);
    // Text of at most max_chars characters (0 or less: none). The rest of a
    // longer reply is read and dropped, so the next read starts with the
    // next message; max_chars 0 drops the whole reply.
    HRESULT ReadText(const CErrorManagerBase& err, std::string* out, LONG max_chars, LONG timeout,
                     bool strip, bool poll = true);
    HRESULT ReadBytes(const CErrorManagerBase& err, SAFEARRAY** out, LONG count, LONG timeout,
                      bool poll);
    HRESULT ReadBuffer(const CErrorManagerBase& err, BYTE* buf, LONG count, LONG* actual,
                       LONG timeout, bool poll);
    HRESULT WriteBytes(const CErrorManagerBase& err, SAFEARRAY* psa, LONG count, LONG timeout,
                       bool poll);
    HRESULT WriteBuffer(const CErrorManagerBase& err, const BYTE* buf, LONG count, LONG* actual,
                        LONG timeout, bool poll);

    // Runs `op` (a raw operation returning an HRESULT) the way every
    // operation runs: timed-out flag cleared, per-call timeout applied and
    // restored, failures through ReportIOError, then the status check.
    template <class Op>
    HRESULT Run(const CErrorManagerBase& err, LONG timeout, bool poll, Op&& op);

    // Failure of an I/O operation: device clear, the I/O-error or timeout
    // report quoting the transport's description, and (with status checking
    // on) one status check whose outcome is discarded.
    HRESULT ReportIOError(const CErrorManagerBase& err, HRESULT hr);

    // Opens the session on `resource` (releasing an earlier one first);
    // failures are reported through err.
    virtual HRESULT Open(const CErrorManagerBase& err, const SessionFlags* flags,
                         const std::string& resource) = 0;
    // Releases the session; closing a closed provider does nothing.
    virtual void Close() = 0;

    // The session's memory for binary blocks, kept between reads and
    // released by Close.
    ReceiveBuffer& Receive() { return receive_; }

    // Raw VISA-COM objects of the session (null when closed or when the
    // provider has none); no reference added.
    virtual IMessage* MessageInterface() const = 0;
    virtual IFormattedIO488* FormattedInterface() const = 0;
    virtual IFormattedIO488Direct* FormattedDirect() const = 0;
    virtual IRegister* RegisterInterface() const = 0;

    // The same objects for code that talks to VISA-COM directly (the
    // driver's IO property): each with a reference added for the caller.
    // E_POINTER for a null argument; an absent object gives null with
    // S_OK (S_FALSE for the formatted I/O object). The session is the
    // message interface's IVisaSession.
    HRESULT ioprvGetIVisaSessionPointer(IVisaSession** p) const;
    HRESULT ioprvGetIMessagePointer(IMessage** p) const;
    HRESULT ioprvGetIRegisterPointer(IRegister** p) const;
    HRESULT ioprvGetIFormattedIO488Pointer(IFormattedIO488** p) const;

protected:
    // Raw operations of the transport; results already translated
    // (VISA-COM's timeout becomes kProviderTimeout).
    virtual HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) = 0;
    virtual HRESULT RawRead(BYTE* buf, LONG count, LONG* actual) = 0;
    virtual HRESULT RawReadArray(LONG count, SAFEARRAY** out) = 0;
    virtual HRESULT RawClear() = 0;
    virtual HRESULT RawReadSTB(SHORT* stb) = 0;
    virtual HRESULT RawGetTimeout(LONG* ms) = 0;
    virtual HRESULT RawSetTimeout(LONG ms) = 0;
    virtual HRESULT RawInterface(SHORT* type, std::string* resource_class) = 0;
    virtual HRESULT RawGetBool(int which, bool* v) = 0;  // 0 send END, 1 term char enabled
    virtual HRESULT RawSetBool(int which, bool v) = 0;
    virtual HRESULT RawGetTermChar(BYTE* c) = 0;
    virtual HRESULT RawSetTermChar(BYTE c) = 0;
    // Opens one operation of the session: the raw reads and writes until
    // RawEndOperation share one deadline, the session timeout from now.
    // False when the session cannot (nothing to end then).
    virtual bool RawBeginOperation() { return false; }
    virtual void RawEndOperation() {}

    bool initialized_ = false;
    bool timed_out_ = false;
    ReceiveBuffer receive_{std::size_t(visa::kDefaultMaxBlockBytes)};

private:
    // Runs op as one operation of the session (one deadline for all of it).
    template <class Op>
    HRESULT AsOneOperation(Op&& op) {
        const bool open = RawBeginOperation();
        HRESULT hr = op();
        if (open) RawEndOperation();
        return hr;
    }
    HRESULT StatusCheck();  // sub-steps 2 to 5 of the check: S_OK or a failure
    HRESULT WriteWithTerminator(std::string_view cmd);
    HRESULT ReadRaw(std::string* out, std::size_t max_chars);
    // The reply of a query, at most max_chars of it; a longer reply's rest
    // is read and dropped so that it cannot pass for the next reply.
    HRESULT ReadReply(std::string* out, LONG max_chars, bool strip);

    const SessionFlags* flags_ = nullptr;
    std::string read_term_ = "\n";
    std::string write_term_ = "\n";
};

}  // namespace qn

#include "io/provider_inl.h"
