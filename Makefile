# Front door of the project. `make run` and `make test` install what they
# need first (scripts/install-deps.sh), so both work from a fresh clone.

BUILD ?= build
BUILD_ASAN ?= build-asan
# Benchmarks build optimised in a directory of their own, whatever BUILD is.
BUILD_BENCH ?= build-bench
BENCH_ARGS ?= --benchmark_repetitions=5
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?=
GENERATOR := $(shell command -v ninja >/dev/null 2>&1 && echo "-G Ninja")

export QT_QPA_PLATFORM ?= offscreen

.PHONY: deps configure build run test asan-test bench format format-check clean

deps:
	@bash scripts/install-deps.sh

configure: deps
	@test -f $(BUILD)/CMakeCache.txt || cmake -S . -B $(BUILD) $(GENERATOR) $(CMAKE_FLAGS)

build: configure
	cmake --build $(BUILD) -j $(JOBS)

run: build
	@bash scripts/run-demo.sh $(BUILD)

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

asan-test: deps
	@test -f $(BUILD_ASAN)/CMakeCache.txt || cmake -S . -B $(BUILD_ASAN) $(GENERATOR) \
	  -DCMAKE_BUILD_TYPE=Debug -DBELVANE_SANITIZE=ON -DBELVANE_WERROR=ON -DBELVANE_BUILD_BENCH=OFF $(CMAKE_FLAGS)
	cmake --build $(BUILD_ASAN) -j $(JOBS)
	cd $(BUILD_ASAN) && ASAN_OPTIONS=detect_leaks=0 ctest --output-on-failure -j $(JOBS)

# Every benchmark program, then one table of every goal (each ratio against a
# baseline measured in the same program run).
bench: deps
	@test -f $(BUILD_BENCH)/CMakeCache.txt || cmake -S . -B $(BUILD_BENCH) $(GENERATOR) \
	  -DCMAKE_BUILD_TYPE=RelWithDebInfo -DBELVANE_BUILD_TESTS=OFF $(CMAKE_FLAGS)
	cmake --build $(BUILD_BENCH) -j $(JOBS)
	@rm -f $(BUILD_BENCH)/bench-goals.tsv
	@set -e; for b in $(BUILD_BENCH)/bench/*/bench_*; do \
	  if test -x $$b; then echo "== $$b"; \
	    BELVANE_BENCH_GOALS=$(abspath $(BUILD_BENCH))/bench-goals.tsv $$b $(BENCH_ARGS); fi; done
	@echo; bash scripts/bench-summary.sh $(BUILD_BENCH)/bench-goals.tsv

format:
	find src apps tests bench examples fuzz -name '*.cpp' -o -name '*.hpp' 2>/dev/null | xargs clang-format -i

format-check:
	find src apps tests bench examples fuzz -name '*.cpp' -o -name '*.hpp' 2>/dev/null | xargs clang-format --dry-run --Werror

clean:
	rm -rf $(BUILD) $(BUILD_ASAN) $(BUILD_BENCH)
