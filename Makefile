# Corvid: all set-up for a fresh Debian 12 machine (run as root).
#   make demo   build, then run the collection cycle on the bundled sample project
#   make test   build, then run every test through ctest
#   make screenshots  render the dialogs to docs/screenshots

BUILD_DIR ?= build
JOBS ?= $(shell nproc)
CMAKE_FLAGS ?= -DCMAKE_BUILD_TYPE=RelWithDebInfo

.PHONY: all deps configure build test demo screenshots clean

all: build

deps:
	sh scripts/install-deps.sh

configure: deps
	cmake -S . -B $(BUILD_DIR) $(CMAKE_FLAGS)

build: configure
	cmake --build $(BUILD_DIR) -j $(JOBS)

test: build
	cd $(BUILD_DIR) && QT_QPA_PLATFORM=offscreen ctest --output-on-failure -j $(JOBS)

demo: build
	sh scripts/demo.sh $(BUILD_DIR)

screenshots: build
	$(BUILD_DIR)/stage/bin/corvid-screenshots --out docs/screenshots

clean:
	rm -rf $(BUILD_DIR)
