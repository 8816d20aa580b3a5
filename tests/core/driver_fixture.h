// A fixture that creates a root driver object and points the configuration
// store at a file of the test's own (absent unless the test writes it).
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/root.h"

namespace qn::test {

class DriverTest : public ::testing::Test {
protected:
    void SetUp() override {
        dir_ = std::filesystem::temp_directory_path() /
               ("qn-core-" + std::to_string(::getpid()) + "-" +
                ::testing::UnitTest::GetInstance()->current_test_info()->name());
        std::filesystem::create_directories(dir_);
        store_ = (dir_ / "store.xml").string();
        ::setenv("IVI_CONFIG_STORE", store_.c_str(), 1);
        driver_ = com::MakeComObject<Quorlen731XX>();
    }
    void TearDown() override {
        driver_.reset();
        ::unsetenv("IVI_CONFIG_STORE");
        std::filesystem::remove_all(dir_);
    }

    void WriteStore(const std::string& xml) { std::ofstream(store_) << xml; }

    HRESULT Init(const char* resource, const char* options, bool id_query = false,
                 bool reset = false) {
        com::Bstr r(resource), o(options);
        return driver_->Initialize(r.get(), id_query ? VARIANT_TRUE : VARIANT_FALSE,
                                   reset ? VARIANT_TRUE : VARIANT_FALSE, o.get());
    }

    // The description of the thread's error information ("" when none).
    static std::string ErrorText() {
        com::ErrorRecord rec;
        return com::TakeThreadError(&rec) ? rec.description : std::string();
    }
    static bool HasErrorInfo() { return com::TakeThreadError(nullptr); }

    bool Initialized() {
        VARIANT_BOOL b = VARIANT_FALSE;
        EXPECT_EQ(driver_->get_Initialized(&b), S_OK);
        return b == VARIANT_TRUE;
    }
    std::string Text(HRESULT (IIviDriverIdentity::*get)(BSTR*)) {
        com::Bstr s;
        EXPECT_EQ((static_cast<IIviDriverIdentity*>(driver_.get())->*get)(s.Out()), S_OK);
        return s.utf8();
    }

    std::filesystem::path dir_;
    std::string store_;
    ComPtr<Quorlen731XX> driver_;
};

}  // namespace qn::test
