#!/usr/bin/env bash
# Installs the JavaScript client that `make bench` compares vexil with (bench/js): vscode-jsonrpc
# as its package-lock.json pins it, with `npm ci`. Idempotent: npm runs only when the locked
# version is not what is installed. Node and npm themselves are not installed here; without
# them this fails with the reason, and `make bench` skips the comparison, saying why.
set -euo pipefail

label=install-bench-js
js="$(cd "$(dirname "$0")/../bench/js" && pwd)"

fail() {
  echo "$label: $1; the JavaScript client comparison of make bench is skipped" >&2
  exit 1
}

command -v node >/dev/null 2>&1 || fail "node is not installed"

# Whether every package the lock names is installed at its locked version.
installed() {
  node -e '
    const fs = require("fs"), path = require("path");
    const lock = JSON.parse(fs.readFileSync(path.join(process.argv[1], "package-lock.json"), "utf8"));
    const wanted = Object.entries(lock.packages).filter(([where]) => where !== "");
    process.exit(wanted.every(([where, { version }]) => {
      try {
        return JSON.parse(fs.readFileSync(path.join(process.argv[1], where, "package.json"), "utf8")).version === version;
      } catch {
        return false;
      }
    }) ? 0 : 1);
  ' "$js"
}

if installed; then
  echo "$label: everything is installed"
  exit 0
fi

command -v npm >/dev/null 2>&1 || fail "npm is not installed"
echo "$label: npm ci in bench/js"
(cd "$js" && npm ci --no-audit --no-fund) || fail "npm ci failed in bench/js"
