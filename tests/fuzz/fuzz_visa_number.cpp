// Number parser: consumed text stays within the input, and a number that
// was complete stays the same when more text is appended after a separator.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/visa/ieee488.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using namespace qn::visa;
    std::string_view text(reinterpret_cast<const char*>(data), size);
    double v = 0;
    std::size_t used = 0;
    NumberParse r = ParseNumber(text, true, &v, &used);
    if (r != NumberParse::kOk) return 0;
    if (used == 0 || used > size) std::abort();
    std::string more(text);
    more += ",1";
    double w = 0;
    std::size_t used2 = 0;
    if (ParseNumber(more, false, &w, &used2) != NumberParse::kOk || used2 != used) std::abort();
    if (std::memcmp(&v, &w, sizeof v) != 0 && !(std::isnan(v) && std::isnan(w))) std::abort();
    return 0;
}
