#!/usr/bin/env bash
# Runs scripts/test with a build and tests of its own: programs stand for cmake and
# for what installs packages, and ctest has five tests that take no time.
# Usage: test.sh SCRIPTS_DIRECTORY
set -euo pipefail

directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
mkdir -p "$directory"/{tree/build/dev,bin}
cp -r "$1" "$directory/tree/scripts"
printf '#!/bin/sh\n' >"$directory/tree/scripts/install-dependencies"
# Where a user other than root runs the tests.
printf '#!/bin/sh\nshift\nexec "$@"\n' >"$directory/bin/sudo"
cat >"$directory/bin/cmake" <<'TEXT'
#!/bin/sh
echo "[1/2] Building"
[ ! -e fault ] || { printf 'FAILED: a.o\na.cpp:1: error\n'; exit 1; }
echo "[2/2] Linking"
TEXT
cat >"$directory/bin/ctest" <<TEXT
#!/bin/sh
# In place of "--preset NAME" stand the directory and what the presets say.
shift 2
exec "$(command -v ctest)" --test-dir build/dev --output-on-failure "\$@"
TEXT
chmod +x "$directory"/bin/* "$directory/tree/scripts/install-dependencies"
cd "$directory/tree"
cat >build/dev/passing <<'TEXT'
add_test(Passes true)
add_test(Skips bash -c "echo some; echo needs root; exit 77")
add_test(SkipsToo bash -c "echo needs root; exit 77")
set_tests_properties(Skips SkipsToo PROPERTIES SKIP_RETURN_CODE 77)
add_test(SkipsItself printf "/a.cpp:1: Skipped\\nneeds a kernel module\\n\\n[  SKIPPED ] A.B\\n")
set_tests_properties(SkipsItself PROPERTIES SKIP_REGULAR_EXPRESSION "SKIPPED")
TEXT
runs() { # runs STATUS [OPTION]: what the script prints, without times and with the status wanted
    local status=0
    PATH=$directory/bin:$PATH scripts/test "${@:2}" dev 2>&1 | sed -E 's/\([0-9]+ s\)/(N s)/' || status=$?
    ((status == $1)) || echo "status $status, not $1"
}
{
    cp build/dev/passing build/dev/CTestTestfile.cmake
    echo "== all pass"
    runs 0
    echo "== builds only"
    runs 0 --build
    echo "== one fails once"
    cp build/dev/CTestTestfile.cmake all
    echo 'add_test(FailsOnce bash -c "test -e again || { touch again; echo busy; exit 1; }")' \
        >>build/dev/CTestTestfile.cmake
    runs 0
    mv all build/dev/CTestTestfile.cmake
    echo 'add_test(Fails bash -c "echo its output; exit 1")' >>build/dev/CTestTestfile.cmake
    echo 'add_test(IsMissing /no/such/program)' >>build/dev/CTestTestfile.cmake
    echo "== some fail"
    runs 8
    touch fault
    echo "== does not build"
    runs 1
    grep -c 'Building' build/dev.log
} >output
diff - output <<'TEXT'
== all pass
Log: build/dev.log
dev: configure ... done (N s)
dev: build ... done (N s)
dev: test ... done (N s)
2 skipped: needs root
1 skipped: needs a kernel module
100% tests passed, 0 tests failed out of 4
== builds only
Log: build/dev.log
dev: configure ... done (N s)
dev: build ... done (N s)
== one fails once
Log: build/dev.log
dev: configure ... done (N s)
dev: build ... done (N s)
dev: test ... FAILED (N s)

== FAILED: FailsOnce
busy
2 skipped: needs root
1 skipped: needs a kernel module
Failed beside others: FailsOnce
dev: those alone ... done (N s)
80% tests passed, 1 tests failed out of 5
100% tests passed, 0 tests failed out of 1
== some fail
Log: build/dev.log
dev: configure ... done (N s)
dev: build ... done (N s)
dev: test ... FAILED (N s)

== FAILED: Fails
its output

== FAILED: IsMissing
Unable to find executable: /no/such/program
2 skipped: needs root
1 skipped: needs a kernel module
Failed beside others: Fails IsMissing
dev: those alone ... FAILED (N s)

== FAILED: Fails
its output

== FAILED: IsMissing
Unable to find executable: /no/such/program
The following tests FAILED:
	  5 - Fails (Failed)
	  6 - IsMissing (Not Run)
Errors while running CTest
67% tests passed, 2 tests failed out of 6
0% tests passed, 2 tests failed out of 2
== does not build
Log: build/dev.log
dev: configure ... FAILED (N s)
FAILED: a.o
a.cpp:1: error
The whole log: build/dev.log
1
TEXT
