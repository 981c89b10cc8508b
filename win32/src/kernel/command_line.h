// Splitting a Windows command line into a program's arguments.
#pragma once

#include <string>
#include <vector>

namespace vkw32 {

// The arguments a Windows program's runtime makes of a command line, the
// program's name first. Leading white space is skipped, so that the first
// argument always names the program.
std::vector<std::string> SplitCommandLine(const char* commandLine);

} // namespace vkw32
