// The screen image that :DISP:DATA? BMP,SCR returns: a 24-bit Windows bitmap of the graticule
// and the traces of the displayed analog channels, drawn from the acquired record.
#pragma once

#include <string>

#include "emulator/models.h"
#include "emulator/scope_state.h"

namespace qn::emu {

inline constexpr int kScreenWidth = 640;
inline constexpr int kScreenHeight = 480;

// The whole file: BITMAPFILEHEADER, BITMAPINFOHEADER, bottom-up rows of BGR pixels.
std::string RenderScreenBitmap(const ScopeSettings& settings, const AcquiredRecord& record);

}  // namespace qn::emu
