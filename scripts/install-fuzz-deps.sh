#!/usr/bin/env bash
# Installs what `make fuzz` needs on top of the build's own packages: clang and its
# libFuzzer and sanitizer runtimes. Kept apart so that `make test` does not need them.
set -euo pipefail

"$(dirname "$0")/install-deps.sh"
exec "$(dirname "$0")/apt-ensure.sh" install-fuzz-deps clang libclang-rt-14-dev
