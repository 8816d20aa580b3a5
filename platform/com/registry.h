// The registry store: a small tree of keys, each with named string values
// (the default value has the name ""), persisted in one text file.
//
// Key names compare without regard to ASCII case and keep the case they were
// created with. Paths separate keys with a backslash; the root names HKCR,
// HKLM and HKCU stand for HKEY_CLASSES_ROOT, HKEY_LOCAL_MACHINE and
// HKEY_CURRENT_USER.
//
// File format (one UTF-8 text file, written sorted):
//     ; comment
//     [HKEY_CLASSES_ROOT\CLSID\{...}\InprocServer32]
//     @="/usr/lib/libexample.so"
//     "ThreadingModel"="Both"
// Inside quotes, \\ \" \n \r \t are escapes. Every key appears as a section.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qn::com {

// Case-insensitive ordering of key and value names.
struct NoCaseLess {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const;
};

class RegistryTree {
  public:
    struct Key {
        std::map<std::string, Key, NoCaseLess> subkeys;
        std::map<std::string, std::string, NoCaseLess> values;
    };

    // Creates the key and its missing parents; null for an invalid path
    // (empty, an empty component, or a control character in a name).
    Key* CreateKey(std::string_view path);
    const Key* OpenKey(std::string_view path) const;
    bool SetValue(std::string_view path, std::string_view name, std::string_view value);
    std::optional<std::string> GetValue(std::string_view path, std::string_view name = "") const;
    // Removes the key with all its subkeys; false when it does not exist.
    bool DeleteTree(std::string_view path);
    // Names of the direct subkeys (empty when the key does not exist).
    std::vector<std::string> EnumSubkeys(std::string_view path) const;

    std::string Serialize() const;
    // Parses the file format; false with "line N: ..." in *error when malformed.
    bool Deserialize(std::string_view text, std::string* error);

    const Key& root() const { return root_; }

  private:
    Key root_;
};

struct RegistryStatus {
    bool ok = true;
    std::string error;
};

// $QN_REGISTRY_FILE when set and not empty, else
// $XDG_CONFIG_HOME/quorlen731xx/registry or ~/.config/quorlen731xx/registry.
std::string RegistryFilePath();

// Reads a registry file under a shared lock. A missing file reads as an
// empty tree; an unreadable or malformed file is an error.
RegistryStatus LoadRegistryFile(const std::string& path, RegistryTree* tree);

// Read-modify-write under an exclusive lock (flock on path + ".lock"): loads
// the file, calls change (which returns false to abandon), and saves
// atomically (temporary file in the same directory, then rename). Parent
// directories are created as needed.
RegistryStatus UpdateRegistryFile(const std::string& path,
                                  const std::function<bool(RegistryTree&)>& change);

}  // namespace qn::com
