# Two commands for a newcomer: `make run` and `make test`. Both install what is missing from
# Debian's packages first (`make deps`, as root or through sudo), then configure and build with
# CMake. `make build` only builds: it never calls the package manager.

SHELL := /bin/bash
BUILD ?= build
ASAN_BUILD ?= build-asan
FUZZ_BUILD ?= build-fuzz
FUZZ_SECONDS ?= 20
GALLERY ?= gallery
JOBS ?= $(shell nproc)
PREFIX ?= /usr/local

PACKAGES := build-essential cmake pkg-config clang libclang-rt-14-dev clang-format \
	qt6-base-dev qt6-svg-dev qt6-qpa-plugins libgl-dev fonts-dejavu-core \
	libjpeg62-turbo-dev libpng-dev libgtest-dev libgmock-dev libbenchmark-dev libwmf-dev libemf2svg-dev \
	xdg-utils libzstd-dev libexif-dev fusefat dosfstools

.PHONY: all deps build run install deb test test-asan fuzz bench bench-all format clean

all: build

deps:
	@missing=""; \
	for p in $(PACKAGES); do \
	  dpkg-query -W -f='$${Status}' $$p 2>/dev/null | grep -q 'ok installed' || missing="$$missing $$p"; \
	done; \
	if [ -n "$$missing" ]; then \
	  echo "Installing Debian packages:$$missing"; \
	  sudo=""; [ "$$(id -u)" -eq 0 ] || sudo=sudo; \
	  $$sudo apt-get update -qq && \
	  DEBIAN_FRONTEND=noninteractive $$sudo apt-get install -y -qq $$missing; \
	fi

build:
	cmake -S . -B $(BUILD) -DCMAKE_BUILD_TYPE=Release
	cmake --build $(BUILD) -j $(JOBS)

run: deps
	@$(MAKE) --no-print-directory build
	@if [ -n "$$DISPLAY$$WAYLAND_DISPLAY" ]; then \
	  exec $(BUILD)/app/quillane; \
	else \
	  echo "No display found: writing the built-in picture through every effect into $(GALLERY)/"; \
	  $(BUILD)/cli/quillane-cli gallery $(GALLERY); \
	fi

# Into PREFIX (/usr/local unless given); DESTDIR=/some/stage stages it there instead.
install: build
	DESTDIR="$(DESTDIR)" cmake --install $(BUILD) --prefix $(PREFIX)

# The Debian package of what "make install" installs under /usr, checked by lintian when it is
# there: $(BUILD)/quillane_<version>_<arch>.deb, for "apt-get install ./quillane_*.deb".
deb: deps
	$(MAKE) build
	cd $(BUILD) && cpack -G DEB
	@if command -v lintian >/dev/null; then lintian --fail-on error $(BUILD)/quillane_*.deb; fi

test: deps
	$(MAKE) build
	cd $(BUILD) && ctest --output-on-failure -j $(JOBS)
	$(MAKE) test-asan

# The same suite once more with AddressSanitizer and UndefinedBehaviorSanitizer.
test-asan:
	cmake -S . -B $(ASAN_BUILD) -DCMAKE_BUILD_TYPE=Debug -DQUILLANE_SANITIZE=ON -DQUILLANE_BENCH=OFF
	cmake --build $(ASAN_BUILD) -j $(JOBS)
	cd $(ASAN_BUILD) && \
	  ASAN_OPTIONS=detect_leaks=1:abort_on_error=1 \
	  LSAN_OPTIONS=suppressions=$(CURDIR)/tests/lsan.supp:print_suppressions=0 \
	  UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1 \
	  ctest --output-on-failure -j $(JOBS)

# libFuzzer targets for every decoder, built with clang, each run for FUZZ_SECONDS.
fuzz: deps
	fuzz/run.sh $(FUZZ_SECONDS) $(CURDIR)/$(FUZZ_BUILD)

# Every effect beside a memcpy and the comparable OpenCV operations, in one table. OpenCV is
# used by this benchmark only, so only this target installs it.
bench:
	$(MAKE) deps PACKAGES="$(PACKAGES) libopencv-dev"
	$(MAKE) build
	$(BUILD)/bench/side_by_side_bench
	@if [ -x $(BUILD)/bench/gui_latency_bench ]; then $(BUILD)/bench/gui_latency_bench; fi

# Every benchmark program, the table's included.
bench-all: build
	@for b in $(BUILD)/bench/*_bench; do echo "== $$b"; $$b; done

format:
	git ls-files '*.cpp' '*.h' | xargs clang-format -i

clean:
	rm -rf $(BUILD) $(ASAN_BUILD) $(FUZZ_BUILD) $(GALLERY)
