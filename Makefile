# Front door for building, testing and benchmarking vexil.
# `make test` installs what is missing, builds and runs every test; `make asan`/`make tsan` do the same under sanitizers.

BUILD      ?= build
GENERATOR  ?= Ninja
BUILD_TYPE ?= RelWithDebInfo
JOBS       ?= $(shell nproc 2>/dev/null || echo 2)
CTEST      = ctest --output-on-failure --timeout 300 -j $(JOBS)

WINDOWS_BUILD   ?= build-windows
WINDOWS_SYSROOT  = $(abspath $(WINDOWS_BUILD))/sysroot
WINE_ENV         = WINEPREFIX=$(abspath $(WINDOWS_BUILD))/wineprefix WINEARCH=win32 WINEDEBUG=-all

COVERAGE_BUILD ?= build-coverage

FUZZ_BUILD   ?= build-fuzz
FUZZ_SECONDS ?= 60

STRESS_RUNS ?= 10

.PHONY: all deps configure build test stress demo package bench asan tsan coverage fuzz clean windows-deps windows test-windows

all: build

deps:
	scripts/install-deps.sh

configure: deps
	cmake -S . -B $(BUILD) -G $(GENERATOR) -DCMAKE_BUILD_TYPE=$(BUILD_TYPE)

build: configure
	cmake --build $(BUILD)

test: build
	$(CTEST) --test-dir $(BUILD)

# The whole suite STRESS_RUNS times, four tests at a time whatever the cores: the load under
# which a test that races its own threads shows itself. Fails when any run failed.
stress: build
	scripts/stress.sh $(BUILD) $(STRESS_RUNS) 4

# clangd and pylsp over the example projects, and a watcher over a temporary directory.
demo: build
	$(BUILD)/tools/vexil/vexil demo

# Debian packages in $(BUILD)/packages: libvexil0, libvexil-dev and vexil.
package: build
	cd $(BUILD) && cpack

# The memory check runs first, in a process of its own, so that no other benchmark's freed
# memory hides its growth. The other repetitions are interleaved at random, so a load that
# comes and goes on a shared machine weighs on a figure and its floor alike. Among them runs
# the JavaScript client compared with vexil; when it cannot be installed (no node or npm, no
# registry) the install says why, and the report names the comparison skipped beside every
# other figure.
bench: build
	cmake --build $(BUILD) --target vexil_bench
	scripts/install-bench-js.sh || true
	$(BUILD)/bench/vexil_bench --benchmark_filter=Memory \
	  --benchmark_out=$(BUILD)/bench/memory.json --benchmark_out_format=json
	$(BUILD)/bench/vexil_bench --benchmark_filter=-Memory --benchmark_enable_random_interleaving=true \
	  --benchmark_out=$(BUILD)/bench/figures.json --benchmark_out_format=json
	python3 scripts/bench-report.py $(BUILD)/bench/results.json $(BUILD)/bench/figures.json $(BUILD)/bench/memory.json

asan: deps
	cmake -S . -B build-asan -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Debug -DVEXIL_SANITIZE=address,undefined
	cmake --build build-asan
	ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1 $(CTEST) --test-dir build-asan

tsan: deps
	cmake -S . -B build-tsan -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Debug -DVEXIL_SANITIZE=thread
	cmake --build build-tsan
	TSAN_OPTIONS=halt_on_error=1:second_deadlock_stack=1 $(CTEST) --test-dir build-tsan

# Line and branch coverage of src/ by the whole suite, from an instrumented build of its own.
# Counters are reset first, so the figures are those of this run alone; the report is printed
# even when a test failed, and the target then fails with the suite.
coverage:
	scripts/install-coverage-deps.sh
	cmake -S . -B $(COVERAGE_BUILD) -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Debug -DVEXIL_COVERAGE=ON \
	  -DVEXIL_BUILD_BENCH=OFF
	cmake --build $(COVERAGE_BUILD)
	find $(COVERAGE_BUILD) -name '*.gcda' -delete
	$(CTEST) --test-dir $(COVERAGE_BUILD); status=$$?; \
	gcovr --root . --filter 'src/' --exclude-unreachable-branches --exclude-throw-branches \
	  --print-summary --txt $(COVERAGE_BUILD)/coverage.txt $(COVERAGE_BUILD) && exit $$status

# libFuzzer targets under address and undefined-behaviour sanitizers, built with clang in a
# directory of their own; each runs FUZZ_SECONDS from the corpus in tests/fuzz/corpus.
fuzz:
	scripts/install-fuzz-deps.sh
	cmake -S . -B $(FUZZ_BUILD) -G $(GENERATOR) -DCMAKE_BUILD_TYPE=RelWithDebInfo \
	  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
	  -DVEXIL_FUZZ=ON -DVEXIL_SANITIZE=address,undefined -DVEXIL_BUILD_BENCH=OFF
	cmake --build $(FUZZ_BUILD) --target vexil_fuzz
	scripts/run-fuzz.sh $(FUZZ_BUILD) $(FUZZ_SECONDS)

# The 32-bit Windows DLL, cross-built with mingw-w64; its tests run under wine.
windows-deps:
	scripts/install-windows-deps.sh $(WINDOWS_SYSROOT)

windows: windows-deps
	cmake -S . -B $(WINDOWS_BUILD) -G $(GENERATOR) -DCMAKE_BUILD_TYPE=Release \
	  -DCMAKE_TOOLCHAIN_FILE=$(CURDIR)/cmake/toolchain-mingw32.cmake \
	  -DVEXIL_WINDOWS_SYSROOT=$(WINDOWS_SYSROOT) -DCMAKE_PREFIX_PATH=$(WINDOWS_SYSROOT)
	cmake --build $(WINDOWS_BUILD)
	scripts/check-windows-exports.sh $(WINDOWS_BUILD)/bin/vexil.dll

# A persistent wineserver saves every test the server's start-up, and wine's own services,
# started once here, do not inherit (and hold open) the output pipes of the tests.
test-windows: windows
	$(WINE_ENV) wineserver -k >/dev/null 2>&1 || true
	mkdir -p $(WINDOWS_BUILD)/wineprefix
	$(WINE_ENV) wineserver -p
	$(WINE_ENV) wineboot -i >/dev/null 2>&1 || true
	$(WINE_ENV) $(CTEST) --test-dir $(WINDOWS_BUILD); status=$$?; $(WINE_ENV) wineserver -k; exit $$status

clean:
	rm -rf $(BUILD) build-asan build-tsan $(COVERAGE_BUILD) $(FUZZ_BUILD) $(WINDOWS_BUILD)
