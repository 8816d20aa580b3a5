// The in-memory XML document of one trace file (internal to the tracer).
// Sessions of one process that trace into the same file share one document,
// so that each save writes the records of all of them; the mutex serialises
// sessions that run on different threads.
#pragma once

#include <cstdint>
#include <mutex>
#include <pugixml.hpp>
#include <string>

namespace qn {

struct TraceDocument {
    std::mutex mutex;
    std::string path;
    pugi::xml_document doc;
    pugi::xml_node records;  // the TraceRecords root element
};

// Local time of `t` (seconds since the epoch) as "%H:%M:%S", and as
// "%Y-%m-%d_%H-%M-%S" for file names.
std::string LocalTimeOfDay(std::int64_t t);
std::string LocalFileTimeStamp(std::int64_t t);

}  // namespace qn
