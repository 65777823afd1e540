# Thin front over CMake. `make test` is the project's test command.
BUILD   ?= build
JOBS    ?= $(shell nproc)
CMAKE   ?= cmake
CTEST_ARGS ?= --output-on-failure -j $(JOBS)

.PHONY: all deps configure build test test-heavy check fuzz fuzz-smoke bench demo clean

all: build

deps:
	@bash scripts/install-deps.sh

configure: deps
	@$(CMAKE) -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release

build: configure
	@$(CMAKE) --build $(BUILD) -j $(JOBS)

# Default tests: everything but the heavy end-to-end cases.
test: build
	@cd $(BUILD) && ctest $(CTEST_ARGS) -LE heavy

# The heavy cases (full-size simulated scenes), separately.
test-heavy: build
	@cd $(BUILD) && ctest $(CTEST_ARGS) -L heavy

# AddressSanitizer and UndefinedBehaviorSanitizer build of the default tests
# (-O1: a Debug build at -O0 runs the scene tests several times slower).
check: deps
	@$(CMAKE) -S . -B $(BUILD)-check -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_FLAGS_DEBUG="-O1 -g" \
	  -DCMAKE_C_FLAGS_DEBUG="-O1 -g" -DTESSIVOR_SANITIZE=ON -DTESSIVOR_BUILD_BENCH=OFF
	@$(CMAKE) --build $(BUILD)-check -j $(JOBS)
	@cd $(BUILD)-check && ASAN_OPTIONS=detect_leaks=1 ctest $(CTEST_ARGS) -LE heavy

# libFuzzer targets of the file readers (clang, ASan, UBSan) in $(BUILD)-fuzz;
# their seed inputs are made from the simulator's files at build time.
fuzz: deps
	@CC=clang-14 CXX=clang++-14 $(CMAKE) -S . -B $(BUILD)-fuzz -DCMAKE_BUILD_TYPE=RelWithDebInfo \
	  -DTESSIVOR_FUZZ=ON -DTESSIVOR_BUILD_TESTS=OFF -DTESSIVOR_BUILD_BENCH=OFF
	@$(CMAKE) --build $(BUILD)-fuzz -j $(JOBS) --target fuzz_targets sarsim
	@bash fuzz/make_seeds.sh $(BUILD)-fuzz

# Each fuzz target for FUZZ_SECONDS (default 20 s).
FUZZ_SECONDS ?= 20
fuzz-smoke: fuzz
	@FUZZ_BUILD=$(BUILD)-fuzz bash scripts/fuzz.sh $(FUZZ_SECONDS)

bench: build
	@found=0; for b in $(BUILD)/bin/bench_*; do \
	  if [ -x "$$b" ]; then found=1; echo "== $$b"; "$$b" || exit 1; fi; \
	done; if [ $$found = 0 ]; then echo "no benchmarks built"; fi

demo: build
	@if [ -x scripts/demo.sh ]; then bash scripts/demo.sh $(BUILD); else echo "no demo yet"; fi

clean:
	rm -rf $(BUILD) $(BUILD)-check $(BUILD)-fuzz
