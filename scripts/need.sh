#!/usr/bin/env bash
# Sourced by the other scripts. need PACKAGE...: installs those of the Debian packages that are missing.
need() {
  local package missing=()
  for package in "$@"; do
    dpkg-query -W -f='${db:Status-Status}\n' "$package" 2>/dev/null | grep -qx installed || missing+=("$package")
  done
  [ ${#missing[@]} -gt 0 ] || return 0
  echo "== Installing ${missing[*]}"
  as_root apt-get update -qq
  as_root env DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
}

as_root() {
  if [ "$(id -u)" -eq 0 ]; then "$@"; else sudo "$@"; fi
}

# shellcheck disable=SC2034
{
  build_packages=(g++ cmake make nlohmann-json3-dev libgtest-dev libbenchmark-dev)
  plugin_packages=(nbdkit nbdkit-plugin-dev pkg-config)
  test_packages=("${build_packages[@]}" pkg-config strace)
}
