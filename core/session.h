// The session state held by the root object: the six session flags and their
// snapshot, the identity, the resource names, the option tables and the
// trace settings. Touched only under the session lock.
#pragma once

#include <map>
#include <string>
#include <variant>

namespace qn {

struct SessionFlags {
    bool cache = true;
    bool interchange_check = false;
    bool query_instrument_status = false;
    bool range_check = true;
    bool record_coercions = false;
    bool simulate = false;
};

struct InstrumentIdentity {
    std::string reply;  // the whole "*IDN?" reply
    std::string manufacturer;
    std::string model;
    std::string serial_number;
    std::string firmware_revision;
    bool known = false;
};

// Trace options as given in DriverSetup; the tracer takes them at Initialize.
struct TraceSettings {
    bool enabled = false;
    bool enabled_given = false;  // "Trace" appeared in a DriverSetup text
    std::string name;
    long size_max = 1000000;
    bool arrays = false;
    long array_size_max = 10;
    long save_interval = 1;  // minutes
    std::string transform;
};

// A configurable initial setting: String, Integer, Real or Boolean.
using InitialSetting = std::variant<std::string, long, double, bool>;

struct DriverSession {
    SessionFlags flags;
    SessionFlags snapshot;  // taken by every Initialize after all options applied
    bool initialized = false;

    std::string option_string;
    std::string logical_name;
    std::string io_resource_descriptor;
    std::string driver_setup;
    std::string model;  // instrument model string; decides model-dependent behaviour
    InstrumentIdentity identity;

    std::map<std::string, std::string> init_options;          // lower-case name -> value
    std::map<std::string, std::string> driver_setup_options;  // lower-case name -> value
    std::map<std::string, InitialSetting> initial_settings;   // lower-case name -> value
    TraceSettings trace;
};

}  // namespace qn
