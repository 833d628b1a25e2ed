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

status=0
headers=$(cat "$source_dir"/include/bt_service/*.h)
while read -r name; do
  grep -qE "\b$name\b" <<<"$headers" || { echo "$name is exported but no public header declares it"; status=1; }
done < <(list)
echo "$(exported | wc -l) exported names"
exit $status
