#include "io/io_manager.h"

#include <optional>

#include "Quorlen731XXErrors.h"
#include "core/options.h"

namespace qn {

namespace {

// The trace record of one I/O operation; builds nothing unless recording.
class IoTrace {
public:
    IoTrace(SessionCore& core, const char* op, std::string_view cmd = {}) {
        if (!core.tracer.IsRecording()) return;
        text_ = com::Bstr(cmd);
        value_ = text_.get();
        param_ = TraceParam::String("strCommand", TraceDirection::In, &value_);
        trace_.emplace(&core.tracer, kIOManagerTraceInterface, op,
                       std::span<const TraceParam>(&param_, cmd.empty() ? 0 : 1));
    }

private:
    com::Bstr text_;
    BSTR value_ = nullptr;
    TraceParam param_{};
    std::optional<CMethodTrace> trace_;
};

// True when a query's reply was read: the query succeeded, or only the
// status check after it failed (the reply is then still delivered).
bool ReplyWasRead(HRESULT hr) { return SUCCEEDED(hr) || hr == E_IVI_INSTRUMENT_STATUS; }

BSTR Narrow(std::string_view s, com::Bstr& holder) {
    holder = com::Bstr(s);
    return holder.get();
}

}  // namespace

CDriverIOManager::CDriverIOManager(CDriverNode& node) : node_(node) {}

CDriverIOProvider& CDriverIOManager::Provider() const { return *node_.Core().io; }
const std::string& CDriverIOManager::CurrentCommand() const {
    return node_.Commands().CurrentCommand();
}

LONG CDriverIOManager::AsciiType(LONG t) {
    switch (t) {
        case 2: case 3: case 4: case 5: case 8: case 12: case 17: return t;
        default: return 2;
    }
}
LONG CDriverIOManager::BinaryType(LONG t) {
    switch (t) {
        case 2: case 3: case 4: case 5: case 17: return t;
        default: return 2;
    }
}

HRESULT CDriverIOManager::PollInstrumentErrors() {
    IoTrace t(node_.Core(), "PollInstrumentErrors");
    return Provider().PollInstrumentErrors(node_.Errors());
}
HRESULT CDriverIOManager::DeviceClear() {
    IoTrace t(node_.Core(), "DeviceClear");
    return Provider().DeviceClear();
}
HRESULT CDriverIOManager::ReadSTB(SHORT* stb) {
    IoTrace t(node_.Core(), "ReadSTB");
    return Provider().ReadSTB(stb);
}
HRESULT CDriverIOManager::SetIOTimeout(LONG timeout) {
    IoTrace t(node_.Core(), "SetIOTimeout");
    return Provider().SetIOTimeout(node_.Errors(), timeout);
}
HRESULT CDriverIOManager::GetIOTimeout(LONG* timeout) {
    IoTrace t(node_.Core(), "GetIOTimeout");
    return Provider().GetIOTimeout(node_.Errors(), timeout);
}
HRESULT CDriverIOManager::IsTimeout(bool* timed_out) {
    IoTrace t(node_.Core(), "IsTimeout");
    if (!timed_out) return E_POINTER;
    *timed_out = Provider().IsTimeout();
    return S_OK;
}
HRESULT CDriverIOManager::GetVisaInterfaceType(LONG* type) {
    IoTrace t(node_.Core(), "GetVisaInterfaceType");
    return Provider().GetVisaInterfaceType(node_.Errors(), type);
}
HRESULT CDriverIOManager::SetSendEndEnabled(bool on) {
    IoTrace t(node_.Core(), "SetSendEndEnabled");
    return Provider().SetSendEndEnabled(node_.Errors(), on);
}
HRESULT CDriverIOManager::GetSendEndEnabled(bool* on) {
    IoTrace t(node_.Core(), "GetSendEndEnabled");
    return Provider().GetSendEndEnabled(node_.Errors(), on);
}
HRESULT CDriverIOManager::SetTerminationCharacter(BYTE c) {
    IoTrace t(node_.Core(), "SetTerminationCharacter");
    return Provider().SetTerminationCharacter(node_.Errors(), c);
}
HRESULT CDriverIOManager::GetTerminationCharacter(BYTE* c) {
    IoTrace t(node_.Core(), "GetTerminationCharacter");
    return Provider().GetTerminationCharacter(node_.Errors(), c);
}
HRESULT CDriverIOManager::SetTerminationCharacterEnabled(bool on) {
    IoTrace t(node_.Core(), "SetTerminationCharacterEnabled");
    return Provider().SetTerminationCharacterEnabled(node_.Errors(), on);
}
HRESULT CDriverIOManager::GetTerminationCharacterEnabled(bool* on) {
    IoTrace t(node_.Core(), "GetTerminationCharacterEnabled");
    return Provider().GetTerminationCharacterEnabled(node_.Errors(), on);
}

HRESULT CDriverIOManager::Write(const char* op, std::string cmd, LONG timeout, bool poll) {
    IoTrace t(node_.Core(), op, cmd);
    return Provider().Write(node_.Errors(), cmd, timeout, poll);
}

HRESULT CDriverIOManager::QueryText(const char* op, std::string cmd, std::string* out,
                                    LONG max_chars, LONG timeout) {
    if (!out) return E_POINTER;
    IoTrace t(node_.Core(), op, cmd);
    return Provider().Query(node_.Errors(), cmd, out, max_chars, timeout);
}

template <class T>
HRESULT CDriverIOManager::QueryValue(const char* op, std::string cmd, T* out, LONG timeout) {
    if (!out) return E_POINTER;
    IoTrace t(node_.Core(), op, cmd);
    return Provider().QueryNumber(node_.Errors(), cmd, out, timeout);
}
template HRESULT CDriverIOManager::QueryValue(const char*, std::string, bool*, LONG);
template HRESULT CDriverIOManager::QueryValue(const char*, std::string, SHORT*, LONG);
template HRESULT CDriverIOManager::QueryValue(const char*, std::string, LONG*, LONG);
template HRESULT CDriverIOManager::QueryValue(const char*, std::string, float*, LONG);
template HRESULT CDriverIOManager::QueryValue(const char*, std::string, double*, LONG);

HRESULT CDriverIOManager::InstrRead(SAFEARRAY** out, LONG count, LONG timeout) {
    IoTrace t(node_.Core(), "InstrRead");
    return Provider().ReadBytes(node_.Errors(), out, count, timeout, true);
}
HRESULT CDriverIOManager::InstrRead(std::string* out, LONG max_chars, LONG timeout,
                                    bool remove_trailing) {
    if (!out) return E_POINTER;
    IoTrace t(node_.Core(), "InstrRead");
    return Provider().ReadText(node_.Errors(), out, max_chars, timeout, remove_trailing);
}
HRESULT CDriverIOManager::InstrRead(BYTE* buf, LONG count, LONG* actual, LONG timeout) {
    IoTrace t(node_.Core(), "InstrRead");
    return Provider().ReadBuffer(node_.Errors(), buf, count, actual, timeout, true);
}
HRESULT CDriverIOManager::InstrWrite(std::string_view cmd, LONG timeout) {
    return Write("InstrWrite", std::string(cmd), timeout, true);
}
HRESULT CDriverIOManager::InstrWrite(SAFEARRAY* bytes, LONG count, LONG timeout) {
    IoTrace t(node_.Core(), "InstrWrite");
    return Provider().WriteBytes(node_.Errors(), bytes, count, timeout, true);
}
HRESULT CDriverIOManager::InstrWrite(const BYTE* buf, LONG count, LONG* actual, LONG timeout) {
    IoTrace t(node_.Core(), "InstrWrite");
    return Provider().WriteBuffer(node_.Errors(), buf, count, actual, timeout, true);
}
HRESULT CDriverIOManager::InstrWriteNoPoll(std::string_view cmd, LONG timeout) {
    return Write("InstrWriteNoPoll", std::string(cmd), timeout, false);
}
HRESULT CDriverIOManager::InstrWriteNoPoll(SAFEARRAY* bytes, LONG count, LONG timeout) {
    IoTrace t(node_.Core(), "InstrWriteNoPoll");
    return Provider().WriteBytes(node_.Errors(), bytes, count, timeout, false);
}
HRESULT CDriverIOManager::InstrWriteNoPoll(const BYTE* buf, LONG count, LONG* actual,
                                           LONG timeout) {
    IoTrace t(node_.Core(), "InstrWriteNoPoll");
    return Provider().WriteBuffer(node_.Errors(), buf, count, actual, timeout, false);
}

HRESULT CDriverIOManager::InstrPrintCommand() {
    return Write("InstrPrintCommand", CurrentCommand(), kTimeoutSession, true);
}
HRESULT CDriverIOManager::InstrPrintCommandNoPoll() {
    return Write("InstrPrintCommandNoPoll", CurrentCommand(), kTimeoutSession, false);
}
HRESULT CDriverIOManager::InstrQueryCommand(std::string* out, LONG max_chars, LONG timeout) {
    return QueryText("InstrQueryCommand", CurrentCommand(), out, max_chars, timeout);
}

HRESULT CDriverIOManager::InstrQueryCommandBool(VARIANT_BOOL* out, LONG timeout) {
    if (!out) return E_POINTER;
    *out = VARIANT_FALSE;
    std::string reply;
    HRESULT hr = QueryText("InstrQueryCommandBool", CurrentCommand(), &reply, 1024, timeout);
    if (!ReplyWasRead(hr)) return hr;
    std::string_view v = TrimBlanks(reply);
    if (v == "1") {
        *out = VARIANT_TRUE;
    } else if (v != "0" && SUCCEEDED(hr)) {
        return node_.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    }
    return hr;
}

HRESULT CDriverIOManager::InstrQueryCommandEnum(const CEnumCommandTable& table, LONG* out,
                                                LONG timeout) {
    if (!out) return E_POINTER;
    std::string reply;
    HRESULT hr = QueryText("InstrQueryCommandEnum", CurrentCommand(), &reply, 1024, timeout);
    if (!ReplyWasRead(hr)) return hr;
    auto value = table.ValueOf(node_.Core().Model(), TrimBlanks(reply));
    if (value) *out = *value;
    if (!value && SUCCEEDED(hr)) return node_.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    return hr;
}

template <class Op>
HRESULT CDriverIOManager::Formatted(const char* op, LONG timeout, bool poll, Op&& f) {
    IoTrace t(node_.Core(), op);
    CDriverIOProvider& p = Provider();
    return p.Run(node_.Errors(), timeout, poll, [&]() -> HRESULT {
        IFormattedIO488* io = p.FormattedInterface();
        if (!io) return E_FAIL;
        HRESULT hr = f(io);
        return hr == kVisaTimeout ? kProviderTimeout : hr;
    });
}

HRESULT CDriverIOManager::FormattedWriteString(std::string_view data, bool flush, LONG timeout) {
    return Formatted("FormattedWriteString", timeout, flush, [&](IFormattedIO488* io) {
        com::Bstr b;
        return io->WriteString(Narrow(data, b), flush ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedWriteNumber(const VARIANT& data, LONG type, bool flush,
                                               LONG timeout) {
    return Formatted("FormattedWriteNumber", timeout, flush, [&](IFormattedIO488* io) {
        return io->WriteNumber(data, AsciiType(type), flush ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedWriteList(VARIANT* data, LONG type, std::string_view sep,
                                             bool flush, LONG timeout) {
    return Formatted("FormattedWriteList", timeout, flush, [&](IFormattedIO488* io) {
        com::Bstr b;
        return io->WriteList(data, AsciiType(type), Narrow(sep, b),
                             flush ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedWriteIEEEBlock(std::string_view command, const VARIANT& data,
                                                  bool flush, LONG timeout) {
    return Formatted("FormattedWriteIEEEBlock", timeout, flush, [&](IFormattedIO488* io) {
        com::Bstr b;
        return io->WriteIEEEBlock(Narrow(command, b), data, flush ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedReadString(std::string* out, LONG timeout) {
    if (!out) return E_POINTER;
    return Formatted("FormattedReadString", timeout, true, [&](IFormattedIO488* io) {
        com::Bstr b;
        HRESULT hr = io->ReadString(b.Out());
        *out = b.utf8();
        return hr;
    });
}
HRESULT CDriverIOManager::FormattedReadNumber(LONG type, bool flush, VARIANT* out, LONG timeout) {
    if (!out) return E_POINTER;
    return Formatted("FormattedReadNumber", timeout, true, [&](IFormattedIO488* io) {
        return io->ReadNumber(AsciiType(type), flush ? VARIANT_TRUE : VARIANT_FALSE, out);
    });
}
HRESULT CDriverIOManager::FormattedReadList(LONG type, std::string_view sep, VARIANT* out,
                                            LONG timeout) {
    if (!out) return E_POINTER;
    return Formatted("FormattedReadList", timeout, true, [&](IFormattedIO488* io) {
        com::Bstr b;
        return io->ReadList(AsciiType(type), Narrow(sep, b), out);
    });
}
HRESULT CDriverIOManager::FormattedReadIEEEBlock(LONG type, bool seek, bool flush, VARIANT* out,
                                                 LONG timeout) {
    if (!out) return E_POINTER;
    return Formatted("FormattedReadIEEEBlock", timeout, true, [&](IFormattedIO488* io) {
        return io->ReadIEEEBlock(BinaryType(type), seek ? VARIANT_TRUE : VARIANT_FALSE,
                                 flush ? VARIANT_TRUE : VARIANT_FALSE, out);
    });
}
HRESULT CDriverIOManager::FormattedReadIEEEBlockInto(LONG type, void* buf, LONG max_count,
                                                     LONG* actual, bool seek, bool flush,
                                                     LONG timeout, bool poll) {
    if (!buf || !actual) return E_POINTER;
    *actual = 0;
    if (max_count < 0) return E_INVALIDARG;
    IFormattedIO488Direct* direct = Provider().FormattedDirect();
    return Formatted("FormattedReadIEEEBlock", timeout, poll, [&](IFormattedIO488*) -> HRESULT {
        if (!direct) return E_FAIL;
        return direct->ReadIEEEBlockInto(BinaryType(type), buf, max_count, actual,
                                         seek ? VARIANT_TRUE : VARIANT_FALSE,
                                         flush ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedReadIEEEBlockToSession(LONG type, const void** view,
                                                          LONG* actual, bool seek, bool flush,
                                                          LONG timeout, bool poll) {
    if (!view || !actual) return E_POINTER;
    *view = nullptr;
    *actual = 0;
    CDriverIOProvider& p = Provider();
    IFormattedIO488Direct* direct = p.FormattedDirect();
    return Formatted("FormattedReadIEEEBlock", timeout, poll, [&](IFormattedIO488*) -> HRESULT {
        if (!direct) return E_FAIL;
        HRESULT hr = direct->ReadIEEEBlockToSink(BinaryType(type), &p.Receive(), actual,
                                                 seek ? VARIANT_TRUE : VARIANT_FALSE,
                                                 flush ? VARIANT_TRUE : VARIANT_FALSE);
        if (SUCCEEDED(hr)) *view = p.Receive().data();
        return hr;
    });
}
HRESULT CDriverIOManager::FormattedFlushWrite(bool send_end, LONG timeout) {
    return Formatted("FormattedFlushWrite", timeout, true, [&](IFormattedIO488* io) {
        return io->FlushWrite(send_end ? VARIANT_TRUE : VARIANT_FALSE);
    });
}
HRESULT CDriverIOManager::FormattedFlushRead(LONG timeout) {
    return Formatted("FormattedFlushRead", timeout, true,
                     [&](IFormattedIO488* io) { return io->FlushRead(); });
}
HRESULT CDriverIOManager::FormattedSetBufferSize(LONG mask, LONG size) {
    IoTrace t(node_.Core(), "FormattedSetBufferSize");
    IFormattedIO488* io = Provider().FormattedInterface();
    return io ? io->SetBufferSize(mask, size) : E_FAIL;
}

template <class Op>
HRESULT CDriverIOManager::Register(const char* op, Op&& f) {
    IoTrace t(node_.Core(), op);
    CDriverIOProvider& p = Provider();
    return p.Run(node_.Errors(), kTimeoutSession, true, [&]() -> HRESULT {
        IRegister* r = p.RegisterInterface();
        if (!r) {
            com::SetThreadError(GUID_NULL, "VISA", "the session has no register access");
            return E_FAIL;
        }
        return f(r);
    });
}

HRESULT CDriverIOManager::RegisterIn8(SHORT s, LONG o, BYTE* v) {
    return Register("RegisterIn8", [&](IRegister* r) { return r->In8(s, o, v); });
}
HRESULT CDriverIOManager::RegisterIn16(SHORT s, LONG o, SHORT* v) {
    return Register("RegisterIn16", [&](IRegister* r) { return r->In16(s, o, v); });
}
HRESULT CDriverIOManager::RegisterIn32(SHORT s, LONG o, LONG* v) {
    return Register("RegisterIn32", [&](IRegister* r) { return r->In32(s, o, v); });
}
HRESULT CDriverIOManager::RegisterOut8(SHORT s, LONG o, BYTE v) {
    return Register("RegisterOut8", [&](IRegister* r) { return r->Out8(s, o, v); });
}
HRESULT CDriverIOManager::RegisterOut16(SHORT s, LONG o, SHORT v) {
    return Register("RegisterOut16", [&](IRegister* r) { return r->Out16(s, o, v); });
}
HRESULT CDriverIOManager::RegisterOut32(SHORT s, LONG o, LONG v) {
    return Register("RegisterOut32", [&](IRegister* r) { return r->Out32(s, o, v); });
}

HRESULT CDriverIOManager::RegisterMoveIn8(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveIn8", [&](IRegister* r) { return r->MoveIn8(s, o, n, b); });
}
HRESULT CDriverIOManager::RegisterMoveIn16(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveIn16", [&](IRegister* r) { return r->MoveIn16(s, o, n, b); });
}
HRESULT CDriverIOManager::RegisterMoveIn32(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveIn32", [&](IRegister* r) { return r->MoveIn32(s, o, n, b); });
}
HRESULT CDriverIOManager::RegisterMoveOut8(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveOut8", [&](IRegister* r) { return r->MoveOut8(s, o, n, b); });
}
HRESULT CDriverIOManager::RegisterMoveOut16(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveOut16", [&](IRegister* r) { return r->MoveOut16(s, o, n, b); });
}
HRESULT CDriverIOManager::RegisterMoveOut32(SHORT s, LONG o, LONG n, SAFEARRAY** b) {
    return Register("RegisterMoveOut32", [&](IRegister* r) { return r->MoveOut32(s, o, n, b); });
}

}  // namespace qn
