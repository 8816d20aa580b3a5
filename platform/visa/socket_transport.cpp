// Raw TCP socket transport (TCPIP::host::port::SOCKET): a byte stream
// (stream_transport.h) over a connected, non-blocking socket.
#include "platform/visa/resource_name.h"
#include "platform/visa/stream_transport.h"
#include "platform/visa/tcp_connect.h"

namespace qn::visa {

HRESULT OpenSocketTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error) {
    FdHolder fd;
    HRESULT hr =
        ConnectTcp(name.host, name.port, Deadline::FromTimeout(open_timeout_ms), &fd, error);
    if (FAILED(hr)) return hr;
    *out = std::make_unique<StreamTransport>(fd.release(), StreamTransport::Kind::kSocket,
                                             name.host + ":" + std::to_string(name.port));
    return S_OK;
}

}  // namespace qn::visa
