// libFuzzer target: the waveform preamble parser and the conversion of a
// record scaled by whatever it accepted. Accepted scaling factors must be
// finite and the conversion must match the plain formula or give NaN.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string_view>
#include <vector>

#include "scope/waveform_scaling.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    qn::WaveformScaling s;
    if (!qn::ParsePreamble(text, &s)) return 0;
    if (!std::isfinite(s.x_increment) || !std::isfinite(s.x_origin) ||
        !std::isfinite(s.y_increment) || !std::isfinite(s.y_origin))
        std::abort();
    // The input bytes, taken as words, converted with the accepted scaling.
    std::vector<std::int16_t> raw(size / 2);
    if (!raw.empty()) std::memcpy(raw.data(), data, raw.size() * 2);
    std::vector<double> out(raw.size());
    const bool invalid = qn::ConvertWords(raw.data(), raw.size(), s, out.data());
    bool seen = false;
    for (std::size_t i = 0; i < raw.size(); ++i) {
        if (raw[i] == qn::kInvalidWord) {
            seen = true;
            if (!std::isnan(out[i])) std::abort();
        }
    }
    if (seen != invalid) std::abort();
    return 0;
}
