# make test    - install what is missing (as root), build, run every test in a normal
#                and in an AddressSanitizer + UndefinedBehaviorSanitizer build, and the
#                Windows DLL's checks (its export table, and its test host under Wine)
# make windows - the same set-up, then build-win32/vantrel.dll for 32-bit Windows (MinGW-w64)
# make demo    - the simulated proof loop through the vantrel command, with only what it needs
#                (compiler, CMake, Argyll, the FOGRA data): three passes of judging and
#                correcting a drifting proofer, the figures of each pass and an HTML report
# make bench   - the benchmarks

JOBS ?= $(shell nproc 2>/dev/null || echo 2)
BUILD := build
ASAN_BUILD := build-asan
WIN_BUILD := build-win32
DEMO_BUILD := build-demo
FIXTURES := $(CURDIR)/$(BUILD)/fixtures

.PHONY: all deps deps-demo build build-asan windows windows-if-possible test demo bench clean

all: build

deps:
	@tools/install_deps.sh

deps-demo:
	@tools/install_deps.sh --demo

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

# The demo builds the command alone (no tests, no benchmarks) in a folder of its own. Until
# optimize2 is in the library the loop stops after its first pass and the demo says so, then
# shows the same loop corrected by Argyll's refine.
DEMO_LOOP = $(DEMO_BUILD)/vantrel loop --passes 3 --fixtures $(FIXTURES) --report $(CURDIR)/$(DEMO_BUILD)/proof-loop-$$corrector.html \
	    --work $(CURDIR)/$(DEMO_BUILD)/proof-loop-$$corrector --corrector $$corrector
demo: deps-demo
	cmake -S . -B $(DEMO_BUILD) -DCMAKE_BUILD_TYPE=Release -DVANTREL_TESTS=OFF -DVANTREL_BENCH=OFF \
	    -DVANTREL_FIXTURE_DIR=$(FIXTURES) >/dev/null
	cmake --build $(DEMO_BUILD) -j $(JOBS) --target vantrel_cli
	tools/make_fixtures.sh $(FIXTURES)
	@corrector=optimize2; if ! $(DEMO_LOOP); then \
	    echo "demo: the loop with optimize2 stopped (see above); the same loop with Argyll's refine:"; \
	    corrector=refine; $(DEMO_LOOP); fi

bench: build
	tools/make_fixtures.sh $(FIXTURES)
	$(BUILD)/vantrel_bench

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(WIN_BUILD) $(DEMO_BUILD)
