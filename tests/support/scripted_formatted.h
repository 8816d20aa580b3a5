// A scripted provider that also offers the session's IEEE 488.2 formatted
// I/O (block reads and writes): a real formatted-I/O object bound to a
// message session whose reads and writes are the script's.
#pragma once

#include <string>

#include "platform/visa/visa.h"
#include "tests/support/scripted_provider.h"

namespace qn::test {

class ScriptedFormattedProvider : public ScriptedProvider {
public:
    ScriptedFormattedProvider() {
        message_ = com::MakeComObject<Message>(*this);
        EXPECT_EQ(visa::CreateFormattedIO488(formatted_.Out()), S_OK);
        EXPECT_EQ(formatted_->put_IO(message_.get()), S_OK);
        formatted_->QueryInterface(iid_of<IFormattedIO488Direct>, direct_.OutVoid());
    }
    IMessage* MessageInterface() const override { return message_.get(); }
    IFormattedIO488* FormattedInterface() const override { return formatted_.get(); }
    IFormattedIO488Direct* FormattedDirect() const override { return direct_.get(); }

private:
    // The message session: writes and reads go to the script byte for byte;
    // a read ends at a line feed unless told to ignore it, or when the
    // scripted reply is used up (the end of the message).
    class Message final
        : public com::ComObject<Message, IMessage, com::As<IVisaSession, IMessage>,
                                IMessageDirect> {
    public:
        explicit Message(ScriptedFormattedProvider& owner) : owner_(owner) {}
        HRESULT ReadInto(BYTE* buf, LONG count, DWORD flags, LONG* pActual, LONG* pEnd) override {
            LONG n = 0, end = visa::kReadEndCount;
            while (n < count) {
                LONG got = 0;
                HRESULT hr = owner_.RawRead(buf + n, 1, &got);
                if (FAILED(hr)) {
                    *pActual = n;
                    return hr;
                }
                if (got == 0) {
                    end = visa::kReadEndEnd;
                    break;
                }
                if (buf[n++] == '\n' && !(flags & visa::kReadIgnoreTermChar)) {
                    end = visa::kReadEndTermChar;
                    break;
                }
            }
            *pActual = n;
            if (pEnd) *pEnd = end;
            return S_OK;
        }
        HRESULT WriteFrom(const BYTE* buf, LONG count, LONG* pActual) override {
            LONG written = 0;
            HRESULT hr = owner_.RawWrite(buf, count, &written);
            if (pActual) *pActual = written;
            return hr;
        }
        // No deadline of its own: the script answers at once.
        HRESULT BeginOperation() override { return S_OK; }
        HRESULT EndOperation() override { return S_OK; }
        // Like a raw socket: a message ends with its line feed.
        HRESULT get_HasEnd(VARIANT_BOOL* v) override { return *v = VARIANT_FALSE, S_OK; }
        HRESULT get_HardwareInterfaceType(SHORT* v) override { return *v = 6, S_OK; }
        HRESULT get_HardwareInterfaceNumber(SHORT* v) override { return *v = 0, S_OK; }
        HRESULT get_ResourceClass(BSTR*) override { return E_NOTIMPL; }
        HRESULT get_ResourceName(BSTR*) override { return E_NOTIMPL; }
        HRESULT get_Timeout(LONG* v) override { return owner_.RawGetTimeout(v); }
        HRESULT put_Timeout(LONG v) override { return owner_.RawSetTimeout(v); }
        HRESULT Close() override { return S_OK; }
        HRESULT Clear() override { return owner_.RawClear(); }
        HRESULT ReadSTB(SHORT* v) override { return owner_.RawReadSTB(v); }
        HRESULT Read(LONG, SAFEARRAY**) override { return E_NOTIMPL; }
        HRESULT ReadString(LONG, BSTR*) override { return E_NOTIMPL; }
        HRESULT Write(SAFEARRAY**, LONG, LONG*) override { return E_NOTIMPL; }
        HRESULT WriteString(BSTR, LONG*) override { return E_NOTIMPL; }
        HRESULT get_SendEndEnabled(VARIANT_BOOL* v) override { return *v = VARIANT_TRUE, S_OK; }
        HRESULT put_SendEndEnabled(VARIANT_BOOL) override { return S_OK; }
        HRESULT get_TerminationCharacter(BYTE* v) override { return *v = '\n', S_OK; }
        HRESULT put_TerminationCharacter(BYTE) override { return S_OK; }
        HRESULT get_TerminationCharacterEnabled(VARIANT_BOOL* v) override {
            return *v = VARIANT_TRUE, S_OK;
        }
        HRESULT put_TerminationCharacterEnabled(VARIANT_BOOL) override { return S_OK; }
        HRESULT AssertTrigger(SHORT) override { return E_NOTIMPL; }
        HRESULT LockRsrc(LONG, LONG, BSTR, BSTR*) override { return E_NOTIMPL; }
        HRESULT UnlockRsrc() override { return E_NOTIMPL; }
        HRESULT get_LockState(LONG*) override { return E_NOTIMPL; }

    private:
        ScriptedFormattedProvider& owner_;
    };

    ComPtr<Message> message_;
    ComPtr<IFormattedIO488> formatted_;
    ComPtr<IFormattedIO488Direct> direct_;
};

}  // namespace qn::test
