// Parsing of the instrument's error-queue reply.
#include <climits>

#include "core/inherent.h"

namespace qn {

bool ParseErrorQueryReply(std::string_view reply, long* code, std::string* message) {
    std::size_t i = 0;
    while (i < reply.size() && (reply[i] == ' ' || (reply[i] >= '\t' && reply[i] <= '\r'))) ++i;
    bool negative = false;
    if (i < reply.size() && (reply[i] == '+' || reply[i] == '-')) negative = reply[i++] == '-';
    std::size_t digits = i;
    long long v = 0;
    for (; i < reply.size() && reply[i] >= '0' && reply[i] <= '9'; ++i)
        if (v < LLONG_MAX / 10 - 10) v = v * 10 + (reply[i] - '0');
    if (i == digits) return false;
    if (i >= reply.size() || reply[i] != ',') return false;
    if (++i >= reply.size() || reply[i] != '"') return false;
    std::size_t start = ++i;
    while (i < reply.size() && reply[i] != '"' && reply[i] != '\'') ++i;
    if (i == start) return false;  // the message must hold at least one character
    v = negative ? -v : v;
    *code = static_cast<long>(v < INT_MIN ? INT_MIN : v > INT_MAX ? INT_MAX : v);
    *message = std::string(reply.substr(start, i - start));
    return true;
}

}  // namespace qn
