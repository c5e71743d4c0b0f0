# Vantorel: the two commands of the README (make run, make test), and make bench.
# Every dependency is a Debian package installed by scripts/install-deps.

JOBS ?= $(shell nproc 2>/dev/null || echo 2)
ASAN_DIR := build/asan
RELEASE_DIR := build/release
CMAKE_FLAGS ?=

.PHONY: all deps build test run bench clean

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

clean:
	rm -rf build
