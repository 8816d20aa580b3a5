// The driver's message table: one row per message number with its code name,
// HRESULT and text (after the "Quorlen731XX: " prefix). %1..%3 are inserts.
#include "core/error_table.h"

#include <algorithm>
#include <array>

#include "Quorlen731XXErrors.h"

namespace qn {

namespace {

constexpr std::array kTable = {
    ErrorEntry{4, "E_QUORLEN731XX_IO_GENERAL", E_QUORLEN731XX_IO_GENERAL, "IO error: %1."},
    ErrorEntry{5, "E_QUORLEN731XX_IO_TIMEOUT", E_QUORLEN731XX_IO_TIMEOUT, "IO timeout error: %1."},
    ErrorEntry{6, "E_QUORLEN731XX_MODEL_NOT_SUPPORTED", E_QUORLEN731XX_MODEL_NOT_SUPPORTED, "Instrument model does not support this feature: %1."},
    ErrorEntry{7, "E_QUORLEN731XX_WRAPPED_DRIVER_ERROR", E_QUORLEN731XX_WRAPPED_DRIVER_ERROR, "Error in call to wrapped driver: ViStatus = %1."},
    ErrorEntry{8, "E_QUORLEN731XX_MAX_TIME_EXCEEDED", E_QUORLEN731XX_MAX_TIME_EXCEEDED, "%1 Max time exceeded."},
    ErrorEntry{9, "E_QUORLEN731XX_MEAS_CONFIG_ERROR", E_QUORLEN731XX_MEAS_CONFIG_ERROR, "Measurement configuration error: %s"},
    ErrorEntry{10, "E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT", E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT, "At least one element in the retrieved waveform was invalid."},
    ErrorEntry{11, "E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED", E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED, "Property is not supported."},
    ErrorEntry{12, "E_QUORLEN731XX_SETTINGS_CONFLICT", E_QUORLEN731XX_SETTINGS_CONFLICT, "Settings Conflict."},
    ErrorEntry{13, "E_QUORLEN731XX_UNKNOWN_SOURCE", E_QUORLEN731XX_UNKNOWN_SOURCE, "Unknown source name."},
    ErrorEntry{14, "E_QUORLEN731XX_CHANNEL_COUPLING", E_QUORLEN731XX_CHANNEL_COUPLING, "Quorlen731XXVerticalCouplingGnd passed as the value for property put_Coupling."},
    ErrorEntry{15, "E_QUORLEN731XX_VERTICAL_GROUND_COUPLING", E_QUORLEN731XX_VERTICAL_GROUND_COUPLING, "Does not support this class-compliant feature: (enumeration) value Quorlen731XXVerticalCouplingGnd passed as the value for property put_Coupling."},
    ErrorEntry{16, "S_IVI_SUCCESS", S_IVI_SUCCESS, "Success."},
    ErrorEntry{17, "S_IVI_NSUP_ID_QUERY", S_IVI_NSUP_ID_QUERY, "ID Query is not supported by this instrument."},
    ErrorEntry{18, "S_IVI_NSUP_RESET", S_IVI_NSUP_RESET, "Reset is not supported by this instrument."},
    ErrorEntry{19, "S_IVI_NSUP_SELF_TEST", S_IVI_NSUP_SELF_TEST, "Self test is not supported by this instrument."},
    ErrorEntry{20, "S_IVI_NSUP_ERROR_QUERY", S_IVI_NSUP_ERROR_QUERY, "Error query is not supported by this instrument."},
    ErrorEntry{21, "S_IVI_NSUP_REV_QUERY", S_IVI_NSUP_REV_QUERY, "Firmware revision query is not supported by this instrument."},
    ErrorEntry{22, "E_IVI_CANNOT_RECOVER", E_IVI_CANNOT_RECOVER, "Failure cannot recover."},
    ErrorEntry{23, "E_IVI_INSTRUMENT_STATUS", E_IVI_INSTRUMENT_STATUS, "Instrument error detected.  Use ErrorQuery() to determine the error(s)."},
    ErrorEntry{24, "E_IVI_CANNOT_OPEN_FILE", E_IVI_CANNOT_OPEN_FILE, "Cannot open file."},
    ErrorEntry{25, "E_IVI_READING_FILE", E_IVI_READING_FILE, "Error reading file."},
    ErrorEntry{26, "E_IVI_WRITING_FILE", E_IVI_WRITING_FILE, "Error writing file."},
    ErrorEntry{27, "E_IVI_INVALID_PATHNAME", E_IVI_INVALID_PATHNAME, "The pathname is invalid."},
    ErrorEntry{28, "E_IVI_INVALID_VALUE", E_IVI_INVALID_VALUE, "Invalid value (%1) for method %2, parameter %3."},
    ErrorEntry{29, "E_IVI_METHOD_NOT_SUPPORTED", E_IVI_METHOD_NOT_SUPPORTED, "Does not support this class-compliant feature: method %1"},
    ErrorEntry{30, "E_IVI_PROPERTY_NOT_SUPPORTED", E_IVI_PROPERTY_NOT_SUPPORTED, "Does not support this class-compliant feature: property %1."},
    ErrorEntry{31, "E_IVI_VALUE_NOT_SUPPORTED", E_IVI_VALUE_NOT_SUPPORTED, "Does not support this class-compliant feature:  (enumeration) value %1 passed as the value for parameter %2 in method %3."},
    ErrorEntry{32, "E_IVI_NOT_INITIALIZED", E_IVI_NOT_INITIALIZED, "A connection to the instrument has not been established."},
    ErrorEntry{33, "E_IVI_UNKNOWN_CHANNEL_NAME", E_IVI_UNKNOWN_CHANNEL_NAME, "Unknown channel name."},
    ErrorEntry{34, "E_IVI_TOO_MANY_OPEN_FILES", E_IVI_TOO_MANY_OPEN_FILES, "Too many files are open."},
    ErrorEntry{35, "E_IVI_CHANNEL_NAME_REQUIRED", E_IVI_CHANNEL_NAME_REQUIRED, "A channel name is required."},
    ErrorEntry{36, "E_IVI_MISSING_OPTION_NAME", E_IVI_MISSING_OPTION_NAME, "The option string is missing an option name."},
    ErrorEntry{37, "E_IVI_MISSING_OPTION_VALUE", E_IVI_MISSING_OPTION_VALUE, "The option string is missing an option value."},
    ErrorEntry{38, "E_IVI_BAD_OPTION_NAME", E_IVI_BAD_OPTION_NAME, "The %1 name in the option string is unknown."},
    ErrorEntry{39, "E_IVI_BAD_OPTION_VALUE", E_IVI_BAD_OPTION_VALUE, "The %1 value in the option string is unknown."},
    ErrorEntry{40, "E_IVI_OUT_OF_MEMORY", E_IVI_OUT_OF_MEMORY, "Could not allocate necessary memory."},
    ErrorEntry{41, "E_IVI_OPERATION_PENDING", E_IVI_OPERATION_PENDING, "Operation in progress."},
    ErrorEntry{42, "E_IVI_NULL_POINTER", E_IVI_NULL_POINTER, "Null pointer passed for method %1, parameter %2."},
    ErrorEntry{43, "E_IVI_UNEXPECTED_RESPONSE", E_IVI_UNEXPECTED_RESPONSE, "Unexpected response from instrument."},
    ErrorEntry{44, "E_IVI_FILE_NOT_FOUND", E_IVI_FILE_NOT_FOUND, "File not found."},
    ErrorEntry{45, "E_IVI_INVALID_FILE_FORMAT", E_IVI_INVALID_FILE_FORMAT, "Invalid file format."},
    ErrorEntry{46, "E_IVI_STATUS_NOT_AVAILABLE", E_IVI_STATUS_NOT_AVAILABLE, "The instrument status is not available."},
    ErrorEntry{47, "E_IVI_ID_QUERY_FAILED", E_IVI_ID_QUERY_FAILED, "Instrument ID query failed."},
    ErrorEntry{48, "E_IVI_RESET_FAILED", E_IVI_RESET_FAILED, "Instrument reset failed."},
    ErrorEntry{49, "E_IVI_RESOURCE_UNKNOWN", E_IVI_RESOURCE_UNKNOWN, "Unknown resource."},
    ErrorEntry{50, "E_IVI_ALREADY_INITIALIZED", E_IVI_ALREADY_INITIALIZED, "The driver is already initialized."},
    ErrorEntry{51, "E_IVI_CANNOT_CHANGE_SIMULATION_STATE", E_IVI_CANNOT_CHANGE_SIMULATION_STATE, "The simulation state cannot be changed."},
    ErrorEntry{52, "E_IVI_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR", E_IVI_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR, "The number of levels in the selector is not valid for the %1 repeated capability."},
    ErrorEntry{53, "E_IVI_INVALID_RANGE_IN_SELECTOR", E_IVI_INVALID_RANGE_IN_SELECTOR, "The range %1 is not valid for the repeated capability %2."},
    ErrorEntry{54, "E_IVI_UNKNOWN_NAME_IN_SELECTOR", E_IVI_UNKNOWN_NAME_IN_SELECTOR, "Unknown name in selector."},
    ErrorEntry{55, "E_IVI_BADLY_FORMED_SELECTOR", E_IVI_BADLY_FORMED_SELECTOR, "The repeated capability selector is badly-formed."},
    ErrorEntry{56, "E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER", E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER, "Unknown physical repeated capability selector."},
    ErrorEntry{57, "S_IVISCOPE_INVALID_WFM_ELEMENT", S_IVISCOPE_INVALID_WFM_ELEMENT, "One of the elements in the waveform array is invalid."},
    ErrorEntry{58, "E_IVISCOPE_CHANNEL_NOT_ENABLED", E_IVISCOPE_CHANNEL_NOT_ENABLED, "Specified channel is not enabled."},
    ErrorEntry{59, "E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT", E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT, "Unable to perform desired measurement operation."},
    ErrorEntry{60, "E_IVISCOPE_MAX_TIME_EXCEEDED", E_IVISCOPE_MAX_TIME_EXCEEDED, "Maximum time exceeded before the operation completed."},
    ErrorEntry{61, "E_IVISCOPE_INVALID_ACQ_TYPE", E_IVISCOPE_INVALID_ACQ_TYPE, "Invalid acquisition type."},
};

}  // namespace

const ErrorEntry* FindErrorEntry(std::uint32_t id) {
    // Ids are dense from the first entry on; the check keeps that an assumption, not a trap.
    std::uint32_t first = kTable.front().id;
    if (id < first || id - first >= kTable.size()) return nullptr;
    const ErrorEntry& e = kTable[id - first];
    return e.id == id ? &e : nullptr;
}

std::span<const ErrorEntry> ErrorTable() { return kTable; }

}  // namespace qn
