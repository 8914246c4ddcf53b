# Thin wrapper over CMake. `make demo` and `make test` are all a new
# checkout needs.
BUILD ?= build
JOBS ?= $(shell nproc)

.PHONY: all build demo test test-sanitize bench clean

all: build

$(BUILD)/CMakeCache.txt:
	cmake -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release

build: $(BUILD)/CMakeCache.txt
	cmake --build $(BUILD) -j $(JOBS)

demo: build
	cd $(BUILD) && examples/zor_demo && examples/resize_tiles

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

# The suite under AddressSanitizer and UBSan in a folder of its own. Every
# finding stops its test; tests labelled no_sanitize cannot hold under the
# instrumentation (each says why). ctest hides a passing test's output, so
# the log is searched for reports afterwards.
SANITIZE_BUILD ?= build-sanitize
SANITIZE_ENV = ASAN_OPTIONS=halt_on_error=1:abort_on_error=0:detect_leaks=1 \
	UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1

test-sanitize:
	cmake -S . -B $(SANITIZE_BUILD) -DCMAKE_BUILD_TYPE=Release -DZOR_SANITIZE=ON \
		-DZOR_BUILD_BENCH=OFF
	cmake --build $(SANITIZE_BUILD) -j $(JOBS)
	cd $(SANITIZE_BUILD) && $(SANITIZE_ENV) ctest --output-on-failure -j $(JOBS) -LE no_sanitize
	! grep -E -B2 -A20 'ERROR: (Address|Leak)Sanitizer|runtime error:' \
		$(SANITIZE_BUILD)/Testing/Temporary/LastTest.log

# The level-private benchmarks first: the public ones end with the summary
# table of levels against their peers.
bench: build
	if [ -x $(BUILD)/bench/zor_bench_internal ]; then $(BUILD)/bench/zor_bench_internal; fi
	$(BUILD)/bench/zor_bench

clean:
	rm -rf $(BUILD) $(SANITIZE_BUILD)
