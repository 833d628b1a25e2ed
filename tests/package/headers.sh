#!/usr/bin/env bash
# Every public header compiles alone, in every language version it promises, with both compilers.
set -euo pipefail
source_dir=$1
flags="-Wall -Wextra -Wpedantic -Werror -fsyntax-only -I $source_dir/include -I $source_dir/platform/include"
status=0 compiled=0

for compiler in gcc clang; do
  command -v $compiler >/dev/null || { echo "$compiler is missing: run scripts/setup"; exit 1; }
  for header in "$source_dir"/include/*/*.h "$source_dir"/platform/include/*/*.h; do
    for standard in c99 c11 c++11 c++17; do
      language=c
      [[ $standard == c++* ]] && language=c++
      if $compiler -x $language -std=$standard $flags - <<<"#include \"$header\""; then
        compiled=$((compiled + 1))
      else
        echo "$header does not compile alone as $standard with $compiler"
        status=1
      fi
    done
  done
done
echo "$compiled compilations"
exit $status
