// Fuzzes the driver's own text parsers with arbitrary instrument replies and
// option strings: the numeric reply parser, the error-query reply parser and
// the option-string grammar. None may crash, hang or read out of bounds.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "core/inherent.h"
#include "core/options.h"
#include "io/command_format.h"
#include "io/reply_number.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string_view text(reinterpret_cast<const char*>(data), size);

    qn::ReplyNumber n = qn::ParseReplyNumber(text);
    if (!n.found && n.value != 0.0) __builtin_trap();
    (void)qn::ReplyToLong(n);
    (void)qn::ReplyToShort(n);
    (void)qn::ReplyToBool(n);
    (void)qn::ReplyToFloat(n);

    long code = 0;
    std::string message;
    if (qn::ParseErrorQueryReply(text, &code, &message) && message.size() >= size) __builtin_trap();

    for (const qn::OptionPair& p : qn::ParseOptionPairs(text))
        if (p.name.find(',') != std::string::npos || p.value.find('=') != std::string::npos)
            __builtin_trap();
    (void)qn::SplitDriverSetup(text);

    // A command format taken from the input, with one argument of each kind.
    std::string formatted = qn::FormatCommandArgs(text, 1, 2.5, std::string_view("x"));
    (void)formatted;
    return 0;
}
