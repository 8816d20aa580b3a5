#!/usr/bin/env python3
"""Writes python/quorlen731xx/_tables.py, and the attribute table of docs/c-api.md, from the driver's own tables.

Sources, all in this repository:
  include/Qn731XX.h              attribute IDs and status codes of the C API
  capi/attribute_table.cpp       which property (Interface.Property) and scope each ID names
  include/members/*.def          type and access of every property (QN_PROPERTY rows)
  include/IviDriver.h            type of the inherent properties (getter signatures)
  include/Quorlen731XXEnums.h    every enumeration with its values

An attribute whose property the driver does not have yet is left out (its
row in the document is left as it is). Run with --check to compare the
committed files with what would be written (exit 1 when one is stale).
"""
import argparse
import glob
import os
import re
import sys

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
OUT = os.path.join(ROOT, "python", "quorlen731xx", "_tables.py")
DOC = os.path.join(ROOT, "docs", "c-api.md")
# The channel-name column of the document's attribute table, by scope.
DOC_NAMES = {"session": "", "channel": "Channel<n>", "user_channel": "UserChannel<n>",
             "digital_channel": "UserDigitalChannel<n>"}

SCOPES = {"kSession": "session", "kChannel": "channel", "kUserChannel": "user_channel",
          "kDigitalChannel": "digital_channel"}
# Interface prefixes removed to form the Python path of a group.
PREFIXES = ("IIviScope", "IQuorlen731XX", "IIvi")
# Inherent interfaces whose properties share one Python group.
INHERENT_GROUPS = {"IIviDriverOperation": "driver_operation",
                   "IIviDriverIdentity": "identity", "IIviComponentIdentity": "identity"}


def read(rel):
    with open(os.path.join(ROOT, rel), encoding="utf-8") as f:
        return f.read()


def snake(name):
    s = re.sub(r"([A-Z]+)([A-Z][a-z])", r"\1_\2", name)
    s = re.sub(r"([a-z0-9])([A-Z])", r"\1_\2", s)
    return s.lower()


def header_constants(text):
    """Every integer #define of the header, with BASE + n expressions evaluated."""
    values = {}
    status_base = -0x80000000  # VI_STATUS_ERROR_BASE as a signed 32-bit number
    for name, expr in re.findall(r"^#define\s+(\w+)\s+(.+?)\s*$", text, re.M):
        e = expr.strip()
        m = re.fullmatch(r"QN731XX_STATUS\((0x[0-9A-Fa-f]+)L\)", e)
        if m:
            values[name] = status_base + int(m.group(1), 16)
            continue
        m = re.fullmatch(r"\(\(ViStatus\)(0x[0-9A-Fa-f]+)L\)", e)
        if m:
            values[name] = int(m.group(1), 16)
            continue
        m = re.fullmatch(r"\((\w+) \+ (\d+)L\)", e)
        if m and m.group(1) in values:
            values[name] = values[m.group(1)] + int(m.group(2))
            continue
        m = re.fullmatch(r"(-?\d+)L", e)
        if m:
            values[name] = int(m.group(1))
    return values


def property_types():
    """'Interface.Property' -> (C++ type, readable, writable)."""
    props = {}
    for path in sorted(glob.glob(os.path.join(ROOT, "include", "members", "*.def"))):
        with open(path, encoding="utf-8") as f:
            text = f.read()
        for itf, name, cpp, vt, access in re.findall(
                r"QN_PROPERTY\(\s*(\w+),\s*(\w+),\s*(\w+),\s*(\w+),\s*(RO|RW|WO)\b", text):
            ctype = {"double": "ViReal64", "BSTR": "ViString", "LONG": "ViInt32"}.get(cpp)
            if cpp == "VARIANT_BOOL":
                ctype = "ViBoolean" if vt in ("VT_BOOL", "VT_EMPTY") else "ViInt32"
            elif ctype is None:
                ctype = "ViInt32"  # an enumeration
            props[f"{itf}.{name}"] = (ctype, cpp if cpp.endswith("Enum") else None,
                                      access != "WO", access != "RO")
    # Inherent properties: type from the getter, writable when a setter exists.
    text = read("include/IviDriver.h")
    for itf, body in re.findall(r"struct\s+(\w+)\s*:[^{]*\{(.*?)\n\};", text, re.S):
        for name, cpp in re.findall(r"get_(\w+)\((\w+)\*", body):
            ctype = {"BSTR": "ViString", "LONG": "ViInt32", "VARIANT_BOOL": "ViBoolean",
                     "double": "ViReal64"}.get(cpp)
            if ctype:
                props.setdefault(f"{itf}.{name}",
                                 (ctype, None, True, f"put_{name}(" in body))
    return props


def enumerations():
    """C++ enumeration name -> [(member, value)]; and the Python name of each."""
    text = read("include/Quorlen731XXEnums.h")
    cpp_enums = {}
    for name, body in re.findall(r"enum\s+(\w+)\s*:\s*LONG\s*\{(.*?)\};", text, re.S):
        cpp_enums[name] = [(m, int(v)) for m, v in re.findall(r"(\w+)\s*=\s*(-?\d+)", body)]
    py_enums = {}   # Python name -> [(MEMBER, value)]
    py_name_of = {}  # C++ name -> Python name
    # Driver enumerations first: a class enumeration whose members are the same
    # as a driver enumeration's becomes an alias of it.
    for cpp in sorted(cpp_enums, key=lambda n: not n.startswith("Quorlen731XX")):
        prefix = "Quorlen731XX" if cpp.startswith("Quorlen731XX") else "IviScope"
        base = cpp[len(prefix):-len("Enum")] if cpp.endswith("Enum") else cpp[len(prefix):]
        shorts = [m[len(prefix):] for m, _ in cpp_enums[cpp]]
        if all(s.startswith(base) and len(s) > len(base) for s in shorts):
            shorts = [s[len(base):] for s in shorts]
        elif len(shorts) > 1:
            # Members named with a shorter stem ("AcqInProgress"): drop the
            # words they all start with.
            words = [re.findall(r"[A-Z]+(?![a-z])|[A-Z][a-z0-9]*|[a-z0-9]+", s) for s in shorts]
            common = 0
            while all(len(w) > common + 1 for w in words) and \
                    len({w[common] for w in words}) == 1:
                common += 1
            shorts = ["".join(w[common:]) for w in words]
        members = []
        for short, (m, v) in zip(shorts, cpp_enums[cpp]):
            ident = snake(short).upper()
            if not ident.isidentifier():
                ident = "V" + ident
            members.append((ident, v))
        name = base
        if name in py_enums and py_enums[name] != members:
            name = "IviScope" + base
        py_enums[name] = members
        py_name_of[cpp] = name
    return py_enums, py_name_of


def group_path(itf):
    if itf in INHERENT_GROUPS:
        return INHERENT_GROUPS[itf]
    rest = itf
    for p in PREFIXES:
        if itf.startswith(p):
            rest = itf[len(p):]
            break
    if rest.startswith("Trigger") and rest != "Trigger":
        return "trigger." + snake(rest[len("Trigger"):])
    return snake(rest)


def build():
    header = read("include/Qn731XX.h")
    consts = header_constants(header)
    props = property_types()
    py_enums, py_name_of = enumerations()
    rows = re.findall(r"QN_ATTR\((\w+),\s*(\w+),\s*(\w+),\s*(\w+)\)",
                      read("capi/attribute_table.cpp"))
    attributes = []
    for const, itf, prop, where in rows:
        key = f"{itf}.{prop}"
        if key not in props or const not in consts:
            continue  # the driver does not have this property yet
        ctype, cpp_enum, readable, writable = props[key]
        group = group_path(itf)
        if itf.endswith("Channel") and where != "kSession":
            group = "digital_channel" if "Digital" in itf else "channel"
        attributes.append((const, consts[const], key, SCOPES[where], ctype, readable, writable,
                           py_name_of.get(cpp_enum), group, snake(prop)))
    statuses = {n: v for n, v in consts.items()
                if re.match(r"(QN731XX|IVISCOPE|IVI)_(ERROR|WARN)_", n)}
    return attributes, py_enums, statuses


def render(attributes, enums, statuses):
    out = ['"""The driver\'s tables for the Python surface. Written by',
           'tools/gen_python_tables.py; do not edit."""', "",
           "# (constant, ID, property, scope, C type, readable, writable, enumeration,",
           "#  Python group, Python name)", "ATTRIBUTES = ("]
    for a in attributes:
        out.append(f"    {a!r},")
    out += [")", "", "# Python name -> ((MEMBER, value), ...)", "ENUMERATIONS = {"]
    for name in sorted(enums):
        out.append(f"    {name!r}: {tuple(enums[name])!r},")
    out += ["}", "", "# Status codes of the C API: name -> signed value", "STATUSES = {"]
    for name in sorted(statuses, key=lambda n: (statuses[n], n)):
        out.append(f"    {name!r}: {statuses[name]},")
    out += ["}", ""]
    return "\n".join(out)


def render_doc(attributes, text):
    """The document with each attribute's table row written from `attributes`."""
    by_id = {a[1]: a for a in attributes}

    def row(m):
        a = by_id.get(int(m.group(1)))
        if a is None:
            return m.group(0)
        access = "read/write" if a[6] else "read-only"
        return f"| {a[1]} | `{a[0]}` | `{a[2]}` | {a[4]} | {access} | {DOC_NAMES[a[3]]} |"

    return re.sub(r"^\| (\d{7}) \|.*$", row, text, flags=re.M)


def main():
    ap = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    ap.add_argument("--check", action="store_true", help="fail when the file is stale")
    ap.add_argument("--output", default=OUT)
    args = ap.parse_args()
    attributes, enums, statuses = build()
    with open(DOC, encoding="utf-8") as f:
        doc = f.read()
    outputs = [(args.output, render(attributes, enums, statuses)), (DOC, render_doc(attributes, doc))]
    if args.check:
        stale = 0
        for path, text in outputs:
            try:
                with open(path, encoding="utf-8") as f:
                    current = f.read()
            except OSError:
                current = None
            if current != text:
                print(f"{os.path.relpath(path, ROOT)} is stale: run "
                      "python3 tools/gen_python_tables.py and commit the result", file=sys.stderr)
                stale = 1
        return stale
    for path, text in outputs:
        with open(path, "w", encoding="utf-8") as f:
            f.write(text)
    return 0


if __name__ == "__main__":
    sys.exit(main())
