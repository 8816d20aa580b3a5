// Every enumeration value constant of the C header equals the driver's
// enumeration value of the same name (QN731XX_VAL_TRIGGER_AC_LINE and
// Quorlen731XXTriggerACLine alike, compared without case and underscores).
#include <gtest/gtest.h>

#include <cctype>
#include <fstream>
#include <map>
#include <regex>
#include <string>

namespace {

// The name → value pairs that `pattern` (name, then value) finds in `file`.
std::map<std::string, long> Values(const std::string& file, const std::regex& pattern) {
    std::map<std::string, long> out;
    std::ifstream in(std::string(QN_INCLUDE_DIR) + "/" + file);
    EXPECT_TRUE(in) << file;
    for (std::string line; std::getline(in, line);) {
        std::smatch m;
        if (!std::regex_search(line, m, pattern)) continue;
        std::string key;
        for (char c : m[1].str())
            if (c != '_') key += char(std::toupper(static_cast<unsigned char>(c)));
        EXPECT_FALSE(out.count(key) && out[key] != std::stol(m[2])) << key;
        out[key] = std::stol(m[2]);
    }
    return out;
}

TEST(EnumValues, EveryCConstantEqualsTheDriversValueOfTheSameName) {
    const auto c = Values("Qn731XX.h", std::regex(R"(^#define QN731XX_VAL_(\w+) (-?\d+)L$)"));
    const auto driver =
        Values("Quorlen731XXEnums.h", std::regex(R"(^ *Quorlen731XX(\w+) = (-?\d+),)"));
    EXPECT_GT(c.size(), 140u);
    for (const auto& [name, value] : c) {
        const auto it = driver.find(name);
        ASSERT_NE(it, driver.end()) << name << " has no driver value";
        EXPECT_EQ(it->second, value) << name;
    }
}

}  // namespace
