# Thin wrapper around CMake + Ninja.
#   make                    the program (and runscr next to it); needs no GoogleTest
#   make test               configures and builds the tests, then runs them
#   make test-asan          the same under AddressSanitizer and UBSan
#   make fuzz FUZZ_SECONDS=N  builds the fuzz targets with clang and runs each for N seconds
#   make install PREFIX=DIR / make uninstall
BUILD        ?= build
ASAN_BUILD   ?= build-asan
FUZZ_BUILD   ?= build-fuzz
PREFIX       ?= /usr/local
JOBS         ?= $(shell nproc)
FUZZ_SECONDS ?= 60
FUZZ_CXX     ?= clang++

.PHONY: all build test test-asan fuzz demo install uninstall bench clean

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

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(FUZZ_BUILD)
