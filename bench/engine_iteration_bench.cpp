// Cost of port lists and iterations with bus expansion over designs of a million bits and
// more: wall time and peak memory for a few shapes of design (many small buses, one huge bus).
// Build: g++ -O2 -std=c++20 -Isrc bench/engine_iteration_bench.cpp <engine and data libraries>
#include <sys/resource.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "engine/forge.h"

namespace {

struct Shape {
  const char* name;
  int buses;
  int bitsPerBus;
};

long peakKilobytes() {
  rusage usage{};
  getrusage(RUSAGE_SELF, &usage);
  return usage.ru_maxrss;
}

double runOnce(const Shape& shape, const char* templateText) {
  StbDataList data("p", "m", "f", "e", "t", "", "t", "d");
  for (int i = 0; i < shape.buses; ++i)
    data.appendOwned(new PortRecord("b" + std::to_string(i), shape.bitsPerBus - 1, 0, 'I'));
  std::FILE* in = std::tmpfile();
  std::fputs(templateText, in);
  std::rewind(in);
  std::FILE* out = std::fopen("/dev/null", "w");
  const auto start = std::chrono::steady_clock::now();
  {
    Forge forge(out, in, nullptr, &data);
    forge.processTemplate();
  }
  const std::chrono::duration<double> took = std::chrono::steady_clock::now() - start;
  std::fclose(out);
  std::fclose(in);
  return took.count();
}

}  // namespace

int main() {
  const Shape shapes[] = {{"1000 x 1000 bits", 1000, 1000},
                          {"2000 x 1000 bits", 2000, 1000},
                          {"1 x 1000000 bits", 1, 1000000},
                          {"1 x 2000000 bits", 1, 2000000}};
  const char* templates[] = {"@EXPANDBUS@%port%",
                             "@EXPANDBUS@@ITERATE@%PORT%@ITERATOR@ @VHDL_TYPEDEC@@ENDITERATE@"};
  for (const Shape& shape : shapes) {
    for (const char* templateText : templates) {
      const double seconds = runOnce(shape, templateText);
      std::printf("%-18s %-62s %7.3f s  peak %ld kB\n", shape.name, templateText, seconds,
                  peakKilobytes());
    }
  }
  return 0;
}
