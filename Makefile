# Front door. Every target first installs what is missing (scripts/install-deps).
BUILD_DIR ?= build/test
SAN_DIR ?= build/sanitize
BENCH_DIR ?= build/release
JOBS ?= $(shell nproc)
CMAKE_GEN = -G Ninja
# Mesa's shader cache runs a thread that can still be writing when a test exits, which upsets
# LeakSanitizer's exit check; the tests compile few shaders, so they run without it.
export MESA_SHADER_CACHE_DISABLE = true

.PHONY: deps configure test test-sanitize demo studio update-golden bench format build fuzz soak

deps:
	@scripts/install-deps

configure: deps
	cmake -S . -B $(BUILD_DIR) $(CMAKE_GEN) -DCMAKE_BUILD_TYPE=RelWithDebInfo -DAPE_BUILD_BENCHMARKS=OFF

build: configure
	cmake --build $(BUILD_DIR) -j $(JOBS)

test: build
	ctest --test-dir $(BUILD_DIR) --output-on-failure -j $(JOBS)

test-sanitize: deps
	cmake -S . -B $(SAN_DIR) $(CMAKE_GEN) -DCMAKE_BUILD_TYPE=Debug -DAPE_SANITIZE=ON -DAPE_BUILD_BENCHMARKS=OFF
	cmake --build $(SAN_DIR) -j $(JOBS)
	ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
	  ctest --test-dir $(SAN_DIR) --output-on-failure -j $(JOBS)

# Renders the built-in fountain into out/demo/: frames, contact sheet, GIF preview, stats. Builds
# only the render tool and the plug-ins it loads, in the same build folder as the tests.
demo: configure
	cmake --build $(BUILD_DIR) -j $(JOBS) --target ape-render ape-plugins
	APE_PLUGIN_DIR=$(BUILD_DIR)/plugins $(BUILD_DIR)/bin/ape-render --out out/demo

# The live editor in the browser on SCENE (default: the built-in fountain); prints the address.
# It makes a fresh OpenGL context for every re-simulation, so Mesa's shader cache stays on here.
studio: configure
	cmake --build $(BUILD_DIR) -j $(JOBS) --target ape-studio ape-plugins
	env -u MESA_SHADER_CACHE_DISABLE APE_PLUGIN_DIR=$(BUILD_DIR)/plugins \
	  $(BUILD_DIR)/bin/ape-studio $(SCENE)

# Renders the example scenes afresh into tests/golden/, after a deliberate change of a picture.
update-golden: build
	APE_UPDATE_GOLDEN=1 APE_PLUGIN_DIR=$(BUILD_DIR)/plugins \
	  $(BUILD_DIR)/bin/visual_regression_test --gtest_filter='Scenes/*'

bench: deps
	cmake -S . -B $(BENCH_DIR) $(CMAKE_GEN) -DCMAKE_BUILD_TYPE=Release "-DCMAKE_CXX_FLAGS_RELEASE=-O2 -DNDEBUG" -DAPE_BUILD_TESTS=OFF
	cmake --build $(BENCH_DIR) -j $(JOBS)
	@for b in $(BENCH_DIR)/bin/bench-*; do echo "== $$b"; $$b --benchmark_counters_tabular=true; done

format:
	git ls-files '*.h' '*.cpp' | xargs clang-format -i

# Robustness. "fuzz": the libFuzzer targets built by clang with AddressSanitizer and
# UndefinedBehaviorSanitizer, each run for FUZZ_SECONDS on a copy of its corpus (fuzz/corpus/).
# "soak": the example scenes for SOAK_FRAMES frames each under the sanitizers.
FUZZ_DIR ?= build/fuzz
FUZZ_SECONDS ?= 60
FUZZ_SANITIZE = -fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer
SOAK_DIR ?= build/soak
SOAK_FRAMES ?= 100000

fuzz: deps
	cmake -S . -B $(FUZZ_DIR) $(CMAKE_GEN) -DCMAKE_BUILD_TYPE=RelWithDebInfo -DAPE_BUILD_BENCHMARKS=OFF -DAPE_FUZZ=ON \
	  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
	  "-DCMAKE_C_FLAGS=$(FUZZ_SANITIZE)" "-DCMAKE_CXX_FLAGS=$(FUZZ_SANITIZE)" \
	  -DCMAKE_SHARED_LINKER_FLAGS=-fsanitize=address,undefined -DCMAKE_EXE_LINKER_FLAGS=-fsanitize=address,undefined
	cmake --build $(FUZZ_DIR) -j $(JOBS) --target fuzz-emitter_host fuzz-scene_loader fuzz-studio_request
	fuzz/run-fuzzers $(FUZZ_DIR) $(FUZZ_SECONDS)

soak: deps
	cmake -S . -B $(SOAK_DIR) $(CMAKE_GEN) -DCMAKE_BUILD_TYPE=RelWithDebInfo -DAPE_SANITIZE=ON -DAPE_BUILD_BENCHMARKS=OFF
	cmake --build $(SOAK_DIR) -j $(JOBS) --target ape-soak
	ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
	  $(SOAK_DIR)/bin/ape-soak --frames $(SOAK_FRAMES) scenes/*.json
