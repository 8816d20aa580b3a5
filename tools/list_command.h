// qn731xx list: the resources this machine can reach (list_command.cpp).
#pragma once

#include <span>

namespace qn::tools {

int ListCommand(std::span<char*> args);

}  // namespace qn::tools
