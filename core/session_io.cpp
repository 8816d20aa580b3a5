// The session's instrument steps: opening and closing the I/O session,
// identifying the instrument, and the queries of the inherent operations.
// Until a transport is wired in, a session can only simulate.
#include "core/inherent.h"
#include "core/root.h"

namespace qn {

HRESULT Quorlen731XX::StartTracing() { return S_OK; }
void Quorlen731XX::SaveTrace() {}

HRESULT Quorlen731XX::OpenIo() { return Errors().Error(Msg::E_IVI_RESOURCE_UNKNOWN); }
void Quorlen731XX::CloseIo() {}
HRESULT Quorlen731XX::StartSession() { return S_OK; }
void Quorlen731XX::EndSession() {}
void Quorlen731XX::ResetChildren() {}
HRESULT Quorlen731XX::QueryIdentity() { return S_OK; }

HRESULT Quorlen731XX::QueryInteger(std::string_view, long, LONG*) {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}
HRESULT Quorlen731XX::QueryErrorText(std::string*) {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}
HRESULT Quorlen731XX::ClearStatus() {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}

}  // namespace qn
