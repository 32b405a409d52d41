# Thin wrapper around CMake + Ninja.
#   make                    the program (and runscr next to it); needs no GoogleTest
#   make test               configures and builds the tests, then runs them
#   make test-asan          the same under AddressSanitizer and UBSan
#   make fuzz FUZZ_SECONDS=N  builds the fuzz targets with clang and runs each for N seconds
#   make install PREFIX=DIR / make uninstall
#   make format / make check-format   clang-format the C++ files, or only check them
#   make tidy               clang-tidy (.clang-tidy) over the program's and libraries' sources
BUILD        ?= build
ASAN_BUILD   ?= build-asan
FUZZ_BUILD   ?= build-fuzz
PREFIX       ?= /usr/local
JOBS         ?= $(shell nproc)
FUZZ_SECONDS ?= 60
FUZZ_CXX     ?= clang++

.PHONY: all build test test-asan fuzz demo install uninstall bench clean format check-format tidy

all: build

# A fresh build folder leaves the tests out; `make test` switches them on in the same folder.
$(BUILD)/build.ninja:
	cmake -S . -B $(BUILD) -G Ninja -DCMAKE_BUILD_TYPE=Release -DPINFORGE_TESTS=OFF

build: $(BUILD)/build.ninja
	cmake --build $(BUILD) -j $(JOBS) --target pinforge

test: $(BUILD)/build.ninja
	cmake -S . -B $(BUILD) -DPINFORGE_TESTS=ON
	cmake --build $(BUILD) -j $(JOBS)
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

test-asan:
	cmake -S . -B $(ASAN_BUILD) -G Ninja -DCMAKE_BUILD_TYPE=Debug -DPINFORGE_SANITIZE=ON -DPINFORGE_TESTS=ON
	cmake --build $(ASAN_BUILD) -j $(JOBS)
	cd $(ASAN_BUILD) && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 ctest --output-on-failure -j $(JOBS)

fuzz:
	cmake -S . -B $(FUZZ_BUILD) -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo \
	  -DCMAKE_CXX_COMPILER=$(FUZZ_CXX) -DPINFORGE_FUZZ=ON -DPINFORGE_TESTS=OFF
	cmake --build $(FUZZ_BUILD) -j $(JOBS)
	sh tools/fuzz.sh $(FUZZ_BUILD) $(FUZZ_SECONDS)

demo: build
	sh examples/demo.sh $(BUILD)/pinforge $(BUILD)/demo

install: build
	cmake --install $(BUILD) --prefix $(PREFIX)

uninstall:
	cmake -DMANIFEST=$(abspath $(BUILD))/install_manifest.txt -P cmake/PinforgeUninstall.cmake

bench: build
	sh bench/run.sh $(BUILD)/pinforge

format:
	sh tools/format.sh

check-format:
	sh tools/format.sh --check

tidy: $(BUILD)/build.ninja
	run-clang-tidy -quiet -p $(BUILD) '$(CURDIR)/(src|lib)/'

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(FUZZ_BUILD)

# Windows: pinforge.exe cross-compiled with MinGW-w64 and tested under Wine (docs/windows.md).
#   make windows         build-windows/pinforge.exe, with runscr.cmd beside it
#   make test-windows    the Windows test binaries and the golden cases under Wine
#   make dist-windows    build-windows/pinforge-windows.zip for Windows users
WIN_BUILD ?= build-windows
WIN_DIST  := $(WIN_BUILD)/dist/pinforge

.PHONY: windows test-windows dist-windows clean-windows

$(WIN_BUILD)/build.ninja:
	cmake -S . -B $(WIN_BUILD) -G Ninja -DCMAKE_BUILD_TYPE=Release \
	  -DCMAKE_TOOLCHAIN_FILE=cmake/mingw-w64.cmake -DPINFORGE_TESTS=OFF

windows: $(WIN_BUILD)/build.ninja
	cmake --build $(WIN_BUILD) -j $(JOBS) --target pinforge

# The golden cases run through the Linux test binary against pinforge.exe, so both builds
# take part.
test-windows: $(WIN_BUILD)/build.ninja $(BUILD)/build.ninja
	cmake -S . -B $(WIN_BUILD) -DPINFORGE_TESTS=ON
	cmake --build $(WIN_BUILD) -j $(JOBS)
	cmake -S . -B $(BUILD) -DPINFORGE_TESTS=ON
	cmake --build $(BUILD) -j $(JOBS) --target pinforge test_core
	sh tools/test-windows.sh $(WIN_BUILD) $(BUILD)

# The same layout an install has, so the program finds what lies beside it the same way.
dist-windows: windows
	rm -rf $(WIN_BUILD)/dist $(WIN_BUILD)/pinforge-windows.zip
	mkdir -p $(WIN_DIST)/bin $(WIN_DIST)/share/pinforge $(WIN_DIST)/doc
	cp $(WIN_BUILD)/pinforge.exe tools/runscr.cmd $(WIN_DIST)/bin/
	cp -R templates $(WIN_DIST)/share/pinforge/templates
	cp -R README.md docs/. $(WIN_DIST)/doc/
	cp tools/windows/README.txt $(WIN_DIST)/README.txt
	cd $(WIN_BUILD)/dist && cmake -E tar cf ../pinforge-windows.zip --format=zip pinforge

clean-windows:
	rm -rf $(WIN_BUILD)
