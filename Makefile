# The two commands a new machine needs: `make run` and `make test`.
# Both install what is missing and build first.

BUILD      ?= build
ASAN_BUILD ?= build-asan
FUZZ_BUILD ?= build-fuzz
TIDY_BUILD ?= build-tidy
FUZZ_SECONDS ?= 60
JOBS       ?= $(shell nproc)
CMAKE_ARGS ?=

configure = test -f $(1)/build.ninja || cmake -S . -B $(1) -G Ninja $(2) $(CMAKE_ARGS)

.PHONY: all deps build build-asan test unit-test asan-test fuzz-smoke fuzz bench run format format-check tidy clean

all: build

deps:
	@tools/install-deps.sh
	@test -d tests/browser/node_modules || (cd tests/browser && npm ci --no-audit --no-fund)
	@test -d src/ui/web/vendor/node_modules || (cd src/ui/web/vendor && npm ci --no-audit --no-fund)

build: deps
	@$(call configure,$(BUILD),-DCMAKE_BUILD_TYPE=RelWithDebInfo)
	cmake --build $(BUILD) -j $(JOBS)

build-asan: deps
	@$(call configure,$(ASAN_BUILD),-DCMAKE_BUILD_TYPE=Debug -DNORVO_SANITIZE=ON -DNORVO_BENCHMARKS=OFF)
	cmake --build $(ASAN_BUILD) -j $(JOBS)

# Every test, in the default build and again under AddressSanitizer and
# UndefinedBehaviorSanitizer.
test: unit-test asan-test

unit-test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

asan-test: build-asan
	cd $(ASAN_BUILD) && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
		ctest --output-on-failure -j $(JOBS)

# Each fuzz target under libFuzzer, AddressSanitizer and UndefinedBehaviorSanitizer for
# FUZZ_SECONDS, from its seed corpus in fuzz/corpus; prints the executions run.
fuzz: deps
	@tools/install-deps.sh fuzz
	@$(call configure,$(FUZZ_BUILD),-DCMAKE_BUILD_TYPE=RelWithDebInfo -DCMAKE_CXX_COMPILER=clang++ -DNORVO_LIBFUZZER=ON -DNORVO_SANITIZE=ON -DNORVO_BENCHMARKS=OFF)
	FUZZ_SECONDS=$(FUZZ_SECONDS) cmake --build $(FUZZ_BUILD) -j $(JOBS) --target fuzz

bench: build
	cmake --build $(BUILD) --target bench

# Norvo with its built-in baseband service and simulated phone; ARGS="--listen 0.0.0.0:8080"
# shows the pages to the network. Ctrl-C stops it.
run: build
	$(BUILD)/src/app/norvo $(ARGS)

format:
	git ls-files '*.h' '*.cc' | xargs clang-format -i

format-check:
	git ls-files '*.h' '*.cc' | xargs clang-format --dry-run -Werror

# clang-tidy with the checks of .clang-tidy over every source of ours (not the generated ones).
# clang-tidy reads each source as its own translation unit and cannot read GCC's precompiled
# headers, so it has a build of its own without either (built first, for the generated headers).
tidy: deps
	@tools/install-deps.sh tidy
	@$(call configure,$(TIDY_BUILD),-DCMAKE_BUILD_TYPE=Debug -DNORVO_UNITY=OFF -DCMAKE_DISABLE_PRECOMPILE_HEADERS=ON -DNORVO_BENCHMARKS=ON)
	cmake --build $(TIDY_BUILD) -j $(JOBS)
	run-clang-tidy -quiet -p $(TIDY_BUILD) '$(CURDIR)/(src|tools|tests|bench|fuzz)/.*\.cc$$'

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(FUZZ_BUILD) $(TIDY_BUILD)
