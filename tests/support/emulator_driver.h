// A root driver object initialized against an emulator served over a
// loopback socket, with the configuration store pointed at a file that does
// not exist.
#pragma once

#include <cstdlib>
#include <memory>
#include <string>

#include "core/root.h"
#include "emulator/emulator.h"
#include "tests/support/error_text.h"

namespace qn::test {

inline std::string SocketResource(std::uint16_t port) {
    return "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
}

struct EmulatedDriver {
    // Starts an emulator of `model` and initializes a new driver object
    // against it; the result of Initialize.
    HRESULT Open(const char* model, const char* options = "", bool id_query = true,
                 bool reset = false) {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        emu = std::make_unique<emu::Emulator>(model);
        port = emu->Start();
        driver = com::MakeComObject<Quorlen731XX>();
        com::Bstr r(SocketResource(port)), o(options);
        return driver->Initialize(r.get(), id_query ? VARIANT_TRUE : VARIANT_FALSE,
                                  reset ? VARIANT_TRUE : VARIANT_FALSE, o.get());
    }

    std::unique_ptr<emu::Emulator> emu;
    std::uint16_t port = 0;
    ComPtr<Quorlen731XX> driver;
};

}  // namespace qn::test
