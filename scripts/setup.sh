#!/usr/bin/env bash
# Installs what building, testing and running need on a fresh Debian machine.
# Packages already present are left alone; run as root (or with sudo available).
set -euo pipefail

packages=(build-essential cmake ninja-build pkg-config
          libgtest-dev libgmock-dev libbenchmark-dev
          liblcms2-dev libcli11-dev
          argyll-ref icc-profiles-free  # real CGATS files the reader tests read; FOGRA39L for conformance
          argyll bc  # colprof, profcheck, xicclu, iccdump, spec2cie: profiles checked (stage 60-profile)
          libxml2-dev  # CxF3 measurement files (host tier); the HTML report's test parses the page as XML
          chromium  # renders the HTML report headless (stage 70-report)
          clang libclang-rt-14-dev valgrind python3
          python3-dev python3-venv python3-pip python3-setuptools python3-build python3-wheel  # the Python package
          pybind11-dev python3-pybind11 python3-numpy python3-pytest python3-mypy           # (stage 80-python)
          llvm-14)  # llvm-symbolizer: sanitizer reports with file and line

missing=()
for package in "${packages[@]}"; do
  dpkg -s "$package" >/dev/null 2>&1 || missing+=("$package")
done
if ((${#missing[@]})); then
  echo "setup: installing ${missing[*]}"
  sudo=""
  [ "$(id -u)" -eq 0 ] || sudo="sudo"
  $sudo apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq "${missing[@]}" >/dev/null
fi
