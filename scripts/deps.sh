# Sourced by the other scripts: installs the Debian packages that are missing, quietly.
# As root directly, else with sudo, else it prints the one apt-get line to run and stops.

qen_install_deps() {
  local missing=()
  local pkg
  for pkg in "$@"; do
    dpkg-query -W -f='${Status}' "$pkg" 2>/dev/null | grep -q 'install ok installed' || missing+=("$pkg")
  done
  [ ${#missing[@]} -eq 0 ] && return 0
  local sudo=""
  if [ "$(id -u)" -ne 0 ]; then
    if command -v sudo >/dev/null 2>&1 && sudo -n true 2>/dev/null; then
      sudo="sudo"
    else
      echo "Missing packages. Run this, then try again:" >&2
      echo "  sudo apt-get install -y ${missing[*]}" >&2
      exit 1
    fi
  fi
  echo "Installing: ${missing[*]}"
  export DEBIAN_FRONTEND=noninteractive
  $sudo apt-get update -qq >/dev/null
  $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
}

# The packages every build needs.
QEN_BUILD_PACKAGES=(cmake ninja-build g++ pkg-config libgtest-dev libgmock-dev libbenchmark-dev
  qt6-base-dev qt6-tools-dev qt6-tools-dev-tools libqt6opengl6-dev libxkbcommon-dev libgl-dev qt6-charts-dev qt6-svg-dev)

# Runs a command quietly; its output is shown only when it fails.
qen_quiet() {
  local log
  log=$(mktemp)
  if ! "$@" >"$log" 2>&1; then
    cat "$log" >&2
    rm -f "$log"
    return 1
  fi
  rm -f "$log"
}

# The scripting test drives qensim through PyVISA over its raw SCPI socket; the VCD tests read
# the exported files with sigrok-cli, as a logic analyser program reads them; the package test
# packs the build with cpack, whose dependency lookup needs dpkg-shlibdeps and file.
QEN_TEST_PACKAGES=(python3 python3-pyvisa-py sigrok-cli dpkg-dev file)
