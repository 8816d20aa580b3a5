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

// A new simulated session of `model` (0 when it could not be opened); the
// caller has pointed the configuration store away.
inline ViSession SimulatedSession(const char* model = "QMS4104B") {
    const std::string options = std::string("Simulate=true,DriverSetup=Model=") + model;
    ViSession vi = 0;
    EXPECT_EQ(Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE,
                                      options.c_str(), &vi),
              VI_SUCCESS)
        << RecordedError(0);
    return vi;
}

class CSessionTest : public ::testing::Test {
protected:
    void SetUp() override { ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1); }
    void TearDown() override {
        if (vi_) {
            EXPECT_EQ(Qn731XX_close(vi_), VI_SUCCESS);
        }
    }
    void OpenSimulated(const char* model = "QMS4104B") {
        ASSERT_NE(vi_ = SimulatedSession(model), 0u);
    }

    ViSession vi_ = 0;
};

}  // namespace qn::test
