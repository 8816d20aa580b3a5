// Runs a qn731xx command in-process with its stdout and stderr captured.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <span>
#include <string>
#include <vector>

#include "tools/json_output.h"

namespace qn::tools {

struct Result {
    int rc;
    std::string out;
    std::string err;
};

inline Result Invoke(int (*command)(std::span<char*>), std::vector<std::string> words) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    std::vector<char*> argv;
    for (std::string& w : words) argv.push_back(w.data());
    ::testing::internal::CaptureStdout();
    ::testing::internal::CaptureStderr();
    const int rc = command(argv);
    std::string out = ::testing::internal::GetCapturedStdout();
    std::string err = ::testing::internal::GetCapturedStderr();
    return {rc, out, err};
}

// The one JSON object a --json run printed (a discarded value, which fails
// every comparison, when the output is not exactly one object and a line feed).
inline Json OutputObject(const Result& r) {
    if (r.out.empty() || r.out.back() != '\n') return Json(Json::value_t::discarded);
    Json j = Json::parse(r.out, nullptr, false);
    return j.is_object() ? j : Json(Json::value_t::discarded);
}

}  // namespace qn::tools
