// Pure parsers for IEEE 488.2 reply data: the header of an arbitrary block
// (definite "#<n><len>" and indefinite "#0") and numbers in the forms an
// instrument sends (NR1, NR2, NR3, #H/#Q/#B non-decimal, INF, NAN).
// No I/O and no allocation: the caller hands in the bytes it has.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace qn::visa {

enum class BlockParse {
    kOk,         // header complete and valid
    kNeedMore,   // valid so far, more bytes needed to decide
    kNotBlock,   // the first byte is not '#'
    kMalformed,  // a non-digit where a digit must be
    kTooLarge,   // declared length above the caller's bound
};

struct BlockHeader {
    bool indefinite = false;      // "#0": data runs to the end of the message
    std::uint64_t length = 0;     // data bytes of a definite block
    std::size_t header_size = 0;  // bytes of "#<n><len>" (2 for "#0")
};

// Parses the header at the start of bytes. max_length bounds the declared
// length; it is checked before the caller allocates anything.
BlockParse ParseBlockHeader(std::string_view bytes, std::uint64_t max_length, BlockHeader* out);

enum class NumberParse {
    kOk,
    kNeedMore,  // the text ends where the number could go on (more data may follow)
    kNoNumber,  // no number at the start of the text
};

// Parses a number at the start of text (no leading blanks). *consumed is the
// length of the number's text. A number that fills the whole text gives
// kNeedMore unless at_end says no more text follows, so a caller reading a
// stream can wait for the rest. Out-of-range decimal values give +/-inf or 0
// as IEEE 754 rounding does; 9.91E37 (the instrument's "not a number") is
// returned as is.
NumberParse ParseNumber(std::string_view text, bool at_end, double* value, std::size_t* consumed);

}  // namespace qn::visa
