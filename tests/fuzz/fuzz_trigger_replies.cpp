// Fuzzes the trigger reply parsers with arbitrary instrument replies: the TV
// mode normalisation and the fields of quoted, comma-separated range
// replies. None may crash, hang or read out of bounds.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "scope/trigger_tokens.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string_view text(reinterpret_cast<const char*>(data), size);

    const std::string mode = qn::NormalizeTvModeReply(text);
    if (mode.size() > size) __builtin_trap();
    (void)qn::TvEventTokens().ValueOf("", mode);

    for (std::size_t field = 0; field < 3; ++field) {
        const auto v = qn::NumericReplyField(text, field);
        // A field exists only where the reply has that many commas.
        std::size_t commas = 0;
        for (char c : text) commas += c == ',';
        if (v && field > commas) __builtin_trap();
    }
    return 0;
}
