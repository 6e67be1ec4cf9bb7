# Everything a person does with this project, one word each. See README.md.

BUILD := build
JOBS := $(shell nproc 2>/dev/null || echo 2)
# Tests wait for children, buses and timeouts more than they compute.
TEST_JOBS := $(shell expr 3 \* $(JOBS))
CMAKE := cmake
# Ninja keeps all processors busy where make waits for one library after the other. A folder that was configured for
# another one cannot be taken over.
configure = { grep -qs '^CMAKE_GENERATOR:INTERNAL=Ninja$$' $(1)/CMakeCache.txt || \
	rm -rf $(1)/CMakeCache.txt $(1)/CMakeFiles; } && $(CMAKE) -G Ninja -Wno-dev -S . -B $(1)
# Seconds that each fuzzer runs; `make test` gives them a short turn.
FUZZ_SECONDS ?= 120
SOAK_ROUNDS ?= 150
TEST_FUZZ_SECONDS ?= 5

.PHONY: help demo test build bench bench-once crash-points fuzz soak lint format hooks install clean \
	dependencies-build dependencies-demo dependencies-test dependencies-bench dependencies-develop \
	build-plain build-address build-thread test-plain test-address test-thread run-plain run-address run-thread house-check fuzz-short

help:
	@sed -n 's/^## //p' Makefile

## make demo     a real call through the real agent, its log files, and a dump of the whole machine
demo: build dependencies-demo
	scripts/demo $(BUILD)

## make build    the programs, in build/bin
build: dependencies-build
	$(call configure,$(BUILD)) -DCMAKE_BUILD_TYPE=Release -DZAL_TESTS=OFF -DZAL_BENCH=OFF
	$(CMAKE) --build $(BUILD) -j $(JOBS)

## make test     all tests with sanitizers (address and undefined; thread), the finished product from outside, a short fuzz run
# The next build takes what the tests leave of the processors.
test: dependencies-build dependencies-test
	$(MAKE) --no-print-directory house-check
	$(MAKE) --no-print-directory build-plain
	$(MAKE) --no-print-directory -j 2 run-plain build-address BACKGROUND="nice -n 19"
	$(MAKE) --no-print-directory -j 2 run-address build-thread BACKGROUND="nice -n 19"
	$(MAKE) --no-print-directory run-thread
	$(MAKE) --no-print-directory fuzz-short

house-check:
	python3 scripts/house_check.py

# The product as its users get it, tested from outside. What is tested from within runs below, with a sanitizer.
build-plain:
	$(call configure,$(BUILD)) -DCMAKE_BUILD_TYPE=Release -DZAL_TESTS=ON -DZAL_TESTS_FROM_OUTSIDE=ON \
		-DZAL_BENCH=OFF
	$(CMAKE) --build $(BUILD) -j $(JOBS)

# There are a hundred sanitized programs, each large.
FAST_LINKER := -DCMAKE_EXE_LINKER_FLAGS=-fuse-ld=lld -DCMAKE_SHARED_LINKER_FLAGS=-fuse-ld=lld

# All test programs. clang here and for threads, where it is the faster one; GCC reads all of the product above. Not
# optimised: half the compiler's time.
build-address:
	$(call configure,$(BUILD)/address) -DCMAKE_BUILD_TYPE=Debug -DZAL_TESTS=ON -DZAL_FUZZ=ON \
		-DZAL_SANITIZE=address,undefined -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
		-DCMAKE_CXX_FLAGS_DEBUG="-O0 -g1" $(FAST_LINKER)
	$(BACKGROUND) $(CMAKE) --build $(BUILD)/address -j $(JOBS)

build-thread:
	$(call configure,$(BUILD)/thread) -DCMAKE_BUILD_TYPE=Debug -DZAL_TESTS=ON \
		-DZAL_SANITIZE=thread -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_CXX_FLAGS_DEBUG="-O0 -g1" $(FAST_LINKER)
	$(BACKGROUND) $(CMAKE) --build $(BUILD)/thread -j $(JOBS)

test-plain: build-plain
	$(MAKE) --no-print-directory run-plain

run-plain:
	cd $(BUILD) && ctest --output-on-failure -j $(TEST_JOBS)
	@scripts/skipped-tests $(BUILD)

test-address: build-address
	$(MAKE) --no-print-directory run-address

run-address:
	cd $(BUILD)/address && UBSAN_OPTIONS=print_stacktrace=1 ctest --output-on-failure -j $(TEST_JOBS)
	@scripts/skipped-tests $(BUILD)/address

test-thread: build-thread
	$(MAKE) --no-print-directory run-thread

run-thread:
	cd $(BUILD)/thread && TSAN_OPTIONS="halt_on_error=1 second_deadlock_stack=1" ctest --output-on-failure -j $(TEST_JOBS)
	@scripts/skipped-tests $(BUILD)/thread

fuzz-short:
	scripts/fuzz $(BUILD)/address $(TEST_FUZZ_SECONDS)

## make fuzz     the fuzzers, FUZZ_SECONDS each (120), FUZZ_JOBS at a time (one a processor)
fuzz: dependencies-build dependencies-test build-address
	scripts/fuzz $(BUILD)/address $(FUZZ_SECONDS)

## make crash-points  the agent killed, torn and refused at each of its system calls, one table at the end
crash-points: dependencies-build dependencies-test
	$(call configure,$(BUILD)) -DCMAKE_BUILD_TYPE=Release -DZAL_TESTS=ON -DZAL_TESTS_FROM_OUTSIDE=ON
	$(CMAKE) --build $(BUILD) --target crash_points -j $(JOBS)
	scripts/crash-points $(BUILD)/tests/bin/crash_points $(JOBS)

## make soak     a week of an agent on the manual clock, and SOAK_ROUNDS (150) of calls, floods, dumps and kills for real
soak: dependencies-build dependencies-test build-plain
	$(CMAKE) --build $(BUILD) --target soak_tests -j $(JOBS)
	ZAL_SOAK_DAYS=7 $(BUILD)/tests/bin/soak_tests
	ZAL_SOAK_ROUNDS=$(SOAK_ROUNDS) $(BUILD)/tests/bin/e2e_tests --gtest_filter='SoakE2eTest.*'

## make bench    the benchmarks against their peers, one table at the end
## make bench-once  whether the benchmarks work, in a minute; their figures say nothing
bench-once: BENCH_OPTIONS := --quick
bench bench-once: dependencies-build dependencies-test dependencies-bench
	$(call configure,$(BUILD)) -DCMAKE_BUILD_TYPE=Release -DZAL_TESTS=OFF -DZAL_BENCH=ON
	$(CMAKE) --build $(BUILD) -j $(JOBS)
	bench/run $(BUILD)/bin $(BENCH_OPTIONS)

## make lint     each file by itself: does it compile, what does clang-tidy say, how is it laid out
lint: dependencies-build dependencies-develop
	git ls-files '*.cpp' '*.h' '*.hpp' | xargs clang-format --dry-run -Werror
	$(call configure,$(BUILD)/lint) -DCMAKE_BUILD_TYPE=Debug -DZAL_TESTS=OFF -DZAL_UNITY=OFF
	$(CMAKE) --build $(BUILD)/lint -j $(JOBS)
	git ls-files 'platform/*.cpp' 'collectors/*.cpp' 'session/*.cpp' 'dump/*.cpp' 'agent/*.cpp' 'client/*.cpp' 'cli/*.cpp' \
		| xargs -P $(JOBS) -n 4 clang-tidy -p $(BUILD)/lint --quiet

## make format   lays out the sources as .clang-format says
format: dependencies-develop
	git ls-files '*.cpp' '*.h' '*.hpp' | xargs clang-format -i

## make hooks    installs the commit hook: format, house check
hooks: dependencies-develop
	install -D -m 755 scripts/pre-commit "$$(git rev-parse --git-path hooks)/pre-commit"

## make install  the programs, library, headers and unit files; DESTDIR and PREFIX as usual
install: build
	$(call configure,$(BUILD)) -DCMAKE_INSTALL_PREFIX=$(or $(PREFIX),/usr/local)
	$(CMAKE) --build $(BUILD) -j $(JOBS)
	$(CMAKE) --install $(BUILD)

clean:
	rm -rf $(BUILD)

dependencies-build dependencies-demo dependencies-test dependencies-bench dependencies-develop:
	@scripts/install-dependencies $(@:dependencies-%=%)
