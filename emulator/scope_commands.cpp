// Oscilloscope subsystems: timebase, acquisition, channels, waveform transfer, run control.
#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

constexpr CommandSpec kScope[] = {
    {"AUToscale", nullptr, nullptr},
};

}  // namespace

std::span<const CommandSpec> ScopeCommands() {
    return kScope;
}

}  // namespace qn::emu
