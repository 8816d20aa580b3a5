// The description of the calling thread's error information, taken (empty
// when there is none), for assertion messages and text checks.
#pragma once

#include <string>

#include "platform/com/errorinfo.h"

namespace qn::test {

inline std::string ErrorText() {
    com::ErrorRecord rec;
    return com::TakeThreadError(&rec) ? rec.description : std::string();
}

}  // namespace qn::test
