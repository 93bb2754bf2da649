#!/usr/bin/env bash
# Sets up, checks formatting, builds the release and the sanitizer configurations, runs all tests.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh

echo "== clang-format"
git ls-files '*.cpp' '*.h' | xargs clang-format --dry-run --Werror

echo "== release build and tests"
scripts/build.sh build/release -DQZIVI_BUILD_TESTS=ON -DQZIVI_BUILD_BENCH=ON # run.sh turns both off
ctest --test-dir build/release --output-on-failure --no-tests=error -j 2

echo "== Debian package: made, installed, used and removed"
scripts/package.sh build/release

echo "== address and undefined-behaviour sanitizer build and tests"
scripts/build.sh build/sanitize -DQZIVI_SANITIZE=ON -DQZIVI_BUILD_BENCH=OFF -DCMAKE_BUILD_TYPE=Debug
ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
  ctest --test-dir build/sanitize --output-on-failure --no-tests=error -j 2

echo "== fuzz targets, a short run each (scripts/fuzz.sh runs them long)"
scripts/fuzz.sh 2000
