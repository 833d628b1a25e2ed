#!/usr/bin/env bash
# At run time the library needs libc and the platform layer, and the platform layer libc alone; both carry a SONAME.
set -euo pipefail
library=$1 platform=$2 readelf=$3
status=0

check() { # file, SONAME, allowed NEEDED
  local soname needed
  soname=$("$readelf" -d "$1" | sed -n 's/.*(SONAME).*\[\(.*\)\]/\1/p')
  [ "$soname" = "$2" ] || { echo "$1: SONAME is '$soname', not $2"; status=1; }
  while read -r needed; do
    [[ $needed =~ ^($3)$ ]] || { echo "$1 needs $needed"; status=1; }
  done < <("$readelf" -d "$1" | sed -n 's/.*(NEEDED).*\[\(.*\)\]/\1/p')
  if [[ $("$readelf" -d "$1") == *SYMBOLIC* ]]; then
    echo "$1 binds its own symbols: exported data could not be interposed"
    status=1
  fi
}

libc='libc\.so\.6|ld-linux[^ ]*'
check "$library" libBT_Service_API.so.1 "$libc|libbt_platform\.so\.1"
check "$platform" libbt_platform.so.1 "$libc"
exit $status
