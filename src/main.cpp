// Process entry of pinforge: one process performs one run.
#include <string>
#include <vector>

#include "front_end.h"
#include "platform/hostkit.h"

int main(int argc, char** argv) {
  std::vector<std::string> words = Host::Process::startup(argc, argv);
  std::vector<char*> arguments;
  for (std::string& word : words) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  return runFrontEnd(static_cast<int>(words.size()), arguments.data());
}
