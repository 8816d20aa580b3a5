// Helpers of the C API tests: a simulated C session and the session's error
// record as text.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "Qn731XX.h"

namespace qn::test {

// The recorded error of a session (cleared by reading it).
inline std::string RecordedError(ViSession vi, ViStatus* code = nullptr) {
    char text[1024] = "";
    ViStatus c = 0;
    Qn731XX_GetError(vi, &c, sizeof text, text);
    if (code) *code = c;
    return text;
}

class CSessionTest : public ::testing::Test {
protected:
    void SetUp() override { ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1); }
    void TearDown() override {
        if (vi_) {
            EXPECT_EQ(Qn731XX_close(vi_), VI_SUCCESS);
        }
    }
    // A simulated session of `model`.
    void OpenSimulated(const char* model = "QMS4104B") {
        const std::string options = std::string("Simulate=true,DriverSetup=Model=") + model;
        ASSERT_EQ(Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE,
                                          options.c_str(), &vi_),
                  VI_SUCCESS)
            << RecordedError(0);
        ASSERT_NE(vi_, 0u);
    }

    ViSession vi_ = 0;
};

}  // namespace qn::test
