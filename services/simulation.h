// Simulation values: per property a model-based map of CSimulationInfo<T>
// rows giving the value a simulated read returns before the first write.
// Member tables describe each value as a constant SimValue literal; a
// CSimulationTable turns such a table into one map per simulation key
// ("Interface.Property"), built once on first use.
#pragma once

#include <cstdint>
#include <new>
#include <string>
#include <string_view>
#include <type_traits>
#include <variant>

#include "platform/com/bstr.h"
#include "platform/com/types.h"
#include "services/model_map.h"

namespace qn {

// One simulation row: a model and the value for it. Numbers are held by
// value; a string row owns its BSTR.
template <class T>
class CSimulationInfo : public CModelBasedType {
    static_assert(std::is_same_v<T, SHORT> || std::is_same_v<T, LONG> || std::is_same_v<T, double>,
                  "simulation values are short, long, double or BSTR");

  public:
    CSimulationInfo(std::string model, T value)
        : CModelBasedType(std::move(model)), value_(value) {}
    T Value() const { return value_; }

  private:
    T value_;
};

template <>
class CSimulationInfo<BSTR> : public CModelBasedType {
  public:
    // Throws std::bad_alloc when the string cannot be allocated.
    CSimulationInfo(std::string model, std::string_view utf8)
        : CModelBasedType(std::move(model)), value_(utf8) {
        if (!value_.get()) throw std::bad_alloc();
    }
    BSTR Value() const { return value_.get(); }  // owned by the row

  private:
    com::Bstr value_;
};

// The simulation map of one property.
template <class T>
class CSimulationMap : public CModelBasedMap<CSimulationInfo<T>> {
  public:
    using CModelBasedMap<CSimulationInfo<T>>::CModelBasedMap;

    // The value of the row for `model` (exact, then ""). Without a row: 0,
    // 0.0 or an empty string. A BSTR result is a new allocation owned by the
    // caller; allocation failure throws std::bad_alloc.
    T GetSimulationValue(std::string_view model) const {
        const CSimulationInfo<T>* row = this->Lookup(model);
        if constexpr (std::is_same_v<T, BSTR>) {
            BSTR src = row ? row->Value() : nullptr;
            BSTR copy = SysAllocStringLen(src, SysStringLen(src));
            if (!copy) throw std::bad_alloc();
            return copy;
        } else {
            return row ? row->Value() : T{};
        }
    }
};

// Constant description of a simulation value, usable in constexpr member
// tables: a type tag and the value in the matching field.
struct SimValue {
    enum class Kind : std::uint8_t { None, Short, Long, Double, String };
    Kind kind = Kind::None;
    LONG integer = 0;  // Short and Long (booleans as short: VARIANT_TRUE is -1)
    double real = 0.0;
    const char* text = nullptr;  // String, UTF-8, static storage

    static constexpr SimValue Short(SHORT v) { return {Kind::Short, v, 0.0, nullptr}; }
    static constexpr SimValue Long(LONG v) { return {Kind::Long, v, 0.0, nullptr}; }
    static constexpr SimValue Double(double v) { return {Kind::Double, 0, v, nullptr}; }
    static constexpr SimValue String(const char* v) { return {Kind::String, 0, 0.0, v}; }
};

// A row of a simulation literal table. Member tables may use their own row
// type with the same two fields (`simKey`, `sim`).
struct SimEntry {
    const char* simKey;
    SimValue sim;
};

// The simulation maps of many properties, keyed by simulation key. Each map
// holds one row for every model ("") with the literal's value.
class CSimulationTable {
  public:
    CSimulationTable() = default;

    // Rows with an empty key or a value of kind None are skipped.
    template <class Range>
    explicit CSimulationTable(const Range& rows) {
        for (const auto& r : rows) Add(r.simKey ? r.simKey : "", r.sim);
    }

    void Add(std::string_view key, const SimValue& v);

    // The map of `key` when it exists and holds values of type T, else null.
    template <class T>
    const CSimulationMap<T>* Find(std::string_view key) const {
        auto it = maps_.find(key);
        if (it == maps_.end()) return nullptr;
        return std::get_if<CSimulationMap<T>>(&it->second);
    }

    // The simulated value of `key` for `model`; 0 / 0.0 / "" when the key
    // is unknown (see CSimulationMap::GetSimulationValue).
    template <class T>
    T GetSimulationValue(std::string_view key, std::string_view model) const {
        if (const CSimulationMap<T>* m = Find<T>(key)) return m->GetSimulationValue(model);
        return CSimulationMap<T>{}.GetSimulationValue(model);
    }

    std::size_t size() const { return maps_.size(); }

  private:
    using AnyMap = std::variant<CSimulationMap<SHORT>, CSimulationMap<LONG>, CSimulationMap<double>,
                                CSimulationMap<BSTR>>;
    StringMap<AnyMap> maps_;
};

// The table built from the constant row array `Rows` (SimEntry or any row
// type with `simKey` and `sim`), constructed once per process on first use;
// the static initialisation guard makes the first use thread-safe.
template <const auto& Rows>
const CSimulationTable& SimulationTableOf() {
    static const CSimulationTable table(Rows);
    return table;
}

}  // namespace qn
