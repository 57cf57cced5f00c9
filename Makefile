# Front door for building, testing and benchmarking vexil.
# `make test` installs what is missing, builds and runs every test; `make asan`/`make tsan` do the same under sanitizers.

BUILD      ?= build
GENERATOR  ?= Ninja
BUILD_TYPE ?= RelWithDebInfo
JOBS       ?= $(shell nproc 2>/dev/null || echo 2)
CTEST      = ctest --output-on-failure --timeout 300 -j $(JOBS)

.PHONY: all deps configure build test bench asan tsan clean

all: build

deps:
	scripts/install-deps.sh

configure: deps
	cmake -S . -B $(BUILD) -G $(GENERATOR) -DCMAKE_BUILD_TYPE=$(BUILD_TYPE)

build: configure
	cmake --build $(BUILD)

test: build
	$(CTEST) --test-dir $(BUILD)

bench: build
	cmake --build $(BUILD) --target vexil_bench vexil_watch_bench
	$(BUILD)/bench/vexil_bench
	$(BUILD)/bench/vexil_watch_bench

asan: deps
	cmake -S . -B build-asan -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Debug -DVEXIL_SANITIZE=address,undefined
	cmake --build build-asan
	ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1 $(CTEST) --test-dir build-asan

tsan: deps
	cmake -S . -B build-tsan -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Debug -DVEXIL_SANITIZE=thread
	cmake --build build-tsan
	TSAN_OPTIONS=halt_on_error=1:second_deadlock_stack=1 $(CTEST) --test-dir build-tsan

clean:
	rm -rf $(BUILD) build-asan build-tsan
