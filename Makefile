# Short names for what the presets, CMake and the scripts do; nothing is built or tested here only.

PREFIX ?= /usr/local
FUZZ_SECONDS ?= 60
MUTANTS ?= 40
SEED ?= 1
CMAKE_BUILD_PARALLEL_LEVEL ?= $(shell nproc)
CTEST_PARALLEL_LEVEL ?= $(shell nproc)
export CMAKE_BUILD_PARALLEL_LEVEL CTEST_PARALLEL_LEVEL

# What clang-format looks after: every source that is tracked or about to be.
sources = git ls-files -z --cached --others --exclude-standard -- '*.h' '*.cpp'

MAKEFLAGS += --no-print-directory
.NOTPARALLEL:
.PHONY: help build demo test bench instructions install format format-check tidy fuzz locales valgrind \
        coverage mutants thorough clean packages-build packages-test packages-coverage packages-bench \
        packages-ci

help: ## list these targets
	@sed -nE 's/^([a-z-]+):[^#]*## (.*)/  make \1\t\2/p' Makefile | expand -t 20

build: ## build the command: build/release/oxmv
	cmake --preset release
	cmake --build --preset release

demo: packages-build build ## install what the build needs, build, and show the command at work
	packaging/demo

test: packages-test ## install what the tests need, build and run every test
	cmake --preset dev
	cmake --build --preset dev
	ctest --preset dev

coverage: packages-coverage ## count the lines that the tests reach: build/coverage/report/index.html
	cmake --preset coverage
	cmake --build --preset coverage
	packaging/coverage build/coverage

# Where a slip costs most: what reads, writes and edits streams, what holds their values, and what
# imports looks.
mutated = $(addprefix oxmv/metadata/TagStream,Decoder.cpp Encoder.cpp Editor.cpp) \
  $(addprefix oxmv/values/,BlockBuilder.cpp Table.cpp) \
  $(addprefix oxmv/looks/,HexTable.cpp LookDescription.cpp LookImport.cpp LookTableFile.cpp)

mutants: packages-coverage ## see whether tests notice MUTANTS (40) changes of each of some sources
	packaging/mutants --seed $(SEED) --count $(MUTANTS) $(mutated)

bench: packages-bench ## measure: install what that needs, build, run the benchmarks
	cmake --preset release -B build/bench -D OXMV_BENCH=ON
	cmake --build build/bench --target bench

instructions: packages-bench ## compare the instruction counts of the hot paths with those on record
	cmake --preset release -B build/bench -D OXMV_BENCH=ON
	cmake --build build/bench --target oxmv_hot_path
	bench/count-instructions build/bench/bench/oxmv_hot_path

install: build ## install below PREFIX, by default /usr/local; DESTDIR is honoured
	cmake --install build/release --prefix "$(PREFIX)"

format: ## format every source
	$(sources) | xargs -0 clang-format -i

format-check:
	$(sources) | xargs -0 clang-format --dry-run -Werror

tidy: ## run clang-tidy over the library and the command
	cmake --preset dev
	run-clang-tidy -quiet -p build/dev "$(CURDIR)/(oxmv|cli)/.*"

fuzz: packages-ci ## look for inputs that break something, FUZZ_SECONDS (60) a target, FUZZ_JOBS at once
	cmake --preset fuzz
	cmake --build --preset fuzz
	packaging/fuzz build/fuzz/fuzz $(FUZZ_SECONDS)

locales: packages-ci ## run the tests in locales with another decimal point, another small i
	cmake --preset dev
	cmake --build --preset dev
	tests/in-locales build

valgrind: packages-bench ## run the tests of the library under valgrind, which takes an hour
	cmake --preset dev
	cmake --build --preset dev --target oxmv_tests
	tests/under-valgrind build/dev/tests/oxmv_tests

thorough: ## everything that can find a bug, for hours: .ci/run, then what takes too long for it
	packaging/thorough

clean: ## remove everything that was built
	rm -rf build

packages-build:
	packaging/install-packages build

packages-test:
	packaging/install-packages build test

packages-coverage:
	packaging/install-packages build test coverage

packages-bench:
	packaging/install-packages build bench

packages-ci:
	packaging/install-packages build ci
