# Two commands for a newcomer: `make run` and `make test`. Both install what is missing from
# Debian's packages first (`make deps`, as root or through sudo), then configure and build with
# CMake. `make build` only builds: it never calls the package manager.

SHELL := /bin/bash
BUILD ?= build
ASAN_BUILD ?= build-asan
FUZZ_BUILD ?= build-fuzz
ARM64_BUILD ?= build-arm64
FUZZ_SECONDS ?= 20
GALLERY ?= gallery
JOBS ?= $(shell nproc)
PREFIX ?= /usr/local

PACKAGES := build-essential cmake pkg-config clang libclang-rt-14-dev clang-format \
	qt6-base-dev qt6-svg-dev qt6-qpa-plugins libgl-dev fonts-dejavu-core \
	libjpeg62-turbo-dev libpng-dev libgtest-dev libgmock-dev libbenchmark-dev libwmf-dev libemf2svg-dev \
	xdg-utils libzstd-dev libexif-dev fusefat dosfstools

.PHONY: all deps deps-arm64 build run install deb test test-asan test-arm64 fuzz bench bench-all \
	format clean

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

# The arm64 side of a cross-build: Debian's cross toolchain, qemu-user, and the arm64 libraries
# through multiarch. libwmf-dev cannot be installed for two architectures at once (its
# libwmf-config clashes), so only the arm64 runtime libraries are; the host's headers serve both
# and test-arm64 writes the arm64 libwmf.pc itself.
ARM64_PACKAGES := crossbuild-essential-arm64 qemu-user qemu-user-binfmt \
	libjpeg62-turbo-dev:arm64 libpng-dev:arm64 libzstd-dev:arm64 libexif-dev:arm64 \
	libgtest-dev:arm64 libgmock-dev:arm64 qt6-base-dev:arm64 qt6-svg-dev:arm64 \
	libemf2svg-dev:arm64 libwmf-0.2-7:arm64 libwmflite-0.2-7:arm64

deps-arm64: deps
	@sudo=""; [ "$$(id -u)" -eq 0 ] || sudo=sudo; \
	if ! dpkg --print-foreign-architectures | grep -qx arm64; then \
	  echo "Adding arm64 as a foreign architecture"; \
	  $$sudo dpkg --add-architecture arm64 && $$sudo apt-get update -qq; \
	fi; \
	missing=""; \
	for p in $(ARM64_PACKAGES); do \
	  dpkg-query -W -f='$${Status}' $$p 2>/dev/null | grep -q 'ok installed' || missing="$$missing $$p"; \
	done; \
	if [ -n "$$missing" ]; then \
	  echo "Installing Debian packages:$$missing"; \
	  $$sudo apt-get update -qq && \
	  DEBIAN_FRONTEND=noninteractive $$sudo apt-get install -y -qq $$missing; \
	fi; \
	if [ ! -e /proc/sys/fs/binfmt_misc/qemu-aarch64 ]; then \
	  echo "Registering qemu-aarch64 for ARM programs (what systemd does at boot)"; \
	  mountpoint -q /proc/sys/fs/binfmt_misc || \
	    $$sudo mount -t binfmt_misc binfmt_misc /proc/sys/fs/binfmt_misc; \
	  $$sudo /lib/systemd/systemd-binfmt /usr/lib/binfmt.d/qemu-aarch64.conf; \
	fi

# Cross-builds the Qt-free libraries, quillane-cli and their tests for 64-bit ARM and runs the
# tests under qemu-aarch64 (no ARM machine needed). Test programs that start other programs
# (quillane-cli, the metafile renderers) reach them through qemu's binfmt_misc entry.
test-arm64: deps-arm64
	@mkdir -p $(ARM64_BUILD)/cross-pkgconfig $(ARM64_BUILD)/cross-lib
	ln -sf /usr/lib/aarch64-linux-gnu/libwmf-0.2.so.7 $(ARM64_BUILD)/cross-lib/libwmf.so
	ln -sf /usr/lib/aarch64-linux-gnu/libwmflite-0.2.so.7 $(ARM64_BUILD)/cross-lib/libwmflite.so
	printf '%s\n' 'libdir=$(CURDIR)/$(ARM64_BUILD)/cross-lib' 'Name: libwmf' \
	  'Description: libwmf for arm64' 'Version: 0.2.12' 'Libs: -L$${libdir} -lwmf -lwmflite' \
	  'Cflags: -I/usr/include/freetype2 -I/usr/include/libpng16' \
	  > $(ARM64_BUILD)/cross-pkgconfig/libwmf.pc
	cmake -S . -B $(ARM64_BUILD) -DCMAKE_BUILD_TYPE=Release \
	  -DCMAKE_TOOLCHAIN_FILE=$(CURDIR)/cmake/aarch64-linux-gnu.cmake \
	  -DQUILLANE_CROSS_PKG_CONFIG_PATH=$(CURDIR)/$(ARM64_BUILD)/cross-pkgconfig \
	  -DQUILLANE_GUI=OFF -DQUILLANE_BENCH=OFF
	cmake --build $(ARM64_BUILD) -j $(JOBS)
	cd $(ARM64_BUILD) && ctest --output-on-failure -j $(JOBS)

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
	rm -rf $(BUILD) $(ASAN_BUILD) $(FUZZ_BUILD) $(ARM64_BUILD) $(GALLERY)
