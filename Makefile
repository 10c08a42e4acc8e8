# Corvid: all set-up for a fresh Debian 12 machine (run as root).
#   make demo   build, then run the collection cycle on the bundled sample project
#   make test   build, then run every test through ctest
#   make sanitize   build with clang's address, undefined-behaviour and leak
#                   checks in build-asan/ and run every test there
#   make fuzz       build the fuzz harnesses in build-fuzz/ and fuzz each one
#                   for FUZZ_SECONDS (make fuzz FUZZ_SECONDS=600 for a long run)
#   make screenshots  render the dialogs to docs/screenshots
#   make format       format every .cpp and .h of ours with clang-format (.clang-format)
#   make format-check report what make format would change, failing if anything

BUILD_DIR ?= build
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?= -DCMAKE_BUILD_TYPE=RelWithDebInfo

ASAN_DIR ?= build-asan
FUZZ_DIR ?= build-fuzz
FUZZ_SECONDS ?= 10
SANITIZERS = -fsanitize=address,undefined -fno-omit-frame-pointer -fno-sanitize-recover=undefined
CLANG_FLAGS = -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++
# Leak reports name only what our code allocated: tests/lsan.supp lists the
# few allocations inside Qt and system libraries that are kept until exit.
SANITIZER_ENV = ASAN_OPTIONS=detect_leaks=1 \
	LSAN_OPTIONS=suppressions=$(CURDIR)/tests/lsan.supp:print_suppressions=0 \
	UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1

# Our C++ sources (build folders are not among them).
FORMAT_DIRS = $(wildcard app backend host plugin project report tests tools transmit ui)
FORMAT_FILES = $(shell find $(FORMAT_DIRS) -type f \( -name '*.cpp' -o -name '*.h' \) | sort)
CLANG_FORMAT ?= clang-format

.PHONY: all deps configure build test sanitize fuzz demo screenshots format format-check clean

all: build

deps:
	sh scripts/install-deps.sh

configure: deps
	cmake -S . -B $(BUILD_DIR) $(CMAKE_FLAGS)

build: configure
	cmake --build $(BUILD_DIR) -j $(JOBS)

test: build
	cd $(BUILD_DIR) && QT_QPA_PLATFORM=offscreen ctest --output-on-failure -j $(JOBS)
	@sh scripts/test-ratio.sh

sanitize: deps
	cmake -S . -B $(ASAN_DIR) $(CLANG_FLAGS) "-DCMAKE_CXX_FLAGS=$(SANITIZERS)"
	cmake --build $(ASAN_DIR) -j $(JOBS)
	cd $(ASAN_DIR) && $(SANITIZER_ENV) QT_QPA_PLATFORM=offscreen ctest --output-on-failure -j $(JOBS)

fuzz: deps
	cmake -S . -B $(FUZZ_DIR) $(CLANG_FLAGS) "-DCMAKE_CXX_FLAGS=$(SANITIZERS) -fsanitize=fuzzer-no-link"
	cmake --build $(FUZZ_DIR) -j $(JOBS) --target corvid_fuzzers
	$(SANITIZER_ENV) sh tests/fuzz/run-fuzz.sh $(FUZZ_DIR) $(FUZZ_SECONDS)

demo: build
	sh scripts/demo.sh $(BUILD_DIR)

screenshots: build
	$(BUILD_DIR)/stage/bin/corvid-screenshots --out docs/screenshots

format: deps
	$(CLANG_FORMAT) -i $(FORMAT_FILES)

format-check: deps
	$(CLANG_FORMAT) --dry-run --Werror $(FORMAT_FILES)

clean:
	rm -rf $(BUILD_DIR) $(ASAN_DIR) $(FUZZ_DIR)
