// Stand-in for runscr in Wine tests, where no Tcl shell runs: it checks that it got exactly one
// argument naming a readable driver script, copies that script to driver.tcl in the working
// folder so the test can compare it with the one made on Linux, and says what it did. It ends
// with 0, or 3 when the check fails.
#include <cstdio>
#include <string>

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "runscr stand-in: expected one argument, got %d\n", argc - 1);
    return 3;
  }
  std::FILE* in = std::fopen(argv[1], "rb");
  if (in == nullptr) {
    std::fprintf(stderr, "runscr stand-in: cannot read the driver script\n");
    return 3;
  }
  std::string script;
  char buffer[8192];
  for (size_t got; (got = std::fread(buffer, 1, sizeof buffer, in)) > 0;)
    script.append(buffer, got);
  std::fclose(in);
  std::FILE* out = std::fopen("driver.tcl", "wb");
  if (out == nullptr || std::fwrite(script.data(), 1, script.size(), out) != script.size() ||
      std::fclose(out) != 0) {
    std::fprintf(stderr, "runscr stand-in: cannot write driver.tcl\n");
    return 3;
  }
  std::printf("runscr stand-in: %zu bytes\n", script.size());
  return 0;
}
