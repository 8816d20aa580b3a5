// Resource-string parser: any bytes parse or fail, never crash; a parsed
// resource prints a canonical form that parses to itself.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "platform/visa/resource_name.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string_view text(reinterpret_cast<const char*>(data), size);
    std::string error;
    auto r = qn::visa::ParseResourceName(text, &error);
    if (!r) return 0;
    auto again = qn::visa::ParseResourceName(r->Canonical());
    if (!again || again->Canonical() != r->Canonical()) std::abort();
    return 0;
}
