// Attribute store of one object-model node: the last value written to each
// property while simulating, keyed by the property's simulation key
// ("Interface.Property"), and the compare policies bound to the entries.
#pragma once

#include <cstdint>
#include <memory>
#include <new>
#include <string_view>
#include <type_traits>

#include "platform/com/bstr.h"
#include "platform/com/types.h"
#include "platform/com/variant.h"
#include "services/model_map.h"

namespace qn {

// Decides whether two values of a property are equal: integers exactly,
// doubles after rounding both to `digits` decimal places, strings by
// VarBstrCmp.
template <class T>
class CSimpleComparePolicy : public CModelBasedType {
  public:
    CSimpleComparePolicy(std::string model, std::uint8_t digits)
        : CModelBasedType(std::move(model)), digits_(digits) {}
    std::uint8_t Digits() const { return digits_; }

    virtual bool Compare(const T& a, const T& b) const {
        if constexpr (std::is_same_v<T, double>) {
            double ra = 0.0, rb = 0.0;
            if (FAILED(VarR8Round(a, digits_, &ra)) || FAILED(VarR8Round(b, digits_, &rb)))
                return a == b;
            return ra == rb;
        } else if constexpr (std::is_same_v<T, BSTR>) {
            return VarBstrCmp(a, b, LOCALE_USER_DEFAULT, 0) == VARCMP_EQ;
        } else {
            return a == b;
        }
    }

  private:
    std::uint8_t digits_;
};

template <class T>
using CComparePolicy = CModelBasedMap<CSimpleComparePolicy<T>>;

// The default policy map of type T: one row for every model with 14 digits.
// Built once on first use, never freed.
template <class T>
const CComparePolicy<T>& DefaultComparePolicy() {
    static const CComparePolicy<T> policy{CSimpleComparePolicy<T>("", 14)};
    return policy;
}

// Type tag of an entry, so that a key used with the wrong type is detected.
enum class CacheType : std::uint8_t { Short, Long, Double, String };

template <class T>
constexpr CacheType CacheTypeOf() {
    if constexpr (std::is_same_v<T, SHORT>)
        return CacheType::Short;
    else if constexpr (std::is_same_v<T, LONG>)
        return CacheType::Long;
    else if constexpr (std::is_same_v<T, double>)
        return CacheType::Double;
    else {
        static_assert(std::is_same_v<T, BSTR>, "cache entries hold short, long, double or BSTR");
        return CacheType::String;
    }
}

class CCacheEntryBase {
  public:
    explicit CCacheEntryBase(CacheType type) : type_(type) {}
    virtual ~CCacheEntryBase() = default;
    CCacheEntryBase(const CCacheEntryBase&) = delete;
    CCacheEntryBase& operator=(const CCacheEntryBase&) = delete;

    virtual void Invalidate() { valid_ = false; }
    void SetValid() { valid_ = true; }
    bool IsValid() const { return valid_; }
    CacheType Type() const { return type_; }

  private:
    bool valid_ = false;
    CacheType type_;
};

// One stored value. Get copies the value out when valid; Set stores its own
// copy and makes the entry valid. String copies that cannot be allocated
// throw std::bad_alloc (the method frame turns it into an out-of-memory error).
template <class T>
class CCacheEntry : public CCacheEntryBase {
  public:
    explicit CCacheEntry(const CComparePolicy<T>* policy = &DefaultComparePolicy<T>())
        : CCacheEntryBase(CacheTypeOf<T>()), policy_(policy) {}

    bool Get(T* out) const {
        if (!IsValid() || !out) return false;
        *out = value_;
        return true;
    }
    void Set(T v) {
        value_ = v;
        SetValid();
    }
    // The equality of two values under the policy of `model`.
    bool Equal(const T& a, const T& b, std::string_view model) const {
        const CSimpleComparePolicy<T>* p = policy_ ? policy_->Lookup(model) : nullptr;
        return p ? p->Compare(a, b) : a == b;
    }

  private:
    T value_{};
    const CComparePolicy<T>* policy_;
};

template <>
class CCacheEntry<BSTR> : public CCacheEntryBase {
  public:
    explicit CCacheEntry(const CComparePolicy<BSTR>* policy = &DefaultComparePolicy<BSTR>())
        : CCacheEntryBase(CacheType::String), policy_(policy) {}

    void Invalidate() override {
        value_.reset();
        CCacheEntryBase::Invalidate();
    }
    // *out receives a new string owned by the caller (never null).
    bool Get(BSTR* out) const {
        if (!IsValid() || !out) return false;
        BSTR copy = SysAllocStringLen(value_.get(), value_.size());
        if (!copy) throw std::bad_alloc();
        *out = copy;
        return true;
    }
    void Set(BSTR v) {
        com::Bstr copy = com::Bstr::Adopt(SysAllocStringLen(v, SysStringLen(v)));
        if (!copy.get()) throw std::bad_alloc();
        value_ = std::move(copy);
        SetValid();
    }
    bool Equal(BSTR a, BSTR b, std::string_view model) const {
        const CSimpleComparePolicy<BSTR>* p = policy_ ? policy_->Lookup(model) : nullptr;
        return p ? p->Compare(a, b) : VarBstrCmp(a, b, LOCALE_USER_DEFAULT, 0) == VARCMP_EQ;
    }

  private:
    com::Bstr value_;
    const CComparePolicy<BSTR>* policy_;
};

// The store of one node. Not locked: used under the owning object's lock.
class CCacheManager {
  public:
    CCacheManager() = default;
    CCacheManager(const CCacheManager&) = delete;
    CCacheManager& operator=(const CCacheManager&) = delete;

    // The entry of `key`, created not valid on first use. The pointer stays
    // valid until Clear or destruction. Null when the key already holds a
    // value of another type (a table error). Looking up an existing key
    // allocates nothing.
    template <class T>
    CCacheEntry<T>* GetCacheEntry(std::string_view key) {
        auto it = entries_.find(key);
        if (it == entries_.end())
            it = entries_.emplace(std::string(key), std::make_unique<CCacheEntry<T>>()).first;
        else if (it->second->Type() != CacheTypeOf<T>())
            return nullptr;
        return static_cast<CCacheEntry<T>*>(it->second.get());
    }

    // The entry of `key` when it exists with type T, without creating it.
    template <class T>
    CCacheEntry<T>* FindCacheEntry(std::string_view key) const {
        auto it = entries_.find(key);
        if (it == entries_.end() || it->second->Type() != CacheTypeOf<T>()) return nullptr;
        return static_cast<CCacheEntry<T>*>(it->second.get());
    }

    void InvalidateAll() {
        for (auto& [key, entry] : entries_) entry->Invalidate();
    }
    // Removes every entry (Close of the root object).
    void Clear() { entries_.clear(); }
    std::size_t size() const { return entries_.size(); }

  private:
    StringMap<std::unique_ptr<CCacheEntryBase>> entries_;
};

}  // namespace qn
