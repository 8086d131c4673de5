# make test    - install what is missing (as root), build, run every test in a normal
#                and in an AddressSanitizer + UndefinedBehaviorSanitizer build, and the
#                Windows DLL's checks (its export table, and its test host under Wine)
# make windows - the same set-up, then build-win32/vantrel.dll for 32-bit Windows (MinGW-w64)
# make demo    - the same set-up, then the main job on sample data
# make bench   - the benchmarks

JOBS ?= $(shell nproc 2>/dev/null || echo 2)
BUILD := build
ASAN_BUILD := build-asan
WIN_BUILD := build-win32
FIXTURES := $(CURDIR)/$(BUILD)/fixtures

.PHONY: all deps build build-asan windows windows-if-possible test demo bench clean

all: build

deps:
	@tools/install_deps.sh

build: deps
	cmake -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release -DVANTREL_FIXTURE_DIR=$(FIXTURES) \
	    -DVANTREL_WIN32_BUILD=$(CURDIR)/$(WIN_BUILD)
	cmake --build $(BUILD) -j $(JOBS)

build-asan: deps
	cmake -S . -B $(ASAN_BUILD) -DCMAKE_BUILD_TYPE=Debug -DVANTREL_SANITIZE=ON -DVANTREL_BENCH=OFF \
	    -DVANTREL_FIXTURE_DIR=$(FIXTURES)
	cmake --build $(ASAN_BUILD) -j $(JOBS)

windows: deps
	cmake -S . -B $(WIN_BUILD) -DCMAKE_TOOLCHAIN_FILE=cmake/mingw-w64-i686.cmake -DCMAKE_BUILD_TYPE=Release
	cmake --build $(WIN_BUILD) -j $(JOBS)

# make test builds the DLL where the cross compiler is installed and says so where it is not.
windows-if-possible: deps
	@if command -v i686-w64-mingw32-g++ >/dev/null 2>&1; then \
	    $(MAKE) --no-print-directory windows; \
	else \
	    echo "SKIPPING the Windows build: no i686-w64-mingw32-g++ (make test as root installs it)"; \
	fi

test: build build-asan windows-if-possible
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)
	@grep -h '^SKIPPED:' $(BUILD)/Testing/Temporary/LastTest.log || true
	cd $(ASAN_BUILD) && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
	    ctest --output-on-failure -j $(JOBS)

demo: build
	tools/make_fixtures.sh $(FIXTURES)
	$(BUILD)/vantrel_demo $(FIXTURES)/FOGRA39L.icc /usr/share/color/icc/FOGRA39L.ti3

bench: build
	tools/make_fixtures.sh $(FIXTURES)
	$(BUILD)/vantrel_bench

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(WIN_BUILD)
