// Byte-order reversal of binary-block elements. The whole block goes through
// this loop once, so it is built to vectorise (see platform/visa/CMakeLists.txt)
// and, where the processor has them, with 256-bit vectors.
#include <cstdint>
#include <cstring>

#include "platform/visa/formatted_convert.h"

namespace qn::visa::fmt {

#if defined(__x86_64__) && !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
#define QN_SWAP_CLONES __attribute__((target_clones("avx2", "default")))
#else
#define QN_SWAP_CLONES
#endif

QN_SWAP_CLONES void SwapBytes(void* data, std::size_t bytes, std::size_t elem) {
    auto* p = static_cast<unsigned char*>(data);
    const std::size_t n = bytes / elem;
    if (elem == 2) {
        // Byte pairs exchanged one by one: a form the vectoriser turns into
        // byte shuffles (a rotate of each 16-bit word stays scalar).
        for (std::size_t i = 0; i < n; ++i) {
            const unsigned char a = p[2 * i], b = p[2 * i + 1];
            p[2 * i] = b;
            p[2 * i + 1] = a;
        }
    } else if (elem == 4) {
        for (std::size_t i = 0; i < n; ++i) {
            std::uint32_t x;
            std::memcpy(&x, p + 4 * i, 4);
            x = __builtin_bswap32(x);
            std::memcpy(p + 4 * i, &x, 4);
        }
    } else if (elem == 8) {
        for (std::size_t i = 0; i < n; ++i) {
            std::uint64_t x;
            std::memcpy(&x, p + 8 * i, 8);
            x = __builtin_bswap64(x);
            std::memcpy(p + 8 * i, &x, 8);
        }
    }
}

}  // namespace qn::visa::fmt
