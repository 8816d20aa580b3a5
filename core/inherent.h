// Fixed identity values of the driver and the small helpers of the inherent
// IVI operations.
#pragma once

#include <string>
#include <string_view>

#include "core/session_core.h"
#include "platform/com/types.h"

namespace qn {

inline constexpr std::string_view kDriverDescription =
    "IVI Driver for Quorlen 731XX, 7312X, 3XXX, 2XXX and 4XXX family of Oscilloscopes";
inline constexpr std::string_view kDriverIdentifier = "Quorlen731XX";
inline constexpr std::string_view kDriverRevision = "1.3.20.0";
inline constexpr std::string_view kDriverVendor = "Quorlen Technologies";
inline constexpr LONG kSpecificationMajorVersion = 3;
inline constexpr LONG kSpecificationMinorVersion = 0;

// Instrument commands of the utility operations.
inline constexpr std::string_view kIdentityQuery = "*IDN?";
inline constexpr std::string_view kErrorQueryCommand = "SYST:ERR?";
inline constexpr std::string_view kClearStatusCommand = "*CLS";
inline constexpr std::string_view kResetCommand = "*RST;*OPC?";
inline constexpr std::string_view kSelfTestCommand = "*TST?";
inline constexpr long kResetTimeoutMs = 30000;

// Session flags in the order ResetWithDefaults applies them.
enum SessionFlagId : int {
    kFlagCache,
    kFlagInterchangeCheck,
    kFlagQueryInstrumentStatus,
    kFlagRangeCheck,
    kFlagRecordCoercions,
    kFlagSimulate,
    kFlagCount
};
bool SessionFlags::*FlagMember(int which);

std::string GroupCapabilities();
const std::string& SupportedInstrumentModels();
std::string InstrumentManufacturer(const SessionCore& core);
std::string InstrumentFirmwareRevision(const SessionCore& core);

// Parses a "SYST:ERR?" reply of the form  <integer>,"<message>" ; the
// message ends at the next double or single quote. False when either field
// is missing.
bool ParseErrorQueryReply(std::string_view reply, long* code, std::string* message);

}  // namespace qn
