// CDriverIOManager: the instrument operations every driver object uses.
// Each operation records a trace entry under the interface name
// "CDriverIOManager", reaches the session's provider and reports failures
// through the calling object's error manager. Operations marked "poll" run
// the instrument-status check after they succeeded.
//
// Timeouts: -1 no timeout, -2 (kTimeoutSession) keeps the session timeout.
#pragma once

#include <cstring>
#include <limits>
#include <string>
#include <string_view>
#include <type_traits>

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
    // stripped; the rest of a longer reply is dropped, and max_chars 0 gives
    // "" and drops the whole reply), or a number (bool, SHORT, LONG, float,
    // double).
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
    // A binary block into the session's receive buffer (kept between
    // reads); *view receives the elements, valid until the next block read
    // or Close.
    HRESULT FormattedReadIEEEBlockToSession(LONG type, const void** view, LONG* actual,
                                            bool seek_to_block, bool flush_to_end,
                                            LONG timeout = kTimeoutSession, bool poll = true);
    HRESULT FormattedFlushWrite(bool send_end, LONG timeout = kTimeoutSession);
    // Typed and counted-array forms of the formatted operations (element
    // types SHORT, LONG, float, double; BYTE for blocks).
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedWriteNumber(T val, bool flush_and_end, LONG timeout = kTimeoutSession) {
        com::Variant v = ValueVariant(val);
        return FormattedWriteNumber(v, TypeCode<T>(), flush_and_end, timeout);
    }
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedReadNumber(T* val, bool flush_to_end, LONG timeout = kTimeoutSession) {
        if (!val) return E_POINTER;
        com::Variant v;
        HRESULT hr =
            FormattedReadNumber(TypeCode<T>(), flush_to_end, static_cast<VARIANT*>(&v), timeout);
        if (SUCCEEDED(hr)) *val = FromVariant<T>(v);
        return hr;
    }
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedWriteList(const T* values, LONG length, std::string_view separator,
                               bool flush_and_end, LONG timeout = kTimeoutSession) {
        com::Variant v;
        HRESULT hr = ArrayVariant(values, length, &v);
        if (FAILED(hr)) return hr;
        return FormattedWriteList(static_cast<VARIANT*>(&v), TypeCode<T>(), separator,
                                  flush_and_end, timeout);
    }
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedWriteIEEEBlock(std::string_view command, const T* values, LONG length,
                                    bool flush_and_end, LONG timeout = kTimeoutSession) {
        com::Variant v;
        HRESULT hr = ArrayVariant(values, length, &v);
        if (FAILED(hr)) return hr;
        return FormattedWriteIEEEBlock(command, v, flush_and_end, timeout);
    }
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedReadList(T* values, LONG max_length, LONG* actual,
                              std::string_view separator = ",", LONG timeout = kTimeoutSession) {
        if (!values || !actual) return E_POINTER;
        *actual = 0;
        if (max_length < 0) return E_INVALIDARG;
        com::Variant v;
        HRESULT hr = FormattedReadList(TypeCode<T>(), separator, static_cast<VARIANT*>(&v), timeout);
        if (FAILED(hr)) return hr;
        return CopyOut(v, values, max_length, actual);
    }
    template <class T>
        requires std::is_arithmetic_v<T>
    HRESULT FormattedReadIEEEBlock(T* values, LONG max_length, LONG* actual, bool seek_to_block,
                                   bool flush_to_end, LONG timeout = kTimeoutSession) {
        return FormattedReadIEEEBlockInto(TypeCode<T>(), values, max_length, actual,
                                          seek_to_block, flush_to_end, timeout);
    }

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
    // Block moves of `length` elements; *buf is a new array (MoveIn) or the
    // caller's array of 8-, 16- or 32-bit elements (MoveOut).
    HRESULT RegisterMoveIn8(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);
    HRESULT RegisterMoveIn16(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);
    HRESULT RegisterMoveIn32(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);
    HRESULT RegisterMoveOut8(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);
    HRESULT RegisterMoveOut16(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);
    HRESULT RegisterMoveOut32(SHORT space, LONG offset, LONG length, SAFEARRAY** buf);

    // Element-type codes passed on to the formatted operations.
    static LONG AsciiType(LONG type);   // 2,3,4,5,8,12,17 pass, anything else 2
    static LONG BinaryType(LONG type);  // 2,3,4,5,17 pass, anything else 2

private:
    template <class T>
    static constexpr LONG TypeCode() {
        if constexpr (std::is_same_v<T, SHORT>) return visa::ASCIIType_I2;
        else if constexpr (std::is_same_v<T, LONG>) return visa::ASCIIType_I4;
        else if constexpr (std::is_same_v<T, float>) return visa::ASCIIType_R4;
        else if constexpr (std::is_same_v<T, double>) return visa::ASCIIType_R8;
        else {
            static_assert(std::is_same_v<T, BYTE>, "SHORT, LONG, float, double or BYTE");
            return visa::ASCIIType_UI1;
        }
    }
    template <class T>
    static constexpr VARTYPE VarType() {
        constexpr LONG c = TypeCode<T>();
        return c == visa::ASCIIType_I2 ? VARTYPE(VT_I2)
             : c == visa::ASCIIType_I4 ? VARTYPE(VT_I4)
             : c == visa::ASCIIType_R4 ? VARTYPE(VT_R4)
             : c == visa::ASCIIType_R8 ? VARTYPE(VT_R8) : VARTYPE(VT_UI1);
    }
    template <class T>
    static com::Variant ValueVariant(T val) {
        com::Variant v;
        v.vt = VarType<T>();
        std::memcpy(&v.llVal, &val, sizeof(T));
        return v;
    }
    // A value of any numeric VARIANT as T; floating values going into an
    // integer type saturate at its range (NaN gives 0).
    template <class T>
    static T FromVariant(const VARIANT& v) {
        switch (v.vt) {
            case VT_I2: return static_cast<T>(v.iVal);
            case VT_I4: return static_cast<T>(v.lVal);
            case VT_R4: return FromDouble<T>(v.fltVal);
            case VT_R8: return FromDouble<T>(v.dblVal);
            case VT_UI1: return static_cast<T>(v.bVal);
            default: return T{};
        }
    }
    template <class T>
    static T FromDouble(double d) {
        if constexpr (std::is_floating_point_v<T>) {
            return static_cast<T>(d);
        } else {
            if (!(d == d)) return T{};
            constexpr double lo = static_cast<double>(std::numeric_limits<T>::min());
            constexpr double hi = static_cast<double>(std::numeric_limits<T>::max());
            return d <= lo ? std::numeric_limits<T>::min()
                 : d >= hi ? std::numeric_limits<T>::max() : static_cast<T>(d);
        }
    }
    template <class T>
    static HRESULT ArrayVariant(const T* values, LONG length, com::Variant* out) {
        if (!values && length > 0) return E_POINTER;
        if (length < 0) return E_INVALIDARG;
        com::SafeArray a = com::SafeArray::Vector(VarType<T>(), static_cast<ULONG>(length));
        if (!a) return E_OUTOFMEMORY;
        if (length) std::memcpy(a.data<T>(), values, sizeof(T) * static_cast<std::size_t>(length));
        out->vt = VT_ARRAY | VarType<T>();
        out->parray = a.Detach();
        return S_OK;
    }
    // Copies an array (or single value) read into VARIANT v into the caller's
    // counted buffer; more elements than fit is E_INVALIDARG after filling it.
    template <class T>
    static HRESULT CopyOut(const VARIANT& v, T* values, LONG max_length, LONG* actual) {
        if (!(v.vt & VT_ARRAY)) {
            if (max_length < 1) return E_INVALIDARG;
            values[0] = FromVariant<T>(v);
            *actual = 1;
            return S_OK;
        }
        const ULONG n = com::SafeArrayCount(v.parray);
        const ULONG take = n < static_cast<ULONG>(max_length) ? n : static_cast<ULONG>(max_length);
        const VARTYPE element = static_cast<VARTYPE>(v.vt & ~VT_ARRAY);
        const char* data = static_cast<const char*>(v.parray->pvData);
        const std::size_t size = v.parray->cbElements;
        for (ULONG i = 0; i < take; ++i) {
            if (element == VT_VARIANT) {
                values[i] = FromVariant<T>(reinterpret_cast<const VARIANT*>(data)[i]);
                continue;
            }
            if (size > sizeof(LONGLONG)) return E_UNEXPECTED;
            VARIANT e;
            VariantInit(&e);
            e.vt = element;
            std::memcpy(&e.llVal, data + std::size_t(i) * size, size);
            values[i] = FromVariant<T>(e);
        }
        *actual = static_cast<LONG>(take);
        return take < n ? E_INVALIDARG : S_OK;
    }

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
