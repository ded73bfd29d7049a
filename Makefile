# Entry points. Each one installs what is missing (scripts/setup) before it builds.
BUILD ?= build
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?=

.PHONY: all setup configure build run test bench fuzz tsan asan clean format

all: build

setup:
	@scripts/setup

# Line tables only (-g1): backtraces keep their file and line, and the build takes about a third
# less time than with full debug information. Configure with CMAKE_BUILD_TYPE=Debug to step
# through the code.
$(BUILD)/CMakeCache.txt:
	@scripts/setup
	cmake -S . -B $(BUILD) -DCMAKE_CXX_FLAGS_RELWITHDEBINFO="-O2 -g1 -DNDEBUG" $(CMAKE_FLAGS)

configure: $(BUILD)/CMakeCache.txt

build: setup configure
	cmake --build $(BUILD) -j $(JOBS)

# The demo export starts from default options every time: a fresh user setup file in out/.
run: build
	@mkdir -p out
	@rm -f out/usersetup.ini
	$(BUILD)/bin/anvil export demo --user-setup out/usersetup.ini \
	  $(foreach e,$(shell $(BUILD)/bin/anvil formats --extensions),-o out/demo.$(e))
	@ls -l out

test: build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)

# The tests built with AddressSanitizer and UndefinedBehaviorSanitizer: a leak, an overflow or
# undefined behaviour fails the test that caused it. -Og compiles the instrumented code in about
# half the time -O1 takes, for somewhat slower tests.
SANITIZE = -fsanitize=address,undefined -fno-sanitize-recover=undefined -fno-omit-frame-pointer
asan: setup
	cmake -S . -B $(BUILD)-asan -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_FLAGS_DEBUG="-Og -g1" \
	  -DCMAKE_CXX_FLAGS="$(SANITIZE)" -DCMAKE_EXE_LINKER_FLAGS="$(SANITIZE)" \
	  -DCMAKE_SHARED_LINKER_FLAGS="$(SANITIZE)" -DCMAKE_MODULE_LINKER_FLAGS="$(SANITIZE)" $(CMAKE_FLAGS)
	cmake --build $(BUILD)-asan -j $(JOBS)
	cd $(BUILD)-asan && ASAN_OPTIONS=detect_leaks=1:abort_on_error=0 \
	  UBSAN_OPTIONS=print_stacktrace=1 ctest --output-on-failure -j $(JOBS)

bench: setup
	cmake -S . -B $(BUILD)-bench -DCMAKE_BUILD_TYPE=Release -DANVIL_TESTS=OFF -DANVIL_BENCH=ON
	cmake --build $(BUILD)-bench -j $(JOBS)
	@for b in $(BUILD)-bench/bin/bench_*; do echo "== $$b"; XDG_CONFIG_HOME=$(CURDIR)/$(BUILD)-bench/config $$b; done

fuzz: setup
	cmake -S . -B $(BUILD)-fuzz -DCMAKE_CXX_COMPILER=clang++ -DANVIL_TESTS=OFF -DANVIL_FUZZ=ON
	cmake --build $(BUILD)-fuzz -j $(JOBS)
	@echo "fuzz targets in $(BUILD)-fuzz/bin/fuzz_*"

# The Flow tests under ThreadSanitizer, in a build directory of their own.
tsan: setup
	cmake -S . -B $(BUILD)-tsan -DCMAKE_BUILD_TYPE=RelWithDebInfo -DANVIL_BENCH=OFF \
	  -DCMAKE_CXX_FLAGS="-fsanitize=thread -fno-omit-frame-pointer" \
	  -DCMAKE_EXE_LINKER_FLAGS="-fsanitize=thread" $(CMAKE_FLAGS)
	cmake --build $(BUILD)-tsan -j $(JOBS) --target test_Flow2Types test_Flow2Store test_Flow2File
	cd $(BUILD)-tsan && TSAN_OPTIONS="halt_on_error=1 second_deadlock_stack=1" \
	  ctest -R 'Flow' --output-on-failure

format:
	git ls-files '*.cpp' '*.h' | xargs clang-format -i

clean:
	rm -rf $(BUILD) $(BUILD)-bench $(BUILD)-fuzz $(BUILD)-tsan $(BUILD)-asan out
