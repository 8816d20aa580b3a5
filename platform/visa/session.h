// A message-based instrument session over one transport: IVisaSession and
// IMessage with their settings, and IMessageDirect. One lock serialises the
// I/O of the session; the settings can be read and changed at any time.
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <thread>

#include "platform/visa/resource_name.h"
#include "platform/visa/serial.h"
#include "platform/visa/transport.h"
#include "platform/visa/visa.h"

namespace qn::visa {

class MessageSession final
    : public qn::com::ComObject<MessageSession, IMessage, qn::com::As<IVisaSession, IMessage>,
                                IMessageDirect, ISerial> {
  public:
    // locked: the transport was opened holding the device lock (one LockRsrc).
    MessageSession(ResourceName name, std::unique_ptr<Transport> transport, bool locked = false);

    // ISerial only for serial resources.
    HRESULT QueryInterface(REFIID riid, void** ppv) override;

    // IVisaSession
    HRESULT get_HardwareInterfaceType(SHORT* pVal) override;
    HRESULT get_HardwareInterfaceNumber(SHORT* pVal) override;
    HRESULT get_ResourceClass(BSTR* pVal) override;
    HRESULT get_ResourceName(BSTR* pVal) override;
    HRESULT get_Timeout(LONG* pVal) override;
    HRESULT put_Timeout(LONG val) override;
    HRESULT Close() override;
    HRESULT LockRsrc(LONG type, LONG lockTimeout, BSTR requestedKey, BSTR* accessKey) override;
    HRESULT UnlockRsrc() override;
    HRESULT get_LockState(LONG* pVal) override;

    // IMessage
    HRESULT Clear() override;
    HRESULT ReadSTB(SHORT* pStatusByte) override;
    HRESULT Read(LONG count, SAFEARRAY** pBuffer) override;
    HRESULT ReadString(LONG count, BSTR* pBuffer) override;
    HRESULT Write(SAFEARRAY** buffer, LONG count, LONG* pRetCount) override;
    HRESULT WriteString(BSTR buffer, LONG* pRetCount) override;
    HRESULT get_SendEndEnabled(VARIANT_BOOL* pVal) override;
    HRESULT put_SendEndEnabled(VARIANT_BOOL val) override;
    HRESULT get_TerminationCharacter(BYTE* pVal) override;
    HRESULT put_TerminationCharacter(BYTE val) override;
    HRESULT get_TerminationCharacterEnabled(VARIANT_BOOL* pVal) override;
    HRESULT put_TerminationCharacterEnabled(VARIANT_BOOL val) override;
    HRESULT AssertTrigger(SHORT protocol) override;

    // IMessageDirect
    HRESULT ReadInto(BYTE* buf, LONG count, DWORD flags, LONG* pActual, LONG* pEnd) override;
    HRESULT WriteFrom(const BYTE* buf, LONG count, LONG* pActual) override;
    HRESULT BeginOperation() override;
    HRESULT EndOperation() override;
    HRESULT get_HasEnd(VARIANT_BOOL* pVal) override;

    // ISerial
    HRESULT get_BaudRate(LONG* pVal) override;
    HRESULT put_BaudRate(LONG val) override;
    HRESULT get_DataBits(SHORT* pVal) override;
    HRESULT put_DataBits(SHORT val) override;
    HRESULT get_Parity(SHORT* pVal) override;
    HRESULT put_Parity(SHORT val) override;
    HRESULT get_StopBits(SHORT* pVal) override;
    HRESULT put_StopBits(SHORT val) override;
    HRESULT get_FlowControl(SHORT* pVal) override;
    HRESULT put_FlowControl(SHORT val) override;

    // Takes (or nests) the device's exclusive lock, waiting up to
    // lock_timeout_ms; *error says why it failed.
    HRESULT LockExclusive(LONG lock_timeout_ms, std::string* error);

  private:
    // Reads or changes one field of the serial settings; a change is applied
    // to the line first and kept only when the line took it.
    template <class T>
    HRESULT GetSerial(T SerialSettings::*field, T* pVal);
    template <class T>
    HRESULT PutSerial(T SerialSettings::*field, T val);

    // One transport read with the session's settings and deadline; the
    // caller holds io_.
    HRESULT ReadLocked(BYTE* buf, std::size_t count, DWORD flags, const Deadline& deadline,
                       ReadResult* result);
    HRESULT WriteBytes(const BYTE* data, std::size_t size, LONG* pRetCount);
    HRESULT Closed() const;
    // The deadline of an I/O call starting now: the open operation's when
    // the calling thread has one, else the session timeout from now.
    Deadline CallDeadline();

    const ResourceName name_;
    std::mutex io_;
    std::unique_ptr<Transport> transport_;  // null once closed; guarded by io_
    std::atomic<LONG> timeout_{kDefaultTimeoutMs};
    std::atomic<bool> send_end_{true};
    std::atomic<bool> term_enabled_{false};
    std::atomic<BYTE> term_char_{'\n'};
    SerialSettings serial_;  // guarded by io_
    int lock_depth_ = 0;     // LockRsrc calls not yet given back; guarded by io_

    std::mutex op_m_;  // guards the open operation below
    std::thread::id op_thread_;
    int op_depth_ = 0;
    Deadline op_deadline_;
};

}  // namespace qn::visa
