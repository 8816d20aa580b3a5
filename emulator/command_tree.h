// Table-driven SCPI command tree.
//
// Commands are declared as data: a path such as "CHANnel#:PROBe:SKEW" (upper-case letters are
// the short form, the whole word the long form, "#" allows a numeric suffix from 1, "&" one
// from 0), a set handler, a query handler and the model features the command needs. The tree is built per instrument from
// the rows whose features the model has, so a missing feature makes an undefined header.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "emulator/scpi_parser.h"

namespace qn::emu {

class Instrument;

// What one program unit hands to its handler. Handlers report problems with
// Instrument::Error and append query replies to `reply`.
struct Call {
    std::vector<int> suffixes;  // numeric suffixes of the "#" mnemonics, in path order
    const std::vector<Argument>* args = nullptr;
    std::string reply;
    // A reply kept in memory and sent as it is, terminator included, when it is the message's
    // only reply (no copy of a large block); used instead of `reply` when set.
    std::shared_ptr<const std::string> prepared;

    int suffix(std::size_t i = 0) const { return i < suffixes.size() ? suffixes[i] : 1; }
    std::size_t arg_count() const { return args->size(); }
    const Argument& arg(std::size_t i) const { return (*args)[i]; }
};

using Handler = void (*)(Instrument&, Call&);

struct CommandSpec {
    const char* path;
    Handler set = nullptr;
    Handler query = nullptr;
    std::uint32_t requires_features = 0;  // bits of ModelFeature, all needed
};

class CommandTree {
  public:
    struct Node {
        std::string short_name;  // upper case
        std::string long_name;   // upper case
        bool takes_suffix = false;
        bool suffix_from_zero = false;  // "&" in the pattern: numbered from 0
        Handler set = nullptr;
        Handler query = nullptr;
        Node* parent = nullptr;
        std::vector<std::unique_ptr<Node>> children;
    };

    // Builds the tree from the rows whose required features are all in `features`.
    CommandTree(std::span<const std::span<const CommandSpec>> tables, std::uint32_t features);

    const Node* root() const { return &root_; }

    struct Match {
        const Node* node = nullptr;
        std::vector<int> suffixes;  // suffixes of the matched path below `from`
        bool suffix_out_of_range = false;
    };
    // Walks `mnemonics` down from `from`; node is null when a mnemonic is unknown.
    Match Resolve(const Node* from, std::span<const std::string> mnemonics) const;

  private:
    void Add(const CommandSpec& spec);

    Node root_;
};

}  // namespace qn::emu
