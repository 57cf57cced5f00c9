#!/usr/bin/env bash
# Checks that every plain function the public headers declare with C linkage is exported
# from the DLL under its undecorated name, so hosts find it with GetProcAddress.
# Usage: scripts/check-windows-exports.sh path/to/vexil.dll
set -euo pipefail
dll=$1
top=$(cd "$(dirname "$0")/.." && pwd)

exports=$(i686-w64-mingw32-objdump -p "$dll" | awk '/\[Ordinal\/Name Pointer\] Table/{on=1; next} on && /\]/{print $NF}')
expected=$(grep -rhoE 'VEXIL_EXTERN_C VEXIL_API[^(]*[ *]([A-Za-z_][A-Za-z0-9_]*)\(' "$top/include" \
  | sed -E 's/.*[ *]([A-Za-z_][A-Za-z0-9_]*)\($/\1/' | sort -u || true)

missing=0
for name in $expected; do
  if ! grep -qx "$name" <<<"$exports"; then
    echo "check-windows-exports: $name is not exported undecorated from $dll" >&2
    missing=1
  fi
done
[ $missing -eq 0 ] && echo "check-windows-exports: $(wc -w <<<"$expected") plain exports found undecorated"
exit $missing
