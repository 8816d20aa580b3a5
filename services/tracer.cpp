#include "services/tracer.h"

#include <algorithm>

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <map>
#include <new>

#include "services/trace_document.h"

namespace fs = std::filesystem;

namespace qn {
namespace {

bool HasExtension(const fs::path& p, std::string_view ext) {
    std::string e = p.extension().string();
    if (e.size() != ext.size()) return false;
    for (std::size_t i = 0; i < e.size(); ++i) {
        char c = e[i];
        if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
        if (c != ext[i]) return false;
    }
    return true;
}

std::string ExecutableFileName() {
    char buf[4096];
    ssize_t n = readlink("/proc/self/exe", buf, sizeof buf - 1);
    if (n <= 0) return "Unknown.exe";
    std::string name = fs::path(std::string(buf, static_cast<std::size_t>(n))).filename().string();
    return name.empty() ? "Unknown.exe" : name;
}

// A processing instruction ends at the first "?>": keep the path from
// ending it early.
std::string PiSafe(std::string s) {
    for (std::size_t i = s.find("?>"); i != std::string::npos; i = s.find("?>", i))
        s.replace(i, 2, "?%3E");
    return s;
}

// Documents of the trace files this process has open, by file path.
std::mutex& RegistryMutex() {
    static std::mutex m;
    return m;
}
std::map<std::string, std::weak_ptr<TraceDocument>>& Registry() {
    static std::map<std::string, std::weak_ptr<TraceDocument>> r;
    return r;
}

// Loads the existing file or builds a new document. A file that exists but
// is not a trace file is left alone and reported (E_FAIL), rather than
// overwritten.
HRESULT LoadOrCreate(TraceDocument& d, const std::string& styleSheet) {
    std::error_code ec;
    if (fs::exists(d.path, ec)) {
        auto flags = pugi::parse_default | pugi::parse_declaration | pugi::parse_pi;
        if (!d.doc.load_file(d.path.c_str(), flags)) return E_FAIL;
        d.records = d.doc.child("TraceRecords");
        return d.records ? S_OK : E_FAIL;
    }
    pugi::xml_node decl = d.doc.append_child(pugi::node_declaration);
    decl.append_attribute("version") = "1.0";
    pugi::xml_node pi = d.doc.append_child(pugi::node_pi);
    pi.set_name("xml-stylesheet");
    std::string data = R"(type="text/xsl" href="file:\\)" + PiSafe(styleSheet) + "\"";
    pi.set_value(data.c_str());
    d.records = d.doc.append_child("TraceRecords");
    return d.records ? S_OK : E_OUTOFMEMORY;
}

HRESULT OpenShared(const std::string& path, const std::string& styleSheet,
                   std::shared_ptr<TraceDocument>* out) {
    std::lock_guard lock(RegistryMutex());
    auto& reg = Registry();
    std::erase_if(reg, [](const auto& kv) { return kv.second.expired(); });
    if (auto it = reg.find(path); it != reg.end()) {
        *out = it->second.lock();
        if (*out) return S_OK;
    }
    auto d = std::make_shared<TraceDocument>();
    d->path = path;
    HRESULT hr = LoadOrCreate(*d, styleSheet);
    if (FAILED(hr)) return hr;
    reg[path] = d;
    *out = std::move(d);
    return S_OK;
}

// Writes the document through a temporary file and a rename, so that a
// failed write leaves the previous file intact. *size receives the size of
// the file written.
HRESULT WriteDocument(TraceDocument& d, std::uintmax_t* size) {
    std::lock_guard lock(d.mutex);
    std::string tmp = d.path + ".tmp" + std::to_string(getpid());
    if (!d.doc.save_file(tmp.c_str(), "\t", pugi::format_default, pugi::encoding_utf8)) {
        std::remove(tmp.c_str());
        return E_ACCESSDENIED;
    }
    std::error_code ec;
    fs::rename(tmp, d.path, ec);
    if (ec) {
        std::remove(tmp.c_str());
        return E_ACCESSDENIED;
    }
    *size = fs::file_size(d.path, ec);
    if (ec) *size = 0;
    return S_OK;
}

}  // namespace

namespace {
std::tm LocalTm(std::int64_t t) {
    std::time_t tt = static_cast<std::time_t>(t);
    std::tm tm{};
    localtime_r(&tt, &tm);
    return tm;
}
}  // namespace

std::string LocalTimeOfDay(std::int64_t t) {
    std::tm tm = LocalTm(t);
    char buf[32];
    return std::string(buf, std::strftime(buf, sizeof buf, "%H:%M:%S", &tm));
}

std::string LocalFileTimeStamp(std::int64_t t) {
    std::tm tm = LocalTm(t);
    char buf[64];
    return std::string(buf, std::strftime(buf, sizeof buf, "%Y-%m-%d_%H-%M-%S", &tm));
}

std::int64_t CTracer::Now() const {
    return clock_ ? clock_() : static_cast<std::int64_t>(std::time(nullptr));
}

CTraceOwner::CTraceOwner() = default;
CTraceOwner::~CTraceOwner() = default;

HRESULT CTraceOwner::SetEnabled(bool on) {
    if (!on) {
        doc_.reset();
        state_ = kNotStarted;
    }
    enabled_ = on;
    return S_OK;
}

void CTraceOwner::SetTraceName(std::string_view name) {
    if (name == traceName_ && !filePath_.empty()) return;
    traceName_ = name;
    filePath_.clear();
}

std::string CTraceOwner::DefaultFilePath() const {
    std::string name = ExecutableFileName() + "_" + LocalFileTimeStamp(Now()) + ".xml";
    return (fs::current_path() / name).lexically_normal().string();
}

std::string CTraceOwner::ResolveFilePath() const {
    if (traceName_.empty()) return DefaultFilePath();
    fs::path p(traceName_);
    if (!HasExtension(p, ".xml")) p += ".xml";
    if (p.is_relative()) p = fs::current_path() / p;
    return p.lexically_normal().string();
}

std::string CTraceOwner::StyleSheetPath() const {
    fs::path name(transform_.empty() ? std::string("trace.xslt") : transform_);
    if (!HasExtension(name, ".xslt")) name += ".xslt";
    const char* root = std::getenv("IVI_STANDARD_ROOT_DIR");
    fs::path components = fs::path(root ? root : "") / "Components";
    fs::path dir = components / "Quorlen Technologies";
    std::error_code ec;
    if (!fs::is_directory(dir, ec)) dir = components / "Orrinsoft";
    return (dir / name).string();
}

HRESULT CTraceOwner::StartSessionTracing() {
    if (!enabled_ || state_ == kFull) return S_FALSE;
    if (state_ == kRecording) return E_UNEXPECTED;
    try {
        std::string path = filePath_.empty() ? ResolveFilePath() : filePath_;
        std::shared_ptr<TraceDocument> doc;
        HRESULT hr = OpenShared(path, StyleSheetPath(), &doc);
        if (FAILED(hr)) return hr;
        std::uintmax_t size = 0;
        hr = WriteDocument(*doc, &size);
        if (FAILED(hr)) return hr;
        doc_ = std::move(doc);
        filePath_ = std::move(path);
        lastSave_ = Now();
        state_ = kRecording;
        return S_OK;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    } catch (...) {
        return E_FAIL;
    }
}

HRESULT CTraceOwner::Save() {
    if (!doc_) return S_FALSE;
    try {
        std::uintmax_t size = 0;
        HRESULT hr = WriteDocument(*doc_, &size);
        lastSave_ = Now();
        if (FAILED(hr)) return hr;
        savedBytes_ = size;
        savedRecords_ += recordsSinceSave_;
        recordsSinceSave_ = 0;
        if (enabled_ && static_cast<long long>(size) > static_cast<long long>(sizeLimit_))
            state_ = kFull;
        return S_OK;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    } catch (...) {
        return E_FAIL;
    }
}

HRESULT CTraceOwner::OnCallEnd() {
    if (state_ != kRecording) return S_FALSE;
    ++recordsSinceSave_;
    std::int64_t elapsed = Now() - lastSave_;
    // A clock set back also saves, rather than waiting for it to catch up.
    if (elapsed < 0 || elapsed / 60 >= saveInterval_) return Save();
    constexpr std::uintmax_t kFirstRecordGuess = 256;  // bytes, before any measure
    const std::uintmax_t per_record =
        savedRecords_ ? std::max<std::uintmax_t>(savedBytes_ / savedRecords_, 1) : kFirstRecordGuess;
    if (sizeLimit_ >= 0 &&
        savedBytes_ + recordsSinceSave_ * per_record > static_cast<std::uintmax_t>(sizeLimit_))
        return Save();
    return S_FALSE;
}

HRESULT CTraceOwner::SaveOnClose() {
    if (!enabled_) return S_FALSE;
    HRESULT hr = doc_ ? Save() : S_FALSE;
    doc_.reset();
    state_ = kNotStarted;
    return hr;
}

}  // namespace qn
