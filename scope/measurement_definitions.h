// The measurement settings the instrument holds as whole definitions: the
// reference levels with their mode, the delay edges, and the measurement
// sources. Writing part of a definition reads the rest from the instrument
// first, so the parts not given keep their values. Traffic and failures go
// through the node given (the object whose member is running).
#pragma once

#include <optional>
#include <string>

#include "Quorlen731XXEnums.h"
#include "core/node.h"

namespace qn {

// The reference levels and their mode (":MEAS:DEF? THR"). Any output may be
// null. A mode token outside the table fails with E_IVI_UNEXPECTED_RESPONSE
// after the levels were delivered.
HRESULT GetThresholds(CDriverNode& node, LONG* mode, double* high, double* mid, double* low);

// Writes the threshold definition; the parts not given are read first.
struct ThresholdUpdate {
    std::optional<LONG> mode{};
    std::optional<double> low{}, mid{}, high{};
};
HRESULT PutThreshDefine(CDriverNode& node, const ThresholdUpdate& update);

// The delay edges as slope and occurrence (":MEAS:DEF? DEL"); any output
// may be null.
struct DelayEdges {
    LONG slope1 = Quorlen731XXMeasurementSlopePositive;
    LONG slope2 = Quorlen731XXMeasurementSlopePositive;
    LONG occurrence1 = 0;
    LONG occurrence2 = 0;
};
HRESULT GetDelayDefinition(CDriverNode& node, DelayEdges* edges);

// Writes the delay definition (":MEAS:DEL", ":MEAS:CLE", then the two
// signed edge numbers); the parts not given are read first.
struct DelayUpdate {
    std::optional<LONG> slope1{}, slope2{}, occurrence1{}, occurrence2{};
};
HRESULT SetDelayDefinition(CDriverNode& node, const DelayUpdate& update);

// The instrument's measurement sources (":MEAS:SOUR?"); the second is empty
// when the instrument holds one. Any output may be null.
HRESULT GetSCPIMeasurementSources(CDriverNode& node, std::string* first, std::string* second);

// Sets the measurement sources: without a first source the instrument's
// current one is kept; a second source must be an analog channel
// (E_IVI_INVALID_VALUE otherwise, before anything is sent).
HRESULT PutSCPIMeasurementSources(CDriverNode& node, const std::optional<std::string>& first,
                                  const std::optional<std::string>& second);

}  // namespace qn
