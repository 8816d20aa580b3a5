// Standard SCPI / IEEE 488.2 error numbers and texts reported by the emulator.
#pragma once

namespace qn::emu {

struct ScpiError {
    int code;
    const char* text;
};

namespace err {
inline constexpr ScpiError kCommand{-100, "Command error"};
inline constexpr ScpiError kInvalidCharacter{-101, "Invalid character"};
inline constexpr ScpiError kSyntax{-102, "Syntax error"};
inline constexpr ScpiError kDataType{-104, "Data type error"};
inline constexpr ScpiError kParameterNotAllowed{-108, "Parameter not allowed"};
inline constexpr ScpiError kMissingParameter{-109, "Missing parameter"};
inline constexpr ScpiError kUndefinedHeader{-113, "Undefined header"};
inline constexpr ScpiError kSuffixOutOfRange{-114, "Header suffix out of range"};
inline constexpr ScpiError kInvalidBlock{-161, "Invalid block data"};
inline constexpr ScpiError kExecution{-200, "Execution error"};
inline constexpr ScpiError kSettingsConflict{-221, "Settings conflict"};
inline constexpr ScpiError kDataOutOfRange{-222, "Data out of range"};
inline constexpr ScpiError kDataCorrupt{-230, "Data corrupt or stale"};
inline constexpr ScpiError kIllegalParameter{-224, "Illegal parameter value"};
inline constexpr ScpiError kHardwareMissing{-241, "Hardware missing"};
inline constexpr ScpiError kQueueOverflow{-350, "Queue overflow"};
inline constexpr ScpiError kInputBufferOverrun{-363, "Input buffer overrun"};
inline constexpr ScpiError kQueryInterrupted{-410, "Query INTERRUPTED"};
}  // namespace err

}  // namespace qn::emu
