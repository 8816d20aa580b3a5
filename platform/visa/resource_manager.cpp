// The resource manager: parses the resource string and opens the transport
// for its kind (kTransports); kinds without one parse and then report that
// the resource cannot be found.
#include <string>

#include "platform/visa/errors.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/session.h"
#include "platform/visa/transport.h"
#include "platform/visa/visa.h"

namespace qn::visa {
namespace {

constexpr GUID kManagerIid = iid_of<IResourceManager>;

using Opener = HRESULT (*)(const ResourceName&, LONG, std::unique_ptr<Transport>*, std::string*);

// A LAN instrument whose device name starts with "hislip" speaks HiSLIP, any
// other speaks VXI-11.
bool IsHislip(const ResourceName& n) {
    return n.device_name.size() >= 6 && (n.device_name[0] | 0x20) == 'h' &&
           (n.device_name[1] | 0x20) == 'i' && (n.device_name[2] | 0x20) == 's' &&
           (n.device_name[3] | 0x20) == 'l' && (n.device_name[4] | 0x20) == 'i' &&
           (n.device_name[5] | 0x20) == 'p';
}
bool Any(const ResourceName&) {
    return true;
}
bool IsVxi11(const ResourceName& n) {
    return !IsHislip(n);
}

struct TransportKind {
    int interface_type;
    std::string_view resource_class;
    bool (*matches)(const ResourceName&);
    Opener open;
    // Opens holding the device lock, where the bus can do that in one step
    // (null: the lock is taken once the session is open).
    Opener open_locked = nullptr;
};

constexpr TransportKind kTransports[] = {
    {kInterfaceTcpip, "SOCKET", Any, OpenSocketTransport},
    {kInterfaceTcpip, "INSTR", IsVxi11, OpenVxi11Transport, OpenVxi11TransportLocked},
    {kInterfaceTcpip, "INSTR", IsHislip, OpenHislipTransport},
    {kInterfaceAsrl, "INSTR", Any, OpenSerialTransport},
    {kInterfaceUsb, "INSTR", Any, OpenUsbtmcTransport},
};

class ResourceManager final : public qn::com::ComObject<ResourceManager, IResourceManager> {
  public:
    HRESULT Open(BSTR resourceName, LONG accessMode, LONG openTimeout, BSTR /*optionString*/,
                 IVisaSession** ppSession) override {
        if (!ppSession) return E_POINTER;
        *ppSession = nullptr;
        if (accessMode & kSharedLock)
            return Report(E_VISA_NOT_SUPPORTED, kManagerIid, "shared locks are not offered");
        return Guard(kManagerIid, [&] {
            return OpenSession(qn::com::BstrToUtf8(resourceName), accessMode, openTimeout,
                               ppSession);
        });
    }

  private:
    static HRESULT OpenSession(const std::string& text, LONG accessMode, LONG openTimeout,
                               IVisaSession** ppSession) {
        std::string error;
        std::optional<ResourceName> name = ParseResourceName(text, &error);
        if (!name)
            return Report(E_VISA_INVALID_RESOURCE_NAME, kManagerIid,
                          "invalid resource name " + error);
        if (openTimeout <= 0 && openTimeout != kTimeoutInfinite)
            openTimeout = kDefaultOpenTimeoutMs;
        for (const TransportKind& kind : kTransports) {
            if (kind.interface_type != name->interface_type ||
                kind.resource_class != name->resource_class || !kind.matches(*name))
                continue;
            std::unique_ptr<Transport> transport;
            const bool lock = (accessMode & kExclusiveLock) != 0;
            const bool locked = lock && kind.open_locked;
            HRESULT hr = (locked ? kind.open_locked : kind.open)(*name, openTimeout, &transport,
                                                                 &error);
            if (FAILED(hr)) return Report(hr, kManagerIid, text + ": " + error);
            auto session = qn::com::MakeComObject<MessageSession>(std::move(*name),
                                                                  std::move(transport), locked);
            // The exclusive lock is waited for within the open timeout; a
            // session that cannot have it is closed again (its link ended).
            if (lock && !locked) {
                hr = session->LockExclusive(openTimeout, &error);
                if (FAILED(hr)) {
                    session->Close();
                    return Report(hr, kManagerIid, text + ": lock: " + error);
                }
            }
            return session->QueryInterface(iid_of<IVisaSession>,
                                           reinterpret_cast<void**>(ppSession));
        }
        return Report(E_VISA_RESOURCE_NOT_FOUND, kManagerIid,
                      text + ": no transport for " + name->resource_class +
                          " resources of this kind in this build");
    }
};

}  // namespace

HRESULT CreateResourceManager(IResourceManager** ppManager) {
    if (!ppManager) return E_POINTER;
    *ppManager = nullptr;
    return Guard(kManagerIid, [&] {
        *ppManager = qn::com::MakeComObject<ResourceManager>().Detach();
        return S_OK;
    });
}

}  // namespace qn::visa
