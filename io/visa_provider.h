// CVisaComIOProvider: the provider over a VISA-COM session (resource manager,
// IMessage, IFormattedIO488 and, where offered, IRegister).
#pragma once

#include <string>

#include "io/provider.h"

namespace qn {

class CVisaComIOProvider : public CDriverIOProvider {
public:
    // Opens `resource` (releasing an earlier session first). Failures are
    // reported through err: an unreachable or unknown resource gives
    // E_IVI_RESOURCE_UNKNOWN with the transport's reason as extra text.
    HRESULT Open(const CErrorManagerBase& err, const SessionFlags* flags,
                 const std::string& resource) override;
    // Releases the formatted I/O object, the session, the message and the
    // register interface; forgets the owner. Closing a closed provider does nothing.
    void Close() override;

    IMessage* MessageInterface() const override { return message_.get(); }
    IFormattedIO488* FormattedInterface() const override { return formatted_.get(); }
    IRegister* RegisterInterface() const override { return register_.get(); }
    IVisaSession* SessionInterface() const { return session_.get(); }
    IFormattedIO488Direct* FormattedDirect() const override { return formatted_direct_.get(); }

protected:
    HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) override;
    HRESULT RawRead(BYTE* buf, LONG count, LONG* actual) override;
    HRESULT RawReadArray(LONG count, SAFEARRAY** out) override;
    HRESULT RawClear() override;
    HRESULT RawReadSTB(SHORT* stb) override;
    HRESULT RawGetTimeout(LONG* ms) override;
    HRESULT RawSetTimeout(LONG ms) override;
    HRESULT RawInterface(SHORT* type, std::string* resource_class) override;
    HRESULT RawGetBool(int which, bool* v) override;
    HRESULT RawSetBool(int which, bool v) override;
    HRESULT RawGetTermChar(BYTE* c) override;
    HRESULT RawSetTermChar(BYTE c) override;
    bool RawBeginOperation() override;
    void RawEndOperation() override;

private:
    ComPtr<IVisaSession> session_;
    ComPtr<IMessage> message_;
    ComPtr<IMessageDirect> direct_;
    ComPtr<IRegister> register_;
    ComPtr<IFormattedIO488> formatted_;
    ComPtr<IFormattedIO488Direct> formatted_direct_;
};

}  // namespace qn
