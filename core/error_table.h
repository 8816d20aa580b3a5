// The driver's message table: message numbers, code names, HRESULTs and
// message texts, compiled in and never changed.
#pragma once

#include <cstdint>
#include <span>

#include "Quorlen731XXIds.h"
#include "platform/com/types.h"

namespace qn {

struct ErrorEntry {
    std::uint32_t id;   // message number
    const char* name;   // code name, e.g. "E_IVI_INVALID_VALUE"
    HRESULT hr;         // result returned to the caller
    const char* text;   // message text after the "Quorlen731XX: " prefix
};

// Message numbers, named after the code they report.
enum class Msg : std::uint32_t {
    E_QUORLEN731XX_IO_GENERAL = 4,
    E_QUORLEN731XX_IO_TIMEOUT = 5,
    E_QUORLEN731XX_MODEL_NOT_SUPPORTED = 6,
    E_QUORLEN731XX_WRAPPED_DRIVER_ERROR = 7,
    E_QUORLEN731XX_MAX_TIME_EXCEEDED = 8,
    E_QUORLEN731XX_MEAS_CONFIG_ERROR = 9,
    E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT = 10,
    E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED = 11,
    E_QUORLEN731XX_SETTINGS_CONFLICT = 12,
    E_QUORLEN731XX_UNKNOWN_SOURCE = 13,
    E_QUORLEN731XX_CHANNEL_COUPLING = 14,
    E_QUORLEN731XX_VERTICAL_GROUND_COUPLING = 15,
    S_IVI_SUCCESS = 16,
    S_IVI_NSUP_ID_QUERY = 17,
    S_IVI_NSUP_RESET = 18,
    S_IVI_NSUP_SELF_TEST = 19,
    S_IVI_NSUP_ERROR_QUERY = 20,
    S_IVI_NSUP_REV_QUERY = 21,
    E_IVI_CANNOT_RECOVER = 22,
    E_IVI_INSTRUMENT_STATUS = 23,
    E_IVI_CANNOT_OPEN_FILE = 24,
    E_IVI_READING_FILE = 25,
    E_IVI_WRITING_FILE = 26,
    E_IVI_INVALID_PATHNAME = 27,
    E_IVI_INVALID_VALUE = 28,
    E_IVI_METHOD_NOT_SUPPORTED = 29,
    E_IVI_PROPERTY_NOT_SUPPORTED = 30,
    E_IVI_VALUE_NOT_SUPPORTED = 31,
    E_IVI_NOT_INITIALIZED = 32,
    E_IVI_UNKNOWN_CHANNEL_NAME = 33,
    E_IVI_TOO_MANY_OPEN_FILES = 34,
    E_IVI_CHANNEL_NAME_REQUIRED = 35,
    E_IVI_MISSING_OPTION_NAME = 36,
    E_IVI_MISSING_OPTION_VALUE = 37,
    E_IVI_BAD_OPTION_NAME = 38,
    E_IVI_BAD_OPTION_VALUE = 39,
    E_IVI_OUT_OF_MEMORY = 40,
    E_IVI_OPERATION_PENDING = 41,
    E_IVI_NULL_POINTER = 42,
    E_IVI_UNEXPECTED_RESPONSE = 43,
    E_IVI_FILE_NOT_FOUND = 44,
    E_IVI_INVALID_FILE_FORMAT = 45,
    E_IVI_STATUS_NOT_AVAILABLE = 46,
    E_IVI_ID_QUERY_FAILED = 47,
    E_IVI_RESET_FAILED = 48,
    E_IVI_RESOURCE_UNKNOWN = 49,
    E_IVI_ALREADY_INITIALIZED = 50,
    E_IVI_CANNOT_CHANGE_SIMULATION_STATE = 51,
    E_IVI_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR = 52,
    E_IVI_INVALID_RANGE_IN_SELECTOR = 53,
    E_IVI_UNKNOWN_NAME_IN_SELECTOR = 54,
    E_IVI_BADLY_FORMED_SELECTOR = 55,
    E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER = 56,
    S_IVISCOPE_INVALID_WFM_ELEMENT = 57,
    E_IVISCOPE_CHANNEL_NOT_ENABLED = 58,
    E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT = 59,
    E_IVISCOPE_MAX_TIME_EXCEEDED = 60,
    E_IVISCOPE_INVALID_ACQ_TYPE = 61,
};

inline constexpr const char* kMessagePrefix = "Quorlen731XX: ";
inline constexpr const char* kDriverProgId = kQuorlen731XXProgId;

// The entry of a message number, or null when the table has none.
const ErrorEntry* FindErrorEntry(std::uint32_t id);
inline const ErrorEntry* FindErrorEntry(Msg m) { return FindErrorEntry(static_cast<std::uint32_t>(m)); }
std::span<const ErrorEntry> ErrorTable();

}  // namespace qn
