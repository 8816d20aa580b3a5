// Method tracing: every interface call of a session, and every I/O manager
// operation made for it, recorded as one `Method` element of an XML document
// kept in memory and saved to a file periodically.
//
// CTracer holds the settings and the state; CTraceOwner (one per session)
// owns the document and the file; CMethodTrace records one call for the
// duration of its scope. Tracing never fails a traced call: its own failures
// are returned by the tracer operations that meet them and are swallowed by
// CMethodTrace.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "platform/com/types.h"
#include "platform/com/variant.h"

namespace pugi {
struct xml_node_struct;
}

namespace qn {

// Interface name recorded for I/O manager operations.
inline constexpr const char* kIOManagerTraceInterface = "CDriverIOManager";

enum class TraceDirection : std::uint8_t { In = 0, Out = 1, InOut = 2 };

// One parameter of a traced call. `value` points at where the value lives
// for the whole call (an argument, or the caller's out-variable): it is read
// at the start of the call for In/InOut and at the end for Out/InOut.
//   vt = VT_I2/VT_I4/VT_R8/VT_BOOL/VT_BSTR/...  value -> a value of that type
//   vt = VT_ARRAY                               value -> a SAFEARRAY* (may be null)
//   vt = VT_VARIANT                             value -> a VARIANT (its own type decides)
struct TraceParam {
    const char* name;
    TraceDirection direction;
    VARTYPE vt;
    const void* value;

    static constexpr TraceParam Short(const char* n, TraceDirection d, const SHORT* v) {
        return {n, d, VT_I2, v};
    }
    static constexpr TraceParam Long(const char* n, TraceDirection d, const LONG* v) {
        return {n, d, VT_I4, v};
    }
    static constexpr TraceParam Double(const char* n, TraceDirection d, const double* v) {
        return {n, d, VT_R8, v};
    }
    static constexpr TraceParam Bool(const char* n, TraceDirection d, const VARIANT_BOOL* v) {
        return {n, d, VT_BOOL, v};
    }
    static constexpr TraceParam String(const char* n, TraceDirection d, const BSTR* v) {
        return {n, d, VT_BSTR, v};
    }
    static constexpr TraceParam Array(const char* n, TraceDirection d, SAFEARRAY* const* v) {
        return {n, d, VT_ARRAY, v};
    }
    static constexpr TraceParam Variant(const char* n, TraceDirection d, const VARIANT* v) {
        return {n, d, VT_VARIANT, v};
    }
    static constexpr TraceParam Interface(const char* n, TraceDirection d, IUnknown* const* v) {
        return {n, d, VT_UNKNOWN, v};
    }
};

// Settings and state of method tracing, with their defaults.
class CTracer {
  public:
    static constexpr LONG kRecording = 0;
    static constexpr LONG kNotStarted = 1;
    static constexpr LONG kFull = 2;
    static constexpr std::size_t kMaxParams = 25;

    LONG GetState() const { return state_; }
    void SetState(LONG s) { state_ = s; }
    bool IsRecording() const { return state_ == kRecording; }
    bool GetEnabled() const { return enabled_; }
    LONG GetSizeLimit() const { return sizeLimit_; }
    void SetSizeLimit(LONG bytes) { sizeLimit_ = bytes; }
    bool GetTraceArrays() const { return traceArrays_; }
    void SetTraceArrays(bool on) { traceArrays_ = on; }
    LONG GetArrayLimit() const { return arrayLimit_; }
    void SetArrayLimit(LONG n) { arrayLimit_ = n; }
    LONG GetSaveInterval() const { return saveInterval_; }  // minutes
    void SetSaveInterval(LONG minutes) { saveInterval_ = minutes; }
    const std::string& GetTraceName() const { return traceName_; }
    const std::string& GetTransform() const { return transform_; }
    const std::string& GetFilePath() const { return filePath_; }
    std::int64_t GetLastSaveTime() const { return lastSave_; }

    // Seconds since the epoch; tests substitute a clock to control file
    // names, durations and the save interval.
    using Clock = std::int64_t (*)();
    void SetClock(Clock c) { clock_ = c; }
    std::int64_t Now() const;

  protected:
    LONG state_ = kNotStarted;
    bool enabled_ = false;
    LONG sizeLimit_ = 1000000;
    bool traceArrays_ = false;
    LONG arrayLimit_ = 10;
    LONG saveInterval_ = 1;
    std::string traceName_;
    std::string filePath_;
    std::string transform_;
    std::int64_t lastSave_ = 0;
    // What the last save wrote, and the calls recorded since: together they
    // estimate the document's size between saves.
    std::uintmax_t savedBytes_ = 0;
    std::uintmax_t savedRecords_ = 0;
    std::uintmax_t recordsSinceSave_ = 0;
    Clock clock_ = nullptr;
};

struct TraceDocument;  // the XML document of one trace file, shared by its tracers

// Owner of the trace document and file of one session.
class CTraceOwner : public CTracer {
  public:
    CTraceOwner();
    ~CTraceOwner();
    CTraceOwner(const CTraceOwner&) = delete;
    CTraceOwner& operator=(const CTraceOwner&) = delete;

    // Option hooks of DriverSetup ("Trace", "TraceName", "TraceTransform";
    // the numeric and TraceArray options use the CTracer setters).
    // Disabling releases the document without saving and stops recording.
    HRESULT SetEnabled(bool on);
    // Configuring the same name again keeps the file already in use.
    void SetTraceName(std::string_view name);
    void SetTraceTransform(std::string_view name) { transform_ = name; }

    // Opens or creates the trace file and starts recording (after
    // Initialize applied the options). S_FALSE when tracing is off or full;
    // E_UNEXPECTED when already recording.
    HRESULT StartSessionTracing();
    // Close of the session: saves when enabled, then stops recording so
    // that a later Initialize starts again (appending to the same file).
    HRESULT SaveOnClose();
    // Writes the document to the file; a file larger than the size limit
    // turns the state to full.
    HRESULT Save();
    // The save rule after each traced call: saves when at least the save
    // interval (minutes) has passed since the last save, or earlier when the
    // records made since would take the file past the size limit (so the
    // document in memory stays bounded by the limit, not by the interval).
    HRESULT OnCallEnd();

    const std::shared_ptr<TraceDocument>& Document() const { return doc_; }

    // The file path that an empty TraceName gives now:
    // <exe name>_<%Y-%m-%d_%H-%M-%S>.xml in the current directory.
    std::string DefaultFilePath() const;
    // The style-sheet path for the current TraceTransform.
    std::string StyleSheetPath() const;

  private:
    std::string ResolveFilePath() const;

    std::shared_ptr<TraceDocument> doc_;
};

// Records one call while it runs: constructed at the start of a traced call,
// destroyed at its end. When the tracer is not recording, construction only
// tests the state. `params` (at most 25 are used) must outlive the trace.
class CMethodTrace {
  public:
    CMethodTrace(CTraceOwner* tracer, const char* interfaceName, const char* methodName,
                 std::span<const TraceParam> params = {}) noexcept {
        if (tracer && tracer->IsRecording()) Begin(tracer, interfaceName, methodName, params);
    }
    ~CMethodTrace() {
        if (element_) End();
    }
    CMethodTrace(const CMethodTrace&) = delete;
    CMethodTrace& operator=(const CMethodTrace&) = delete;

  private:
    void Begin(CTraceOwner* tracer, const char* interfaceName, const char* methodName,
               std::span<const TraceParam> params) noexcept;
    void End() noexcept;

    CTraceOwner* tracer_ = nullptr;
    std::shared_ptr<TraceDocument> doc_;  // keeps the element alive for the call
    pugi::xml_node_struct* element_ = nullptr;
    std::span<const TraceParam> params_;
    std::int64_t start_ = 0;
};

}  // namespace qn
