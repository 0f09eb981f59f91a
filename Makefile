# `make` builds build/release/bin/marlet; `make demo` and `make test` install what is missing first.
.DEFAULT_GOAL := marlet
.PHONY: marlet demo test asan tsan coverage bench fuzz doc format check-format embed package

FUZZ_SECONDS ?= 600

configure = cmake --preset $(1)
sources = $(shell git ls-files '*.cpp' '*.h')

marlet:
	scripts/install-dependencies
	$(call configure,release) -DMARLET_BUILD_TESTS=OFF
	cmake --build --preset release

demo: marlet
	scripts/demo

test:
	scripts/install-dependencies
	$(call configure,debug)
	cmake --build --preset debug
	ctest --test-dir build/debug --output-on-failure -j2

asan tsan:
	scripts/install-dependencies --develop
	$(call configure,$@)
	cmake --build --preset $@ --target marlet_tests
	build/$@/bin/marlet_tests --gtest_brief=1

coverage:
	scripts/install-dependencies --develop
	$(call configure,$@)
	cmake --build --preset $@
	scripts/measure-coverage

bench:
	scripts/install-dependencies --develop
	$(call configure,bench)
	cmake --build --preset bench
	bench/run

fuzz:
	scripts/install-dependencies --develop
	$(call configure,asan)
	cmake --build --preset asan --target fuzzers
	fuzz/run $(FUZZ_SECONDS)

embed:
	scripts/install-dependencies --develop
	$(call configure,debug)
	cmake --build --preset debug
	rm -f build/debug/*.deb
	cmake --build --preset debug --target package
	scripts/test-install build/debug/*.deb

package: marlet
	scripts/install-dependencies --develop
	rm -f build/release/*.deb
	cmake --build --preset release --target package
	scripts/test-install build/release/*.deb

doc:
	scripts/install-dependencies --develop
	scripts/document

format:
	@clang-format -i $(sources)

check-format:
	@clang-format --dry-run -Werror $(sources)
