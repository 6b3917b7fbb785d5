# Thin wrapper over CMake: `make run` and `make test` install what is missing, build, then run.
BUILD ?= build
CMAKE_FLAGS ?=
CTEST_FLAGS ?= --output-on-failure

.PHONY: all deps configure build run test bench plant-faults format format-check fuzz-smoke windows-check package test-package clean

all: build

deps:
	@tools/install-deps.sh
	@if [ -f package.json ]; then tools/install-ruffle.sh; fi

$(BUILD)/build.ninja:
	cmake -S . -B $(BUILD) -G Ninja $(CMAKE_FLAGS)

configure: $(BUILD)/build.ninja

build: deps configure
	cmake --build $(BUILD)

run: build
	$(BUILD)/bin/brimvault

test: build
	cd $(BUILD) && QT_QPA_PLATFORM=offscreen ctest $(CTEST_FLAGS)

bench: build
	@if [ -x tools/run-bench.sh ]; then tools/run-bench.sh $(BUILD); else echo "no benchmarks yet"; fi

# Plants each fault of tools/faults.list in a scratch copy and reports which ones the tests catch.
plant-faults:
	tools/plant-faults.sh $(PLANT_FLAGS)

format: configure
	cmake --build $(BUILD) --target format

format-check: configure
	cmake --build $(BUILD) --target format-check

# Every source compiled for Windows (syntax and types only) with MinGW-w64, from the build's own list.
windows-check: build
	tools/windows-check.py $(BUILD) .

# The Debian package from the install layout: build/brimvault_<version>_amd64.deb.
package: build
	cd $(BUILD) && cpack -G DEB

# Installs that package in a fresh Debian 12 root (debootstrap; root only) and runs it there.
test-package: package
	tools/test-package.sh $$(ls -t $(BUILD)/brimvault_*_amd64.deb | head -n1)

fuzz-smoke: deps
	@if [ -x tools/fuzz-smoke.sh ]; then tools/fuzz-smoke.sh; else echo "no fuzz targets yet"; fi

clean:
	rm -rf $(BUILD)
