#!/usr/bin/env bash
# Installs the tool into a scratch root, and from its Debian package into another, and tries both.
# usage: tests/install_test.sh BUILD_FOLDER   (a folder that has been built)
set -euo pipefail

build=$(cd "$1" && pwd)
sources=$(cd "$(dirname "$0")/.." && pwd)
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"
umask 022
export LC_ALL=C.UTF-8  # for paths that are not ASCII

fail() { echo "install_test: $*" >&2; exit 1; }

# The files of an installation, with their modes.
expected=$(
  echo '755 usr/bin/zubtool'
  printf '644 usr/share/%s\n' man/man{1/zubtool.1,5/zub-device.5}.gz doc/zubtool/{changelog.gz,copyright} \
    bash-completion/completions/zubtool zsh/vendor-completions/_zubtool fish/vendor_completions.d/zubtool.fish
  cd "$sources" && printf '644 usr/share/zubtool/%s\n' devices/*
)

check_files() {  # ROOT
  diff <(sort -k 2 <<<"$expected") <(cd "$1" && find usr -type f -printf '%m %p\n' | sort -k 2) >&2 ||
    fail "$1 does not hold the files it should (<), but others (>)"
  ! find "$1/usr" -type d ! -perm 755 -printf '%m %p\n' | grep . >&2 || fail "$1 has such folders"
  gzip -t "$1"/usr/share/man/*/*.gz
  command -v mandoc >/dev/null || { echo "not run: lint of the manual pages: mandoc is not installed"; return; }
  printf '%s\n' "$1"/usr/share/man/*/*.gz | xargs -n 1 mandoc -T lint -W warning || fail "faults in manual pages"
}

# An installation is noted in the build folder, where root may have left notes before: here in one
# of its own, which has nothing but the folder's instructions.
mkdir instructions
sed "/manifest/I s|\"$build/|\"$scratch/instructions/|" "$build/cmake_install.cmake" \
  >instructions/cmake_install.cmake

DESTDIR=$scratch/installed cmake --install instructions --prefix /usr --strip >log 2>&1 ||
  fail "cmake --install: $(cat log)"
check_files installed
DESTDIR=$scratch/other cmake --install instructions --prefix /opt/z >log 2>&1
zcat other/opt/z/share/man/man1/zubtool.1.gz | grep -q '^.It Pa /opt/z/share/zubtool/devices/' ||
  fail "zubtool(1) does not name the folder that it was installed to"

# The program must live without the build folder.
program=installed/usr/bin/zubtool status=0
! grep -aqF -e "$build" -e "$sources" "$program" || fail "$program names the build's folders"
message=$(env -i ZUB_DEVICE=installed/usr/share/zubtool/devices/server-down.device \
  "$program" logdump tel 2>&1) || status=$?
[[ $status == 1 && $message == "Server is not running."* ]] ||
  fail "with an installed profile: status $status, and: $message"

command -v dpkg-shlibdeps >/dev/null && command -v file >/dev/null ||
  { echo "not run: the package: dpkg-dev or file is not installed"; exit 0; }
umask 077  # of no matter to what is in a package
cpack -G DEB --config "$build/CPackConfig.cmake" \
  -D "CPACK_INSTALL_CMAKE_PROJECTS=$scratch/instructions;zubtool;ALL;/" -B "$scratch/package" >log 2>&1 ||
  fail "cpack: $(cat log)"
dpkg-deb -x package/*.deb unpacked
check_files unpacked
