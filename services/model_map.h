// Model-keyed tables: rows that apply to one instrument model (or to every
// model when the model string is empty), held in a hash map from model string
// to row. Used for simulation values, compare policies, enumeration tokens and
// the supported-model table.
#pragma once

#include <cstddef>
#include <functional>
#include <initializer_list>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>

namespace qn {

// Hash for string-keyed maps that are searched with a string_view, so that a
// lookup never builds a std::string.
struct StringHash {
    using is_transparent = void;
    std::size_t operator()(std::string_view s) const noexcept {
        return std::hash<std::string_view>{}(s);
    }
};

template <class V>
using StringMap = std::unordered_map<std::string, V, StringHash, std::equal_to<>>;

// Base of every model-keyed row. An empty model string means "every model".
class CModelBasedType {
  public:
    CModelBasedType() = default;
    explicit CModelBasedType(std::string model) : model_(std::move(model)) {}
    virtual ~CModelBasedType() = default;
    CModelBasedType(const CModelBasedType&) = default;
    CModelBasedType(CModelBasedType&&) = default;
    CModelBasedType& operator=(const CModelBasedType&) = default;
    CModelBasedType& operator=(CModelBasedType&&) = default;

    const std::string& Model() const { return model_; }
    // Rows carry no condition beyond their model.
    virtual bool Test() const { return true; }

  private:
    std::string model_;
};

// Hash map from model string to row; owns its rows. X derives from
// CModelBasedType and is copyable or movable.
template <class X>
class CModelBasedMap {
  public:
    CModelBasedMap() = default;
    CModelBasedMap(std::initializer_list<X> rows) { AddRow(rows); }

    // Inserts a row keyed by its model; a later row for the same model
    // replaces the earlier one.
    void AddRow(X row) {
        std::string key = row.Model();
        rows_.insert_or_assign(std::move(key), std::move(row));
    }
    void AddRow(std::initializer_list<X> rows) {
        for (const X& r : rows) AddRow(r);
    }

    // The row of exactly this model (case-sensitive), else the row for every
    // model (""), else null.
    const X* Lookup(std::string_view model) const {
        auto it = rows_.find(model);
        if (it == rows_.end() && !model.empty()) it = rows_.find(std::string_view{});
        return it == rows_.end() ? nullptr : &it->second;
    }

    std::size_t size() const { return rows_.size(); }
    bool empty() const { return rows_.empty(); }

  private:
    StringMap<X> rows_;
};

}  // namespace qn
