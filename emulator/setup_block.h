// The instrument setup as the payload of the :SYST:SET block: every setting that *SAV stores,
// as "key=value" lines after a fixed first line, so a setup saved by one emulator restores the
// same settings in another.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "emulator/models.h"
#include "emulator/scope_state.h"

namespace qn::emu {

// Largest setup payload accepted (bytes).
inline constexpr std::size_t kMaxSetupBytes = 64 * 1024;

std::string EncodeSetup(const ScopeSettings& settings);
// The settings of a payload made by EncodeSetup for a model like `model`; nullopt when the
// payload is not a setup, misses a setting or holds a value the instrument cannot take.
std::optional<ScopeSettings> DecodeSetup(std::string_view payload, const ModelInfo& model);

}  // namespace qn::emu
