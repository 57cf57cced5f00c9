#!/usr/bin/env bash
# Installs the Debian packages named after the first argument (a label for messages) unless present.
# Idempotent: packages already present are left alone; apt runs only when something is missing.
set -euo pipefail

label=$1
shift

missing=()
for p in "$@"; do
  if ! dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q '^install ok installed$'; then
    missing+=("$p")
  fi
done

if [ ${#missing[@]} -eq 0 ]; then
  echo "$label: everything is installed"
  exit 0
fi

if [ "$(id -u)" -eq 0 ]; then
  as_root=()
elif command -v sudo >/dev/null 2>&1; then
  as_root=(sudo)
else
  echo "$label: missing ${missing[*]} and neither root nor sudo is available" >&2
  exit 1
fi

echo "$label: installing ${missing[*]}"
export DEBIAN_FRONTEND=noninteractive
# A mirror caught mid-sync fails one index of the update; the lists at hand usually still
# name what is missing, so the install is tried anyway and its own failure is the one reported.
"${as_root[@]}" apt-get update -q || echo "$label: apt-get update failed; installing from the package lists at hand" >&2
"${as_root[@]}" apt-get install -y -q --no-install-recommends "${missing[@]}"
