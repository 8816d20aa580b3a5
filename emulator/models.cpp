#include "emulator/models.h"

#include <array>
#include <cstdio>

namespace qn::emu {
namespace {

// Family table. Token lists are answered by :SYST:DATA:VAL?; for the early families (which
// have no such subsystem) they only describe the hardware.
constexpr std::array<FamilyInfo, 7> kFamilies{{
    {"4XXXB", "07.50.2021", 32000, 2.5e7, "1", "DEC,SEGM", "FIFT,PROT,PSK", "EXT,ZONE",
     "EDGE,GLIT,PATT,TV,RUNT,SEQ", "DDIG,MEAS,FFT", false},
    {"4XXXA", "05.20.2018", 32000, 2.5e7, "1", "DEC", "FIFT,PROT,PSK", "EXT",
     "EDGE,GLIT,PATT,TV,RUNT,SEQ", "DDIG,MEAS", false},
    {"3XXXA", "04.10.2016", 16000, 2e7, "1", "SEGM", "FIFT,PROT,PSK", "EXT",
     "EDGE,GLIT,PATT,TV,RUNT,SEQ", "DDIG,MEAS", false},
    {"3XXXL", "02.30.2015", 8000, 2e7, "0", nullptr, "PSK", "", "EDGE,GLIT,PATT,TV", "DDIG,MEAS",
     false},
    {"2XXXA", "02.10.2014", 8000, 2e7, "1", nullptr, "GCO,ALEV,PSK", "EXT", "EDGE,GLIT,PATT,TV",
     "MEAS", false},
    {"7314X", "A.04.10", 4000, 2.5e7, nullptr, nullptr, "FIFT,PROT,PSK", "EXT", "EDGE,GLIT,PATT,TV",
     "", true},
    {"7312X", "A.02.30", 2000, 2e7, nullptr, nullptr, "GCO,ALEV", "EXT", "EDGE,GLIT,PATT,TV", "",
     true},
}};

struct ModelRow {
    std::string_view name;
    std::string_view family;
};

constexpr std::array<ModelRow, 65> kModels{{
    {"QMS4104B", "4XXXB"}, {"QMS4054B", "4XXXB"}, {"QMS4052B", "4XXXB"}, {"QMS4034B", "4XXXB"},
    {"QMS4032B", "4XXXB"}, {"QMS4012B", "4XXXB"}, {"QMS4014B", "4XXXB"}, {"QDS4014B", "4XXXB"},
    {"QDS4052B", "4XXXB"}, {"QDS4054B", "4XXXB"}, {"QDS4032B", "4XXXB"}, {"QDS4034B", "4XXXB"},
    {"QDS4012B", "4XXXB"}, {"QDS4104B", "4XXXB"}, {"QMS4014A", "4XXXA"}, {"QMS4012A", "4XXXA"},
    {"QDS4014A", "4XXXA"}, {"QDS4012A", "4XXXA"}, {"QMS4104A", "4XXXA"}, {"QMS4054A", "4XXXA"},
    {"QMS4034A", "4XXXA"}, {"QMS4102A", "4XXXA"}, {"QMS4052A", "4XXXA"}, {"QMS4032A", "4XXXA"},
    {"QDS4104A", "4XXXA"}, {"QDS4054A", "4XXXA"}, {"QDS4034A", "4XXXA"}, {"QDS4102A", "4XXXA"},
    {"QDS4052A", "4XXXA"}, {"QDS4032A", "4XXXA"}, {"QDS2012A", "2XXXA"}, {"QDS2014A", "2XXXA"},
    {"QDS2032A", "2XXXA"}, {"QDS2034A", "2XXXA"}, {"QDS2052A", "2XXXA"}, {"QDS2054A", "2XXXA"},
    {"QDS3034L", "3XXXL"}, {"QDS3104L", "3XXXL"}, {"QDS3054L", "3XXXL"}, {"QDS3014L", "3XXXL"},
    {"QMS3104A", "3XXXA"}, {"QDS3104A", "3XXXA"}, {"QMS3102A", "3XXXA"}, {"QDS3102A", "3XXXA"},
    {"QMS3054A", "3XXXA"}, {"QDS3054A", "3XXXA"}, {"QMS3052A", "3XXXA"}, {"QDS3052A", "3XXXA"},
    {"QMS3034A", "3XXXA"}, {"QDS3034A", "3XXXA"}, {"QMS3032A", "3XXXA"}, {"QDS3032A", "3XXXA"},
    {"QMS3014A", "3XXXA"}, {"QDS3014A", "3XXXA"}, {"QMS3012A", "3XXXA"}, {"QDS3012A", "3XXXA"},
    {"73142D", "7314X"},   {"73142A", "7314X"},   {"73141D", "7314X"},   {"73141A", "7314X"},
    {"73124A", "7312X"},   {"73122D", "7312X"},   {"73122A", "7312X"},   {"73121D", "7312X"},
    {"73121A", "7312X"},
}};

const std::array<std::string_view, 65> kModelNames = [] {
    std::array<std::string_view, 65> names{};
    for (std::size_t i = 0; i < kModels.size(); ++i) names[i] = kModels[i].name;
    return names;
}();

// Bandwidth code of the newer model names: the two digits after the series digit
// ("QDS4032A": "03").
struct BandwidthCode {
    std::string_view code;
    double hertz;
};
constexpr std::array<BandwidthCode, 4> kBandwidths{
    {{"01", 1e8}, {"03", 3.5e8}, {"05", 5e8}, {"10", 1e9}}};

// Early names: analog bandwidth by model prefix.
constexpr std::array<BandwidthCode, 4> kEarlyBandwidths{
    {{"73121", 6e7}, {"73122", 1e8}, {"73124", 1e8}, {"73141", 3e8}}};
constexpr double kEarlyDefaultBandwidth = 5e8;  // 73142

struct TokenFeature {
    std::string_view token;
    ModelFeature feature;
};
constexpr std::array<TokenFeature, 5> kChannelTokens{{{"GCO", kFeatGroundCoupling},
                                                      {"ALEV", kFeatAutoLevel},
                                                      {"FIFT", kFeatFiftyOhm},
                                                      {"PROT", kFeatProtection},
                                                      {"PSK", kFeatProbeSkew}}};

bool Contains(const char* text, std::string_view token) {
    return text != nullptr && std::string_view(text).find(token) != std::string_view::npos;
}

std::uint32_t TokenFeatures(const FamilyInfo& family) {
    std::uint32_t features = 0;
    for (const auto& t : kChannelTokens) {
        if (Contains(family.chan_feat, t.token)) features |= t.feature;
    }
    if (Contains(family.trig_feat, "EXT")) features |= kFeatExtTrigger;
    if (Contains(family.trig_mod, "SEQ")) features |= kFeatSequence;
    if (Contains(family.anal_feat, "DDIG")) features |= kFeatDigitize;
    if (Contains(family.wav_feat, "DEC")) features |= kFeatCountedMax;
    return features;
}

void DeriveNewer(ModelInfo& m) {
    m.analog_channels = m.name[6] - '0';
    m.pods = m.name.starts_with("QMS") ? 2 : 0;
    const std::string_view code = std::string_view(m.name).substr(4, 2);
    for (const auto& b : kBandwidths) {
        if (b.code == code) m.bandwidth = b.hertz;
    }
    m.features |= kFeatSystemData;
    if (std::string_view(m.family->disp_lab) != "0") m.features |= kFeatLabels;
}

void DeriveEarly(ModelInfo& m) {
    const std::string_view name = m.name;
    m.analog_channels = 2;
    if (name[4] == '4') {  // "73124A": four channels and no external trigger input
        m.analog_channels = 4;
        m.features &= ~kFeatExtTrigger;
    }
    m.pods = name.back() == 'D' ? 2 : 0;
    if (m.pods > 0) m.features |= kFeatLabels;
    m.bandwidth = kEarlyDefaultBandwidth;
    for (const auto& b : kEarlyBandwidths) {
        if (name.starts_with(b.code)) m.bandwidth = b.hertz;
    }
    m.features |= kFeatEarlyDialect;
}

}  // namespace

std::optional<ModelInfo> LookUpModel(std::string_view name) {
    for (const ModelRow& row : kModels) {
        if (row.name != name) continue;
        ModelInfo m;
        m.name = std::string(name);
        for (const FamilyInfo& f : kFamilies) {
            if (row.family == f.name) m.family = &f;
        }
        m.features = TokenFeatures(*m.family);
        m.family->early ? DeriveEarly(m) : DeriveNewer(m);
        if (m.pods > 0) m.features |= kFeatDigital;
        std::uint32_t hash = 5381;  // fixed serial number per model
        for (char c : name) hash = hash * 33 + static_cast<unsigned char>(c);
        char serial[16];
        std::snprintf(serial, sizeof serial, "QN%08u", static_cast<unsigned>(hash % 100000000u));
        m.serial = serial;
        return m;
    }
    return std::nullopt;
}

std::span<const std::string_view> AllModelNames() {
    return kModelNames;
}
std::span<const FamilyInfo> AllFamilies() {
    return kFamilies;
}

}  // namespace qn::emu
