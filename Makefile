# Thin wrapper around the CMake presets; every target installs missing Debian
# packages first. CI runs: test, format-check, asan, tsan, consumer.

export CMAKE_BUILD_PARALLEL_LEVEL := 2
export CTEST_PARALLEL_LEVEL := 2

INSTALL_DIR := $(CURDIR)/build/install
CONSUMER_DIR := $(CURDIR)/build/consumer

.PHONY: all bootstrap test demo asan tsan bench format format-check consumer clean

all: test

bootstrap:
	@bash scripts/bootstrap

test: bootstrap
	cmake --preset dev
	cmake --build --preset dev -j 2
	ctest --preset dev -j 2

demo: bootstrap
	cmake --preset dev
	cmake --build --preset dev -j 2 --target wavemill_demo wavemill_tool
	build/dev/examples/wavemill_demo
	@printf '%s\n' "Next, the wavemill tool (--help everywhere):  build/dev/apps/wavemill sim &" \
	  "  build/dev/apps/wavemill identify 127.0.0.1    build/dev/apps/wavemill scpi 127.0.0.1 'FREQ 2e9' 'FREQ?'" \
	  "  printf '0,0\\n1,0\\n' | build/dev/apps/wavemill wv pack - tone.wv && build/dev/apps/wavemill wv info tone.wv"

asan: bootstrap
	cmake --preset asan
	cmake --build --preset asan -j 2
	ctest --preset asan -j 2

# Builds and runs only the executables whose tests carry the label concurrency.
tsan: bootstrap
	cmake --preset tsan
	cmake --build --preset tsan -j 2
	ctest --preset tsan -j 2

bench: bootstrap
	cmake --preset release
	cmake --build --preset release -j 2
	@set -e; found=0; \
	for exe in build/release/bench/wavemill_bench_*; do \
	  [ -x "$$exe" ] || continue; found=1; \
	  echo "== $$exe"; "$$exe"; \
	done; \
	[ $$found = 1 ] || echo "bench: no benchmarks"

format: bootstrap
	python3 scripts/umbrella
	bash scripts/format

format-check: bootstrap
	bash scripts/format --check
	python3 scripts/umbrella --check

# Installs the release library into build/install, then builds the consumer
# project against that tree with CMake and with pkg-config and runs both.
consumer: bootstrap
	cmake --preset release
	cmake --build --preset release -j 2 --target wavemill wavemill_simulator wavemill-sim corvisa wavemill_tool
	rm -rf $(INSTALL_DIR) $(CONSUMER_DIR)
	cmake --install build/release --prefix $(INSTALL_DIR)
	cmake -S tests/consumer -B $(CONSUMER_DIR) -G Ninja -DCMAKE_BUILD_TYPE=Release -DCMAKE_PREFIX_PATH=$(INSTALL_DIR)
	cmake --build $(CONSUMER_DIR)
	$(CONSUMER_DIR)/wavemill_consumer
	$(CONSUMER_DIR)/wavemill_consumer_simulator
	PKG_CONFIG_PATH=$$(dirname $$(find $(INSTALL_DIR) -name wavemill.pc)) && export PKG_CONFIG_PATH && \
	  $(CXX) -std=c++17 -o $(CONSUMER_DIR)/wavemill_consumer_pc tests/consumer/main.cpp \
	  $$(pkg-config --cflags wavemill) $$(pkg-config --libs wavemill) \
	  -Wl,-rpath,$$(pkg-config --variable=libdir wavemill)
	$(CONSUMER_DIR)/wavemill_consumer_pc

clean:
	rm -rf build
