// The parameters of the configurable measurements that the session keeps
// for the time-of-edge, time-at-value and value-at-time measurements. They
// are never sent on their own: each measurement puts them into its query.
#pragma once

#include "Quorlen731XXEnums.h"

namespace qn {

// A new session starts with the first rising edge, a level of 1 (in the
// source's units) and the time 0 (the trigger point).
struct MeasurementSettings {
    LONG time_at_edge_occurrence = 1;
    Quorlen731XXMeasurementSlopeEnum time_at_edge_slope = Quorlen731XXMeasurementSlopePositive;
    LONG time_at_value_occurrence = 1;
    Quorlen731XXMeasurementSlopeEnum time_at_value_slope = Quorlen731XXMeasurementSlopePositive;
    double time_at_value_level = 1.0;
    double value_at_time_time = 0.0;
};

// The occurrence as the instrument counts it: negative for falling edges.
// An occurrence below 1 is never negated (there is no edge number -0).
inline LONG SignedEdge(Quorlen731XXMeasurementSlopeEnum slope, LONG occurrence) {
    return slope == Quorlen731XXMeasurementSlopeNegative && occurrence >= 1 ? -occurrence
                                                                           : occurrence;
}

}  // namespace qn
