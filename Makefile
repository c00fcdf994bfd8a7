# The commands of the project; see README.md. Each installs what it needs from Debian's packages.
BUILD := build
FUZZ_SECONDS := 60
FUZZ_SEED := 0
KILLS := 5
LOCK_SECONDS := 5

.PHONY: run test bench check format tidy asan fuzz soak try-faults try-recovery try-full-disk powerpc package package-powerpc try-package linking docs release install clean

run:            ## start the real receiving chain on loopback and show what it received
	scripts/install-deps.sh build run
	scripts/build.sh run
	scripts/run-demo.sh $(BUILD)/run

test:           ## build and run the whole suite
	scripts/install-deps.sh build run test
	scripts/build.sh default
	ctest --preset default

bench:          ## measure speed and memory, side by side
	scripts/install-deps.sh build bench
	scripts/build.sh bench
	scripts/run-bench.sh $(BUILD)/bench

check: format tidy asan  ## formatting, lint, sanitizers

format:
	scripts/install-deps.sh check
	scripts/check-format.sh

tidy:           ## clang's warnings and clang-tidy
	scripts/install-deps.sh build run test check
	scripts/build.sh tidy
	scripts/run-tidy.sh $(BUILD)/tidy

asan:           ## the suite under AddressSanitizer and UndefinedBehaviorSanitizer
	scripts/install-deps.sh build run test
	scripts/build.sh asan
	ctest --preset asan

powerpc:        ## cross-build for the appliance (32-bit big-endian) and run the suite under emulation
	scripts/install-deps.sh build run test powerpc
	scripts/build-powerpc-deps.sh $(BUILD)/powerpc-deps
	scripts/build.sh powerpc
	ctest --preset powerpc

package:        ## Debian packages and a tarball for this machine, in build/packages
	scripts/install-deps.sh build package
	scripts/package.sh release

package-powerpc: ## the same for the appliance (32-bit big-endian)
	scripts/install-deps.sh build powerpc package
	scripts/build-powerpc-deps.sh $(BUILD)/powerpc-deps
	scripts/package.sh release-powerpc

try-package: package  ## install, run, remove and purge the packages in a clean Debian (root)
	scripts/try-packages.sh $(BUILD)/packages $(BUILD)/package-root

linking:        ## static libraries, and platform libraries other than the bundled ones
	scripts/install-deps.sh build
	scripts/try-linking.sh $(BUILD)/linking

docs:           ## check the manuals; the interface as HTML, in build/docs
	scripts/install-deps.sh docs
	scripts/check-docs.sh $(BUILD)/docs

fuzz:           ## every fuzz target on its corpus and on new inputs, for FUZZ_SECONDS each
	scripts/install-deps.sh build check
	scripts/build.sh fuzz
	scripts/fuzz.sh $(BUILD)/fuzz $(FUZZ_SECONDS) $(FUZZ_SEED)

soak:           ## the real syslog-ng beside searchers, a deleter, a checkpointer, bursts and kills of quorlogd, for ten minutes
	scripts/install-deps.sh build run bench
	scripts/build.sh bench
	scripts/soak-database.sh $(BUILD)/bench

try-faults:     ## the receiving chain under bursts, locks, KILLS kills and restarts: every stored row is counted once
	scripts/install-deps.sh build run
	scripts/build.sh run
	scripts/try-faults.sh $(BUILD)/run $(KILLS) $(LOCK_SECONDS)

try-recovery:   ## backups, restores, merges and compactions while messages arrive: every message stays, and is counted once
	scripts/install-deps.sh build run
	scripts/build.sh run
	scripts/try-recovery.sh $(BUILD)/run

try-full-disk:  ## the receiving chain on a small disk that fills up and is freed again (root)
	scripts/install-deps.sh build run
	scripts/build.sh run
	scripts/try-full-disk.sh $(BUILD)/run

release:
	scripts/install-deps.sh build
	scripts/build.sh release

install: release
	cmake --install $(BUILD)/release

clean:
	rm -rf $(BUILD)
