#include "emulator/command_tree.h"

#include <cctype>
#include <stdexcept>

namespace qn::emu {
namespace {

std::string Upper(std::string_view s) {
    std::string out(s);
    for (char& c : out) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

// Splits "CHANnel#" into short "CHAN", long "CHANNEL" and the suffix flag.
void ParsePattern(std::string_view word, CommandTree::Node& node) {
    if (!word.empty() && (word.back() == '#' || word.back() == '&')) {
        node.takes_suffix = true;
        node.suffix_from_zero = word.back() == '&';
        word.remove_suffix(1);
    }
    std::size_t n = 0;
    while (n < word.size() && !std::islower(static_cast<unsigned char>(word[n]))) ++n;
    node.short_name = Upper(word.substr(0, n));
    node.long_name = Upper(word);
}

// Splits "chan12" into the letters and the numeric suffix (-1 when absent).
std::pair<std::string, long> SplitSuffix(std::string_view mnemonic) {
    std::size_t n = mnemonic.size();
    while (n > 0 && std::isdigit(static_cast<unsigned char>(mnemonic[n - 1]))) --n;
    long suffix = -1;
    if (n < mnemonic.size()) {
        const std::string_view digits = mnemonic.substr(n);
        suffix = digits.size() > 6 ? 1000000 : std::stol(std::string(digits));
    }
    return {Upper(mnemonic.substr(0, n)), suffix};
}

}  // namespace

CommandTree::CommandTree(std::span<const std::span<const CommandSpec>> tables,
                         std::uint32_t features) {
    for (const auto& table : tables) {
        for (const CommandSpec& spec : table) {
            if ((spec.requires_features & features) == spec.requires_features) Add(spec);
        }
    }
}

void CommandTree::Add(const CommandSpec& spec) {
    Node* node = &root_;
    std::string_view path(spec.path);
    while (!path.empty()) {
        const std::size_t colon = path.find(':');
        const std::string_view word = path.substr(0, colon);
        Node pattern;
        ParsePattern(word, pattern);
        Node* child = nullptr;
        for (auto& existing : node->children) {
            if (existing->long_name == pattern.long_name) child = existing.get();
        }
        if (!child) {
            auto created = std::make_unique<Node>(std::move(pattern));
            created->parent = node;
            child = created.get();
            node->children.push_back(std::move(created));
        }
        node = child;
        path = colon == std::string_view::npos ? std::string_view() : path.substr(colon + 1);
    }
    if (spec.set) node->set = spec.set;
    if (spec.query) node->query = spec.query;
}

CommandTree::Match CommandTree::Resolve(const Node* from,
                                        std::span<const std::string> mnemonics) const {
    Match match;
    const Node* node = from;
    for (const std::string& mnemonic : mnemonics) {
        const auto [letters, suffix] = SplitSuffix(mnemonic);
        const Node* next = nullptr;
        for (const auto& child : node->children) {
            if (letters != child->short_name && letters != child->long_name) continue;
            if (suffix >= 0 && !child->takes_suffix) continue;
            next = child.get();
            break;
        }
        if (!next) return Match{};
        if (next->takes_suffix) {
            if ((suffix == 0 && !next->suffix_from_zero) || suffix > 99)
                match.suffix_out_of_range = true;
            match.suffixes.push_back(suffix < 0 ? 1 : static_cast<int>(suffix));
        }
        node = next;
    }
    match.node = node;
    return match;
}

}  // namespace qn::emu
