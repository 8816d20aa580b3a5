// The subcommands of qn731xx.
#pragma once

#include <span>

namespace qn::tools {

int InfoCommand(std::span<char*> args);
int FetchCommand(std::span<char*> args);
int DemoCommand(std::span<char*> args);
int ChannelCommand(std::span<char*> args);
int TimebaseCommand(std::span<char*> args);
int MeasureCommand(std::span<char*> args);
int DigitalCommand(std::span<char*> args);
int SystemCommand(std::span<char*> args);
int ScreenshotCommand(std::span<char*> args);
int SetupCommand(std::span<char*> args);
int ScpiCommand(std::span<char*> args);
int TriggerCommand(std::span<char*> args);

}  // namespace qn::tools
