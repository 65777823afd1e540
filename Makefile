# Thin front over CMake. `make test` is the project's test command.
BUILD   ?= build
JOBS    ?= $(shell nproc)
CMAKE   ?= cmake
CTEST_ARGS ?= --output-on-failure -j $(JOBS)

.PHONY: all deps configure build test test-heavy check bench demo clean

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

# AddressSanitizer and UndefinedBehaviorSanitizer build of the default tests.
check: deps
	@$(CMAKE) -S . -B $(BUILD)-check -DCMAKE_BUILD_TYPE=Debug -DTESSIVOR_SANITIZE=ON -DTESSIVOR_BUILD_BENCH=OFF
	@$(CMAKE) --build $(BUILD)-check -j $(JOBS)
	@cd $(BUILD)-check && ASAN_OPTIONS=detect_leaks=1 ctest $(CTEST_ARGS) -LE heavy

bench: build
	@found=0; for b in $(BUILD)/bin/bench_*; do \
	  if [ -x "$$b" ]; then found=1; echo "== $$b"; "$$b" || exit 1; fi; \
	done; if [ $$found = 0 ]; then echo "no benchmarks built"; fi

demo: build
	@if [ -x scripts/demo.sh ]; then bash scripts/demo.sh $(BUILD); else echo "no demo yet"; fi

clean:
	rm -rf $(BUILD) $(BUILD)-check
