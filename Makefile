# Thin wrapper over CMake. `make demo` and `make test` are all a new
# checkout needs.
BUILD ?= build
JOBS ?= $(shell nproc)

.PHONY: all build demo test bench clean

all: build

$(BUILD)/CMakeCache.txt:
	cmake -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release

build: $(BUILD)/CMakeCache.txt
	cmake --build $(BUILD) -j $(JOBS)

demo: build
	cd $(BUILD) && examples/zor_demo

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

bench: build
	$(BUILD)/bench/zor_bench
	if [ -x $(BUILD)/bench/zor_bench_internal ]; then $(BUILD)/bench/zor_bench_internal; fi

clean:
	rm -rf $(BUILD)
