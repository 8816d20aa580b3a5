// Creates the driver object through the module's class factory and
// initializes it in simulation, using the installed C++ interface headers.
#include <cstdio>

#include "Quorlen731XX.h"

extern "C" HRESULT DllGetClassObject(REFCLSID clsid, REFIID riid, void** ppv);

int main() {
    ComPtr<IClassFactory> factory;
    ComPtr<IIviDriver> driver;
    if (FAILED(DllGetClassObject(CLSID_Quorlen731XX, iid_of<IClassFactory>, factory.OutVoid())) ||
        FAILED(factory->CreateInstance(nullptr, iid_of<IIviDriver>, driver.OutVoid()))) {
        std::fprintf(stderr, "creating the driver failed\n");
        return 1;
    }
    BSTR resource = SysAllocString(u"");
    BSTR options = SysAllocString(u"Simulate=true");
    HRESULT hr = driver->Initialize(resource, VARIANT_FALSE, VARIANT_FALSE, options);
    SysFreeString(resource);
    SysFreeString(options);
    VARIANT_BOOL initialized = VARIANT_FALSE;
    driver->get_Initialized(&initialized);
    driver->Close();
    if (FAILED(hr) || initialized != VARIANT_TRUE) {
        std::fprintf(stderr, "Initialize failed: 0x%08X\n", static_cast<unsigned>(hr));
        return 1;
    }
    std::printf("initialized through IIviDriver\n");
    return 0;
}
