// A root driver object whose instrument session is a scripted provider, with
// the configuration store pointed at a file that does not exist.
#pragma once

#include <cstdlib>
#include <memory>

#include "core/root.h"
#include "tests/support/scripted_provider.h"

namespace qn::test {

template <class Provider = ScriptedProvider>
ComPtr<Quorlen731XX> DriverOnScript(Provider** io) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    auto p = std::make_unique<Provider>();
    *io = p.get();
    driver->Core().io = std::move(p);
    return driver;
}

}  // namespace qn::test
