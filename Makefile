# The two commands that most people need: `make demo` and `make test`. Both do all the set-up.

BUILD := build/release
JOBS  ?= $(shell nproc)

.PHONY: demo test build deps bench asan tsan fuzz tidy install clean

demo: build
	$(BUILD)/src/app/korvane build docs/handbook -o build/handbook.pdf --work build/handbook.korvane
	@echo "The handbook lies in build/handbook.pdf"

build: deps
	@cmake --preset release --log-level=WARNING
	@cmake --build --preset release -j $(JOBS)

deps:
	@scripts/install-deps

test: build
	ctest --test-dir $(BUILD) --output-on-failure -j $(JOBS)

bench: build
	bench/run $(BUILD)

asan tsan: deps
	cmake --preset $@ --log-level=WARNING
	cmake --build --preset $@ -j $(JOBS)
	scripts/sanitized-ctest $@ -j $(JOBS)

fuzz: deps
	cmake --preset fuzz --log-level=WARNING
	cmake --build --preset fuzz -j $(JOBS)
	scripts/fuzz build/fuzz $(or $(SECONDS_EACH),60)

tidy: deps
	cmake --preset tidy --log-level=WARNING
	cmake --build --preset tidy -j $(JOBS)

install: build
	cmake --install $(BUILD)

clean:
	rm -rf build
