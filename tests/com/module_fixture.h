// The built driver module seen from outside: its parameterless entry points
// called through dlopen (so that the module path registration writes is the
// library's own), and a fixture whose registry store is a file in a temporary
// directory of the test's own.
#pragma once

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <stdlib.h>

#include <filesystem>
#include <string>

#include "platform/com/types.h"

namespace qn::test {

inline HRESULT CallModule(const char* entry) {
    void* module = ::dlopen(QN_DRIVER_MODULE_PATH, RTLD_NOW | RTLD_LOCAL);
    if (!module) {
        ADD_FAILURE() << ::dlerror();
        return E_FAIL;
    }
    auto fn = reinterpret_cast<HRESULT (*)()>(::dlsym(module, entry));
    if (!fn) ADD_FAILURE() << "no " << entry << " in " << QN_DRIVER_MODULE_PATH;
    const HRESULT hr = fn ? fn() : E_FAIL;
    ::dlclose(module);
    return hr;
}

class RegistryFileTest : public ::testing::Test {
protected:
    void SetUp() override {
        char dir[] = "/tmp/qn-comreg-XXXXXX";
        ASSERT_NE(::mkdtemp(dir), nullptr);
        dir_ = dir;
        file_ = dir_ + "/registry";
        ::setenv("QN_REGISTRY_FILE", file_.c_str(), 1);
    }
    void TearDown() override {
        ::unsetenv("QN_REGISTRY_FILE");
        std::filesystem::remove_all(dir_);
    }
    std::string dir_, file_;
};

}  // namespace qn::test
