# Vantorel: the two commands of the README (make run, make test), make bench and make fuzz.
# Every dependency is a Debian package installed by scripts/install-deps.

JOBS ?= $(shell nproc 2>/dev/null || echo 2)
ASAN_DIR := build/asan
RELEASE_DIR := build/release
CMAKE_FLAGS ?=

BENCH_DIR := build/bench
BENCH_FLAGS ?= --benchmark_min_time=0.5

FUZZ_DIR := build/fuzz
FUZZ_SECONDS ?= 60
FUZZ_TARGETS ?=

.PHONY: all deps build test run bench fuzz clean

all: build

deps:
	@scripts/install-deps

# Optimised build of the programs (make run uses it).
build: deps
	@cmake -S . -B $(RELEASE_DIR) -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo -DVANTOREL_TESTS=OFF $(CMAKE_FLAGS) >/dev/null
	@cmake --build $(RELEASE_DIR) -j $(JOBS)

# Every test, built with AddressSanitizer and UndefinedBehaviorSanitizer.
test: deps
	@cmake -S . -B $(ASAN_DIR) -G Ninja -DCMAKE_BUILD_TYPE=Debug -DVANTOREL_SANITIZE=ON $(CMAKE_FLAGS) >/dev/null
	@cmake --build $(ASAN_DIR) -j $(JOBS)
	@cd $(ASAN_DIR) && ctest --output-on-failure -j $(JOBS)

# The main job on the embedded default: the monitor on the built-in modem emulator
# (an in-process telephony service on its own thread), live: the window, or the
# terminal view on a machine without a display.
run: build
	@$(RELEASE_DIR)/src/vantorel

# Google Benchmark figures (docs/performance.md): QMDL deframing, routing, tree building.
bench: deps
	@cmake -S . -B $(BENCH_DIR) -G Ninja -DCMAKE_BUILD_TYPE=Release -DVANTOREL_TESTS=OFF -DVANTOREL_BENCH=ON $(CMAKE_FLAGS) >/dev/null
	@cmake --build $(BENCH_DIR) -j $(JOBS) --target vantorel-bench
	@$(BENCH_DIR)/bench/vantorel-bench $(BENCH_FLAGS)

# libFuzzer on every reader of untrusted bytes (docs/reliability.md): clang, ASan+UBSan,
# FUZZ_SECONDS per target (FUZZ_TARGETS to pick some); fails naming each input that crashed one.
fuzz: deps
	@cmake -S . -B $(FUZZ_DIR) -G Ninja -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_BUILD_TYPE=RelWithDebInfo \
		-DVANTOREL_TESTS=OFF -DVANTOREL_SANITIZE=ON -DVANTOREL_FUZZ=ON $(CMAKE_FLAGS) >/dev/null
	@cmake --build $(FUZZ_DIR) -j $(JOBS) --target vantorel-fuzz
	@tests/fuzz/run-fuzzers $(FUZZ_DIR) $(FUZZ_SECONDS) $(FUZZ_TARGETS)

clean:
	rm -rf build
