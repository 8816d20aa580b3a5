// Message framing and program-unit parsing of the emulator's SCPI input.
//
// A message ends with a line feed, except inside an IEEE 488.2 definite-length block
// ("#<n><length><bytes>"), whose bytes are taken as they are. A message holds program units
// separated by ";"; each unit is a header (common "*XXX" or a ":"-separated path, optionally
// followed by "?") and comma-separated arguments (text, quoted strings, blocks).
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "emulator/scpi_errors.h"

namespace qn::emu {

class MessageFramer {
  public:
    // Largest message accepted (blocks included); longer input is dropped up to the next
    // terminator and reported as an input buffer overrun.
    static constexpr std::size_t kMaxMessageBytes = 64u << 20;

    void Append(std::string_view bytes);
    // Next complete message without its terminator; nullopt when none is complete yet.
    std::optional<std::string> Next();
    // True once after input was dropped because a message grew beyond kMaxMessageBytes.
    bool TakeOverrun();

  private:
    enum class State { kText, kBlockData, kDiscard };
    bool Scan();  // advances scan_ to a terminator; false when more input is needed

    std::string buffer_;
    std::size_t scan_ = 0;
    State state_ = State::kText;
    char quote_ = 0;
    std::size_t block_remaining_ = 0;
    bool overrun_ = false;
};

struct Argument {
    enum class Kind { kText, kString, kBlock };
    Kind kind = Kind::kText;
    std::string value;  // text trimmed, string unquoted, block payload only
};

struct ProgramUnit {
    bool common = false;    // "*IDN?" and the like
    bool absolute = false;  // header started with ":"
    bool query = false;
    std::vector<std::string> mnemonics;
    std::vector<Argument> args;
};

struct UnitParse {
    std::optional<ProgramUnit> unit;  // empty for an empty unit or an error
    std::optional<ScpiError> error;
};

// Splits a message at the ";" separators that are outside strings and blocks.
std::vector<std::string_view> SplitUnits(std::string_view message);
UnitParse ParseUnit(std::string_view text);

// Parses an IEEE 488.2 definite-length block header at the start of `text`. On success returns
// the payload length and sets `header_length`; nullopt when `text` is not a complete header.
std::optional<std::size_t> ParseBlockHeader(std::string_view text, std::size_t& header_length);

}  // namespace qn::emu
