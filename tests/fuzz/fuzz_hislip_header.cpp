// HiSLIP headers on arbitrary bytes: every 16-byte window is decoded, and
// what decodes re-encodes to the same bytes; the names and texts of any code
// are looked up.
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "platform/visa/hislip_protocol.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using namespace qn::hislip;
    for (std::size_t off = 0; off + kHeaderSize <= size; ++off) {
        Header h;
        if (!DecodeHeader(data + off, &h)) continue;
        std::uint8_t again[kHeaderSize];
        EncodeHeader(h, again);
        if (std::memcmp(again, data + off, kHeaderSize) != 0) __builtin_trap();
        (void)MessageTypeName(h.type);
        (void)ErrorCodeText(h.control);
        (void)FatalCodeText(h.control);
    }
    std::uint64_t v = 0;
    if (DecodeSize(std::string_view(reinterpret_cast<const char*>(data), size), &v) &&
        EncodeSize(v) != std::string_view(reinterpret_cast<const char*>(data), size))
        __builtin_trap();
    return 0;
}
