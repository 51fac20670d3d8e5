# Two entry points on a fresh machine: `make demo` and `make test`.
BUILD ?= build
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?=

.PHONY: setup configure build demo test sanitize fuzz bench clean

setup:
	bash scripts/setup.sh

configure: setup
	cmake -S . -B $(BUILD) $(CMAKE_FLAGS)

build: configure
	cmake --build $(BUILD) -j $(JOBS)

demo: build
	bash scripts/demo.sh $(BUILD)

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

sanitize:
	$(MAKE) test BUILD=build-asan CMAKE_FLAGS="-DZON_SANITIZE=ON -DZON_BENCH=OFF -DCMAKE_BUILD_TYPE=Debug"

fuzz: setup
	CXX=clang++ cmake -S . -B build-fuzz -DZON_FUZZ=ON -DCMAKE_BUILD_TYPE=RelWithDebInfo
	cmake --build build-fuzz -j $(JOBS)

bench: build
	for b in $(BUILD)/bench_*; do $$b; done

clean:
	rm -rf build build-asan build-fuzz
