// Process start-up on POSIX systems: the command line is already bytes, and the standard
// streams never translate line ends.
#include <string>
#include <vector>

#include "platform/hostkit.h"

std::vector<std::string> Host::Process::startup(int argc, char** argv) {
  return std::vector<std::string>(argv, argv + argc);
}
