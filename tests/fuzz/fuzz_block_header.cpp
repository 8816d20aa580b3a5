// Block-header parser: the declared length never exceeds the bound, the
// header size never exceeds the input, and a prefix of a valid header asks
// for more instead of failing.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "platform/visa/ieee488.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using namespace qn::visa;
    std::string_view bytes(reinterpret_cast<const char*>(data), size);
    constexpr std::uint64_t kMax = 1 << 20;
    BlockHeader h;
    BlockParse r = ParseBlockHeader(bytes, kMax, &h);
    if (r != BlockParse::kOk) return 0;
    if (h.header_size > size || h.length > kMax) std::abort();
    for (std::size_t n = 0; n < h.header_size; ++n) {
        BlockHeader p;
        if (ParseBlockHeader(bytes.substr(0, n), kMax, &p) != BlockParse::kNeedMore &&
            !(n == h.header_size))
            std::abort();
    }
    return 0;
}
