#!/usr/bin/env bash
# The exported names are exactly those of the export list, and each of them is declared in a public header.
set -euo pipefail
source_dir=$1 library=$2 nm=$3

list() { sed -n '/global:/,/local:/p' "$source_dir/BT_Service/exports.map" | grep -oE '[A-Za-z_0-9]+;' | tr -d ';' | sort; }
exported() { "$nm" -D --defined-only "$library" | awk '$2 != "A" { sub(/@.*/, "", $3); print $3 }' | sort; }

if ! difference=$(diff <(list) <(exported)); then
  echo "exports differ from BT_Service/exports.map (< listed only, > exported only):"
  echo "$difference"
  exit 1
fi

undeclared=$(comm -23 <(list) <(grep -ohE '\b[A-Za-z_][A-Za-z_0-9]*\b' "$source_dir"/include/bt_service/*.h | sort -u))
if [ -n "$undeclared" ]; then
  echo "exported, but no public header declares:"
  echo "$undeclared"
  exit 1
fi
echo "$(exported | wc -l) exported names"
