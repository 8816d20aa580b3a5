#include "tools/json_output.h"

#include <cstdio>

namespace qn::tools {

void PrintJson(const Json& j) {
    const std::string text = j.dump(-1, ' ', false, Json::error_handler_t::replace);
    std::printf("%s\n", text.c_str());
}

}  // namespace qn::tools
