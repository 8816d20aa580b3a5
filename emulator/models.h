// The 65 emulated models, their seven families and the features that follow from a model name.
// The per-family feature table is documented in emulator/README.md.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qn::emu {

// Hardware and dialect features; command rows name the ones they need.
enum ModelFeature : std::uint32_t {
    kFeatSystemData = 1u << 0,      // newer families: :SYST:DATA, OPER:COND?, :OPER:EVEN?
    kFeatEarlyDialect = 1u << 1,    // families 7312X and 7314X: OPER? condition query
    kFeatProtection = 1u << 2,      // "PROT": input overload protection, :CHAN<n>:PROT, :OVL
    kFeatProbeSkew = 1u << 3,       // "PSK": :CHAN<n>:PROB:SKEW
    kFeatGroundCoupling = 1u << 4,  // "GCO": :CHAN<n>:COUP GND
    kFeatFiftyOhm = 1u << 5,        // "FIFT": :CHAN<n>:IMP FIFT
    kFeatAutoLevel = 1u << 6,       // "ALEV": auto-level trigger sweep
    kFeatExtTrigger = 1u << 7,      // "EXT": external trigger input
    kFeatSequence = 1u << 8,        // "SEQ": sequential trigger
    kFeatDigitize = 1u << 9,        // "DDIG": digitize with operation-complete signalling
    kFeatCountedMax = 1u << 10,     // "DEC": :WAV:POIN MAX,<count>
    kFeatDigital = 1u << 11,        // digital pods
    kFeatLabels = 1u << 12,         // channel labels shown
};

// One row of the family table; the token strings are the :SYST:DATA:VAL? texts.
struct FamilyInfo {
    const char* name;
    const char* firmware;
    int max_points;          // longest record the family transfers
    double bandwidth_limit;  // Hz, frequency of the bandwidth-limit filter
    const char* disp_lab;    // "DISP:LAB" value, nullptr when the key is unknown
    const char* wav_feat;    // "WAV:FEAT", nullptr when the key is unknown
    const char* chan_feat;
    const char* trig_feat;
    const char* trig_mod;
    const char* anal_feat;
    bool early;  // 7312X/7314X: no :SYST:DATA subsystem at all
};

struct ModelInfo {
    std::string name;
    const FamilyInfo* family = nullptr;
    int analog_channels = 4;
    int pods = 0;  // digital pods of kPodSize channels
    double bandwidth = 1e9;
    std::uint32_t features = 0;
    std::string serial;

    bool Has(ModelFeature f) const { return (features & f) != 0; }
};

inline constexpr int kPodSize = 8;

// Model derived from its name; nullopt for a name outside the table (exact, case-sensitive).
std::optional<ModelInfo> LookUpModel(std::string_view name);
// Every model name, in table order.
std::span<const std::string_view> AllModelNames();
std::span<const FamilyInfo> AllFamilies();

}  // namespace qn::emu
