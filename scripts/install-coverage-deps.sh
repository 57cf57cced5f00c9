#!/usr/bin/env bash
# Installs what `make coverage` needs on top of the build's own packages: gcovr, which reads
# gcc's coverage notes. Kept apart so that `make test` does not need it.
set -euo pipefail

"$(dirname "$0")/install-deps.sh"
exec "$(dirname "$0")/apt-ensure.sh" install-coverage-deps gcovr
