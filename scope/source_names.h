// Conversion between the driver's source names (repeated-capability names of
// the channel and digital-channel collections, "VAL_EXTERNAL") and the
// instrument's source names ("CHAN%i", "DIG%i", "EXT", "LINE"). Measurement
// sources, cursor sources and trigger sources all go through these two
// functions, so a name means the same thing wherever a caller gives it.
#pragma once

#include <string>
#include <string_view>

#include "core/node.h"
#include "platform/com/types.h"

namespace qn {

struct SourceNameRules {
    bool allow_digital = false;   // "UserDigitalChannel%d" gives "DIG%d"
    bool allow_external = false;  // "VAL_EXTERNAL" gives "EXT"
};

// Converts a driver source name to the instrument's name: a name of the
// analog channel collections (user or class-compliant, physical or virtual)
// gives "CHAN<n>" with its channel number; when allowed, a digital channel
// name gives "DIG<d>" with its zero-based index and "VAL_EXTERNAL" gives
// "EXT". Anything else fails with E_IVI_INVALID_VALUE ("VirtualToSCPI",
// "bstrVirtualSource", the name) reported through `node`.
HRESULT VirtualToSCPI(CDriverNode& node, std::string_view name, SourceNameRules rules,
                      std::string* scpi);

// Converts an instrument source name back to the driver's name: "EXT" gives
// "VAL_EXTERNAL", "LINE" gives "LINE", "CHAN<n>" gives "UserChannel<n>" (or
// "Channel<n>" when `class_compliant`), "DIG<d>" gives "UserDigitalChannel<d>";
// the result then goes through the session's virtual-name translation. Any
// other reply is returned unchanged (after the translation).
std::string SCPIToVirtual(const SessionCore& core, std::string_view scpi, bool class_compliant);

// True for the instrument source names SCPIToVirtual converts: "EXT", "LINE",
// "CHAN<n>" and "DIG<d>" with decimal digits.
bool IsInstrumentSourceName(std::string_view scpi);

}  // namespace qn
