#!/usr/bin/env bash
# Installs the Debian packages vexil needs to build, test and demo, and nothing else.
# Idempotent: packages already present are left alone; apt runs only when something is missing.
set -euo pipefail

packages=(
  build-essential cmake ninja-build pkg-config
  libpoco-dev rapidjson-dev
  googletest libgtest-dev libgmock-dev libbenchmark-dev
  clangd python3-pylsp python3-pyflakes python3-pycodestyle
)

exec "$(dirname "$0")/apt-ensure.sh" install-deps "${packages[@]}"
