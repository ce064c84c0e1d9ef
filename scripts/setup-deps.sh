#!/usr/bin/env bash
# Installs, from Debian's packages, whatever the project needs that this
# machine lacks. Does nothing when everything is present.
set -euo pipefail

packages=(cmake ninja-build g++ libgtest-dev libbenchmark-dev clang-format gcovr
          clang libclang-rt-14-dev nlohmann-json3-dev libcli11-dev graphviz pkgconf time)

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done

if [ ${#missing[@]} -eq 0 ]; then
  exit 0
fi

echo "setup-deps: installing ${missing[*]}" >&2
if [ "$(id -u)" -eq 0 ]; then
  apt-get update -qq
  DEBIAN_FRONTEND=noninteractive apt-get install -y -qq "${missing[@]}" >/dev/null
else
  sudo apt-get update -qq
  sudo DEBIAN_FRONTEND=noninteractive apt-get install -y -qq "${missing[@]}" >/dev/null
fi
