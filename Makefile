# A thin front: CMake presets do the work, scripts/setup installs what they need.
JOBS ?= $(shell nproc)
PREFIX ?= /usr/local
FUZZ_SECONDS ?= 60

.PHONY: all run test asan tsan check stress bench fuzz install package clean

all:
	@scripts/setup build
	@cmake --preset release >/dev/null
	cmake --build --preset release -j $(JOBS)

run: all
	@examples/run build/release/tool/ktfiles

test:
	@scripts/setup build test bench package
	@cmake --preset test $(CMAKE_FLAGS) >/dev/null
	cmake --build --preset test -j $(JOBS)
	ctest --preset test

asan tsan:
	@scripts/setup build test bench package
	@cmake --preset $@ $(CMAKE_FLAGS) >/dev/null
	cmake --build --preset $@ -j $(JOBS)
	ctest --preset $@

# How the sources are laid out, and what clang-tidy finds in them.
check:
	@scripts/setup build test bench check
	@cmake --preset test $(CMAKE_FLAGS) >/dev/null
	find . -path ./build -prune -o -name '*.cpp' -print -o -name '*.h' -print | xargs clang-format-14 --dry-run --Werror
	scripts/tidy build/test

# 1,000 targeted and 5,000 random kills of processes that hold, wait, ask and present.
stress:
	@scripts/setup build test
	@cmake --preset test $(CMAKE_FLAGS) >/dev/null
	cmake --build --preset test -j $(JOBS) --target test_coordination
	KTFILES_KILLS=5000 build/test/tests/test_coordination --gtest_filter='KillTest.*'

bench:
	@scripts/setup build bench
	@cmake --preset bench >/dev/null
	cmake --build --preset bench -j $(JOBS)
	build/bench/bench/ktfiles_bench

fuzz:
	@scripts/setup build fuzz
	@cmake --preset fuzz >/dev/null
	cmake --build --preset fuzz -j $(JOBS)
	@scripts/fuzz build/fuzz/fuzz $(FUZZ_SECONDS)

install: all
	cmake --install build/release --prefix $(PREFIX)

package:
	@scripts/setup build package
	@cmake --preset release >/dev/null
	cmake --build --preset release -j $(JOBS)
	cd build/release && cpack -G DEB
	@ls -l build/release/*.deb

clean:
	rm -rf build
