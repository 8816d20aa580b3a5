#include <unistd.h>

#include <algorithm>
#include <cstdio>

#include "services/trace_document.h"
#include "services/trace_value.h"
#include "services/tracer.h"

namespace qn {
namespace {

const char* DirectionText(TraceDirection d) {
    switch (d) {
        case TraceDirection::In:
            return "In";
        case TraceDirection::Out:
            return "Out";
        case TraceDirection::InOut:
            return "InOut";
    }
    return "In";
}

// The local time of day of `t`, formatted once per second and thread.
const char* TimeOfDay(std::int64_t t) {
    thread_local std::int64_t last = -1;
    thread_local std::string text;
    if (t != last || text.empty()) {
        text = LocalTimeOfDay(t);
        last = t;
    }
    return text.c_str();
}

void AddArray(pugi::xml_node e, SAFEARRAY* psa, const CTracer& tracer) {
    TraceArrayText a = DescribeTraceArray(psa, tracer.GetTraceArrays(), tracer.GetArrayLimit());
    e.append_attribute("NumDims") = a.numDims;
    e.append_attribute("DimSizes") = a.dimSizes.c_str();
    for (const std::string& v : a.elements)
        e.append_child("Element").append_attribute("Value") = v.c_str();
}

void AddParameter(pugi::xml_node method, const TraceParam& p, const CTracer& tracer) {
    pugi::xml_node e = method.append_child("Parameter");
    e.append_attribute("Name") = p.name ? p.name : "";
    e.append_attribute("Direction") = DirectionText(p.direction);
    const VARIANT* v = p.vt == VT_VARIANT ? static_cast<const VARIANT*>(p.value) : nullptr;
    if (p.vt & VT_ARRAY) {
        AddArray(e, p.value ? *static_cast<SAFEARRAY* const*>(p.value) : nullptr, tracer);
    } else if (v && (v->vt & VT_ARRAY)) {
        AddArray(e, (v->vt & VT_BYREF) ? (v->pparray ? *v->pparray : nullptr) : v->parray, tracer);
    } else {
        std::string text = v ? FormatTraceVariant(*v) : FormatTraceValue(p.vt, p.value);
        e.append_attribute("Value") = text.c_str();
    }
}

void AddParameters(pugi::xml_node method, std::span<const TraceParam> params, bool atStart,
                   const CTracer& tracer) {
    for (const TraceParam& p : params) {
        bool in = p.direction != TraceDirection::Out;
        bool out = p.direction != TraceDirection::In;
        if (atStart ? in : out) AddParameter(method, p, tracer);
    }
}

}  // namespace

void CMethodTrace::Begin(CTraceOwner* tracer, const char* interfaceName, const char* methodName,
                         std::span<const TraceParam> params) noexcept {
    try {
        std::shared_ptr<TraceDocument> doc = tracer->Document();
        if (!doc) return;
        std::int64_t now = tracer->Now();
        params = params.first(std::min(params.size(), CTracer::kMaxParams));
        std::lock_guard lock(doc->mutex);
        pugi::xml_node m = doc->records.append_child("Method");
        if (!m) return;
        m.append_attribute("Name") = methodName ? methodName : "";
        m.append_attribute("Interface") = interfaceName ? interfaceName : "";
        m.append_attribute("StartTime") = TimeOfDay(now);
        m.append_attribute("Thread") = static_cast<int>(gettid());
        AddParameters(m, params, true, *tracer);
        tracer_ = tracer;
        doc_ = std::move(doc);
        element_ = m.internal_object();
        params_ = params;
        start_ = now;
    } catch (...) {
        // Tracing never fails the traced call.
    }
}

void CMethodTrace::End() noexcept {
    try {
        std::int64_t now = tracer_->Now();
        {
            std::lock_guard lock(doc_->mutex);
            pugi::xml_node m(element_);
            m.append_attribute("EndTime") = TimeOfDay(now);
            // The whole elapsed time in seconds (a call of 75 s shows 75).
            long elapsed = static_cast<long>(std::max<std::int64_t>(now - start_, 0));
            char buf[32];
            std::snprintf(buf, sizeof buf, "%02ld", elapsed);
            m.append_attribute("ExecutionTime") = buf;
            AddParameters(m, params_, false, *tracer_);
        }
        tracer_->OnCallEnd();
    } catch (...) {
        // Tracing never fails the traced call.
    }
    element_ = nullptr;
    doc_.reset();
}

}  // namespace qn
