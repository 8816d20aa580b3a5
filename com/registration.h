// What the module writes into the registry store when it registers, as one
// table of entries with %NAME% placeholders (the module's registration
// script), and the small processor that applies or removes that table.
//
// Layout under HKEY_CLASSES_ROOT (braced GUIDs from Quorlen731XXIds.h):
//   AppID\{appid}                      @ = "Quorlen731XX"
//   AppID\Quorlen731XX.DLL             AppID = "{appid}"
//   Quorlen731XX.Quorlen731XX.1        @ = "Quorlen731XX Object", CLSID\@ = "{clsid}"
//   Quorlen731XX.Quorlen731XX          @ = description, CLSID\@, CurVer\@ = the ProgID
//   CLSID\{clsid}                      @ = description, AppID = "{appid}",
//       ProgID, VersionIndependentProgID, Programmable, TypeLib\@ = "{libid}",
//       InprocServer32\@ = module path, ThreadingModel = "Both",
//       Implemented Categories\{catid1}, Implemented Categories\{catid2}
//   TypeLib\{libid}\1.0                @ = "Quorlen731XX 1.0 Type Library",
//       FLAGS\@ = "0", 0\linux64\@ = module path
//
// There is no separate type-library file on this platform: the type
// information is compiled into the module (the interface headers and their
// ids), so the "0\linux64" entry names the module itself, the way a
// library with an embedded type library is registered.
//
// The keys "AppID", "CLSID" and "TypeLib" and HKEY_CLASSES_ROOT itself are
// never removed; every entry owns the first key below the one it lives in,
// and unregistration removes exactly those owned keys with their subtrees.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/com/registry.h"

namespace qn::server {

struct Replacement {
    std::string name;
    std::string value;
};
using Replacements = std::vector<Replacement>;

// Replaces every %NAME% (name compared without regard to case) by its value;
// "%%" stands for one "%". Empty on an unknown name or an unmatched "%".
std::optional<std::string> ExpandPlaceholders(std::string_view text, const Replacements& r);

// The replacements of the module script: APPID, Module (single quotes
// doubled, for quoted script text), Module_Raw, MODULEGUID, MODULETYPE, and
// the class's CLSID, PROGID, VIPROGID, DESCRIPTION, LIBID, CATID1, CATID2.
Replacements ModuleReplacements(const std::string& module_path);

// Writes every entry of the table into the tree, after removing the keys the
// table owns (so that stale entries of an earlier registration go). False with
// a reason when an entry cannot be expanded or written; the tree is then
// partly changed and must be discarded.
bool ApplyRegistration(com::RegistryTree& tree, const Replacements& r, std::string* error);

// Removes the keys the table owns; true when anything was removed.
bool RemoveRegistration(com::RegistryTree& tree, const Replacements& r);

}  // namespace qn::server
