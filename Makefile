# Two entry points on a fresh machine: `make demo` and `make test`.
BUILD ?= build
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?=
SECONDS ?= 60

.PHONY: setup configure build demo test sanitize fuzz fuzz-run bench install clean

setup:
	bash scripts/setup.sh

configure: setup
	cmake -S . -B $(BUILD) $(CMAKE_FLAGS)

build: configure
	cmake --build $(BUILD) -j $(JOBS)

# Only the libraries and the tool: the tests and benchmarks are left for `make test`.
demo: configure
	cmake --build $(BUILD) -j $(JOBS) --target zoncloud
	bash scripts/demo.sh $(BUILD)

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

# The parallel reading path and the worker pool under the thread sanitizer:
# only their tests and the readers they drive are built, and the imports of
# those readers side by side on four threads.
TSAN_ONLY = ZonCldFormatAscii.m|ZonCldFormatLeica.m|ZonCldFormatCgo.m|ZonCldAsciiUserFormat.m|ZonCldFormatStl.m|ZonCldFormatKreon.m|ZonCldFormatOpton.m|test_parallel_read|test_worker_pool|test_concurrency

sanitize:
	$(MAKE) test BUILD=build-asan CMAKE_FLAGS="-DZON_SANITIZE=ON -DZON_BENCH=OFF -DCMAKE_BUILD_TYPE=Debug"
	$(MAKE) test BUILD=build-tsan CMAKE_FLAGS="-DZON_TSAN=ON -DZON_BENCH=OFF -DZON_ONLY='$(TSAN_ONLY)'"

fuzz: setup
	CXX=clang++ cmake -S . -B build-fuzz -DZON_FUZZ=ON -DCMAKE_BUILD_TYPE=RelWithDebInfo
	cmake --build build-fuzz -j $(JOBS)

# Each fuzz target for SECONDS with its corpus and a memory cap.
fuzz-run: fuzz
	bash scripts/fuzz_run.sh build-fuzz $(SECONDS)

bench: build
	for b in $(BUILD)/bench_*; do $$b; done

# PREFIX=/usr/local by default.
install: build
	cmake --install $(BUILD) $(if $(PREFIX),--prefix $(PREFIX))

clean:
	rm -rf build build-asan build-tsan build-fuzz
