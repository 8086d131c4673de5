# make test  - install what is missing (as root), build, run every test in a normal
#              and in an AddressSanitizer + UndefinedBehaviorSanitizer build
# make demo  - the same set-up, then the main job on sample data
# make bench - the benchmarks

JOBS ?= $(shell nproc 2>/dev/null || echo 2)
BUILD := build
ASAN_BUILD := build-asan
FIXTURES := $(CURDIR)/$(BUILD)/fixtures

.PHONY: all deps build build-asan test demo bench clean

all: build

deps:
	@tools/install_deps.sh

build: deps
	cmake -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release -DVANTREL_FIXTURE_DIR=$(FIXTURES)
	cmake --build $(BUILD) -j $(JOBS)

build-asan: deps
	cmake -S . -B $(ASAN_BUILD) -DCMAKE_BUILD_TYPE=Debug -DVANTREL_SANITIZE=ON -DVANTREL_BENCH=OFF \
	    -DVANTREL_FIXTURE_DIR=$(FIXTURES)
	cmake --build $(ASAN_BUILD) -j $(JOBS)

test: build build-asan
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)
	cd $(ASAN_BUILD) && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
	    ctest --output-on-failure -j $(JOBS)

demo: build
	tools/make_fixtures.sh $(FIXTURES)
	$(BUILD)/vantrel_demo $(FIXTURES)

bench: build
	tools/make_fixtures.sh $(FIXTURES)
	$(BUILD)/vantrel_bench

clean:
	rm -rf $(BUILD) $(ASAN_BUILD)
