#!/bin/sh
# Kills quorlogd at 200 random moments (or about as many as the argument says) and checks after every fifth that counts equal rows.
set -eu
cd "$(dirname "$0")/.."
kills="${1:-200}"
cmake --preset default >/dev/null
cmake --build --preset default --target test_quorlogd root_data
exec build/default/tests/quorlogd/test_quorlogd --gtest_filter='*CountsEqualRowsAfterEveryKill' \
    --gtest_repeat=$(((kills + 4) / 5)) --gtest_throw_on_failure --gtest_brief=1
