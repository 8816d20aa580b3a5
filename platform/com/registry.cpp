// The registry tree, its text format and the locked, atomic file access.
#include "platform/com/registry.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>

namespace qn::com {

namespace {

char LowerAscii(char c) {
    return c >= 'A' && c <= 'Z' ? char(c - 'A' + 'a') : c;
}

// Splits a path at backslashes, mapping the short root names; empty on an invalid path.
std::vector<std::string> SplitPath(std::string_view path) {
    static const std::pair<std::string_view, std::string_view> kRoots[] = {
        {"HKCR", "HKEY_CLASSES_ROOT"},
        {"HKLM", "HKEY_LOCAL_MACHINE"},
        {"HKCU", "HKEY_CURRENT_USER"},
    };
    std::vector<std::string> parts;
    std::size_t start = 0;
    while (true) {
        std::size_t end = path.find('\\', start);
        std::string_view part =
            path.substr(start, end == std::string_view::npos ? end : end - start);
        if (part.empty()) return {};
        for (char c : part)
            if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F) return {};
        parts.emplace_back(part);
        if (end == std::string_view::npos) break;
        start = end + 1;
    }
    for (auto [alias, full] : kRoots)
        if (!NoCaseLess()(parts[0], alias) && !NoCaseLess()(alias, parts[0])) parts[0] = full;
    return parts;
}

std::string Quote(std::string_view s) {
    std::string out = "\"";
    for (char c : s) {
        switch (c) {
            case '\\':
                out += "\\\\";
                break;
            case '"':
                out += "\\\"";
                break;
            case '\n':
                out += "\\n";
                break;
            case '\r':
                out += "\\r";
                break;
            case '\t':
                out += "\\t";
                break;
            default:
                out += c;
        }
    }
    return out + "\"";
}

// Reads a quoted string starting at text[*pos] == '"'; advances *pos past it.
bool Unquote(std::string_view text, std::size_t* pos, std::string* out) {
    if (*pos >= text.size() || text[*pos] != '"') return false;
    out->clear();
    for (std::size_t i = *pos + 1; i < text.size(); ++i) {
        char c = text[i];
        if (c == '"') {
            *pos = i + 1;
            return true;
        }
        if (c != '\\') {
            *out += c;
            continue;
        }
        if (++i >= text.size()) return false;
        switch (text[i]) {
            case '\\':
                *out += '\\';
                break;
            case '"':
                *out += '"';
                break;
            case 'n':
                *out += '\n';
                break;
            case 'r':
                *out += '\r';
                break;
            case 't':
                *out += '\t';
                break;
            default:
                return false;
        }
    }
    return false;
}

void SerializeKey(const RegistryTree::Key& key, const std::string& path, std::string* out) {
    if (!path.empty()) {
        *out += "[" + path + "]\n";
        for (const auto& [name, value] : key.values)
            *out += (name.empty() ? std::string("@") : Quote(name)) + "=" + Quote(value) + "\n";
    }
    for (const auto& [name, sub] : key.subkeys)
        SerializeKey(sub, path.empty() ? name : path + "\\" + name, out);
}

std::string ErrnoText(const std::string& what, const std::string& path) {
    return what + " " + path + ": " + std::strerror(errno);
}

// An flock held on path + ".lock" for the life of the object.
class FileLock {
  public:
    FileLock(const std::string& path, int operation) {
        fd_ = ::open((path + ".lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
        if (fd_ < 0) {
            error_ = ErrnoText("cannot open the lock file for", path);
            return;
        }
        while (::flock(fd_, operation) != 0) {
            if (errno == EINTR) continue;
            error_ = ErrnoText("cannot lock", path);
            break;
        }
    }
    ~FileLock() {
        if (fd_ >= 0) ::close(fd_);  // closing releases the lock
    }
    FileLock(const FileLock&) = delete;
    FileLock& operator=(const FileLock&) = delete;
    const std::string& error() const { return error_; }

  private:
    int fd_ = -1;
    std::string error_;
};

// Creates every missing directory above `path`.
bool MakeParents(const std::string& path) {
    for (std::size_t i = 1; (i = path.find('/', i)) != std::string::npos; ++i) {
        std::string dir = path.substr(0, i);
        if (::mkdir(dir.c_str(), 0755) != 0 && errno != EEXIST) return false;
    }
    return true;
}

RegistryStatus ReadUnlocked(const std::string& path, RegistryTree* tree) {
    *tree = RegistryTree();
    std::FILE* f = std::fopen(path.c_str(), "rb");
    if (!f) {
        if (errno == ENOENT) return {};
        return {false, ErrnoText("cannot open registry file", path)};
    }
    std::string text;
    char buf[16384];
    std::size_t n;
    while ((n = std::fread(buf, 1, sizeof buf, f)) > 0) text.append(buf, n);
    bool failed = std::ferror(f);
    std::fclose(f);
    if (failed) return {false, ErrnoText("cannot read registry file", path)};
    std::string error;
    if (!tree->Deserialize(text, &error)) return {false, path + ": " + error};
    return {};
}

RegistryStatus WriteAtomically(const std::string& path, const std::string& text) {
    if (!MakeParents(path)) return {false, ErrnoText("cannot create the directory of", path)};
    std::string tmp = path + ".tmp." + std::to_string(::getpid());
    int fd = ::open(tmp.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    if (fd < 0) return {false, ErrnoText("cannot create", tmp)};
    std::size_t done = 0;
    while (done < text.size()) {
        ssize_t w = ::write(fd, text.data() + done, text.size() - done);
        if (w < 0 && errno == EINTR) continue;
        if (w <= 0) break;
        done += static_cast<std::size_t>(w);
    }
    bool ok = done == text.size() && ::fsync(fd) == 0;
    ok = ::close(fd) == 0 && ok;
    if (!ok || ::rename(tmp.c_str(), path.c_str()) != 0) {
        RegistryStatus status{false, ErrnoText("cannot write registry file", path)};
        ::unlink(tmp.c_str());
        return status;
    }
    return {};
}

}  // namespace

bool NoCaseLess::operator()(std::string_view a, std::string_view b) const {
    std::size_t n = a.size() < b.size() ? a.size() : b.size();
    for (std::size_t i = 0; i < n; ++i) {
        char x = LowerAscii(a[i]), y = LowerAscii(b[i]);
        if (x != y) return static_cast<unsigned char>(x) < static_cast<unsigned char>(y);
    }
    return a.size() < b.size();
}

RegistryTree::Key* RegistryTree::CreateKey(std::string_view path) {
    std::vector<std::string> parts = SplitPath(path);
    if (parts.empty()) return nullptr;
    Key* key = &root_;
    for (std::string& part : parts) {
        auto it = key->subkeys.find(part);
        if (it == key->subkeys.end()) it = key->subkeys.emplace(std::move(part), Key()).first;
        key = &it->second;
    }
    return key;
}

const RegistryTree::Key* RegistryTree::OpenKey(std::string_view path) const {
    std::vector<std::string> parts = SplitPath(path);
    if (parts.empty()) return nullptr;
    const Key* key = &root_;
    for (const std::string& part : parts) {
        auto it = key->subkeys.find(part);
        if (it == key->subkeys.end()) return nullptr;
        key = &it->second;
    }
    return key;
}

bool RegistryTree::SetValue(std::string_view path, std::string_view name, std::string_view value) {
    Key* key = CreateKey(path);
    if (!key) return false;
    auto it = key->values.find(name);
    if (it == key->values.end())
        key->values.emplace(std::string(name), std::string(value));
    else
        it->second.assign(value);
    return true;
}

std::optional<std::string> RegistryTree::GetValue(std::string_view path,
                                                  std::string_view name) const {
    const Key* key = OpenKey(path);
    if (!key) return std::nullopt;
    auto it = key->values.find(name);
    if (it == key->values.end()) return std::nullopt;
    return it->second;
}

bool RegistryTree::DeleteTree(std::string_view path) {
    std::vector<std::string> parts = SplitPath(path);
    if (parts.empty()) return false;
    Key* parent = &root_;
    for (std::size_t i = 0; i + 1 < parts.size(); ++i) {
        auto it = parent->subkeys.find(parts[i]);
        if (it == parent->subkeys.end()) return false;
        parent = &it->second;
    }
    return parent->subkeys.erase(parts.back()) == 1;
}

std::vector<std::string> RegistryTree::EnumSubkeys(std::string_view path) const {
    std::vector<std::string> names;
    if (const Key* key = OpenKey(path))
        for (const auto& entry : key->subkeys) names.push_back(entry.first);
    return names;
}

std::string RegistryTree::Serialize() const {
    std::string out = "; quorlen731xx registry, format 1\n";
    SerializeKey(root_, "", &out);
    return out;
}

bool RegistryTree::Deserialize(std::string_view text, std::string* error) {
    root_ = Key();
    Key* current = nullptr;
    std::size_t line_no = 0;
    auto fail = [&](const std::string& what) {
        *error = "line " + std::to_string(line_no) + ": " + what;
        root_ = Key();
        return false;
    };
    while (!text.empty()) {
        ++line_no;
        std::size_t eol = text.find('\n');
        std::string_view line = text.substr(0, eol);
        text.remove_prefix(eol == std::string_view::npos ? text.size() : eol + 1);
        if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
        if (line.empty() || line[0] == ';' || line[0] == '#') continue;
        if (line[0] == '[') {
            if (line.back() != ']') return fail("a key line must end with ']'");
            current = CreateKey(line.substr(1, line.size() - 2));
            if (!current) return fail("invalid key path");
            continue;
        }
        if (!current) return fail("a value before the first [key] line");
        std::string name, value;
        std::size_t pos = 0;
        if (line[0] == '@') {
            pos = 1;
        } else if (!Unquote(line, &pos, &name)) {
            return fail("a value name must be @ or a quoted string");
        }
        if (pos >= line.size() || line[pos] != '=')
            return fail("'=' expected after the value name");
        ++pos;
        if (!Unquote(line, &pos, &value)) return fail("a quoted value is expected after '='");
        if (pos != line.size()) return fail("text after the value");
        current->values[name] = std::move(value);
    }
    return true;
}

std::string RegistryFilePath() {
    const char* env = std::getenv("QN_REGISTRY_FILE");
    if (env && *env) return env;
    const char* xdg = std::getenv("XDG_CONFIG_HOME");
    if (xdg && *xdg) return std::string(xdg) + "/quorlen731xx/registry";
    const char* home = std::getenv("HOME");
    return std::string(home && *home ? home : ".") + "/.config/quorlen731xx/registry";
}

RegistryStatus LoadRegistryFile(const std::string& path, RegistryTree* tree) {
    try {
        // A missing directory means a missing file; take the lock only when there is one.
        struct stat st;
        if (::stat(path.c_str(), &st) != 0 && errno == ENOENT) {
            *tree = RegistryTree();
            return {};
        }
        FileLock lock(path, LOCK_SH);
        if (!lock.error().empty()) return {false, lock.error()};
        return ReadUnlocked(path, tree);
    } catch (const std::bad_alloc&) {
        return {false, "out of memory reading " + path};
    }
}

RegistryStatus UpdateRegistryFile(const std::string& path,
                                  const std::function<bool(RegistryTree&)>& change) {
    try {
        if (!MakeParents(path)) return {false, ErrnoText("cannot create the directory of", path)};
        FileLock lock(path, LOCK_EX);
        if (!lock.error().empty()) return {false, lock.error()};
        RegistryTree tree;
        RegistryStatus status = ReadUnlocked(path, &tree);
        if (!status.ok) return status;
        if (!change(tree)) return {};
        return WriteAtomically(path, tree.Serialize());
    } catch (const std::bad_alloc&) {
        return {false, "out of memory updating " + path};
    }
}

}  // namespace qn::com
