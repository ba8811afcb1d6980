# A thin front: scripts/build installs what is missing and builds a CMake preset; scripts/run and scripts/test are all that is needed.
export JOBS ?= $(shell nproc)
PREFIX ?= /usr/local
FUZZ_SECONDS ?= 60

.PHONY: all run test asan tsan clang test-arm64 test-s390x check stress bench fuzz install package docs clean

all:
	@scripts/build release

run test:
	@scripts/$@

asan tsan:
	@scripts/test $@

# Library, command and tests have no warning from clang either.
clang:
	@scripts/build clang

# The tests on other processors, emulated.
test-arm64 test-s390x:
	@scripts/test $(@:test-%=%)

# How the sources are laid out, and what clang-tidy finds in them.
check:
	@scripts/setup build test python bench check
	@cmake --preset test -B build/check -D KTFILES_UNITY=OFF $(CMAKE_FLAGS) >/dev/null
	find . -path ./build -prune -o -name '*.cpp' -print -o -name '*.h' -print | xargs clang-format-14 --dry-run --Werror
	scripts/tidy build/check

# 1,000 targeted and 5,000 random kills of processes that hold, wait, ask and present.
stress:
	@scripts/setup build test
	@cmake --preset test $(CMAKE_FLAGS) >/dev/null
	cmake --build --preset test -j $(JOBS) --target test_coordination
	KTFILES_KILLS=5000 build/release/tests/test_coordination --gtest_filter='KillTest.*'

bench:
	@scripts/build bench
	build/release/bench/ktfiles_bench

fuzz:
	@scripts/build fuzz
	@scripts/fuzz build/fuzz/fuzz $(FUZZ_SECONDS)

# The public headers and the guide as pages, build/docs/html/index.html.
docs:
	@scripts/docs

install: all
	cmake --install build/release --prefix $(PREFIX)

package:
	@scripts/setup build python package
	@CMAKE_FLAGS="$(CMAKE_FLAGS) -DKTFILES_PYTHON=ON" scripts/build release
	cd build/release && cpack -G DEB
	@ls -l build/release/*.deb

clean:
	rm -rf build
