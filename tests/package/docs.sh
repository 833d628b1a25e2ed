#!/usr/bin/env bash
# The documents are true: their first program is the one that is built, and their links lead somewhere.
set -euo pipefail
source_dir=$1
cd "$source_dir"
status=0

if ! diff <(awk '/^```c$/ { inside = 1; next } /^```$/ { inside = 0 } inside' README.md) examples/first_program.c; then
  echo "README.md: the first program differs from examples/first_program.c"
  status=1
fi

links=0
for document in README.md CONTRIBUTING.md docs/*.md; do
  while read -r target; do
    links=$((links + 1))
    [ -e "$(dirname "$document")/$target" ] || { echo "$document: no such file: $target"; status=1; }
  done < <(grep -oE '\]\([^)#]+' "$document" | sed 's/^](//' | grep -vE '^[a-z]+:')
done
[ "$links" -ge 10 ] || { echo "only $links links found"; status=1; }

for command in $(grep -ohE '\bscripts/[a-z]+(\.txt)?' README.md CONTRIBUTING.md docs/*.md | sort -u); do
  [ -f "$command" ] || { echo "$command is named in the documents and does not exist"; status=1; }
done
for script in demo test setup check size layout format; do
  [[ $("scripts/$script" --help) == *usage* ]] || { echo "scripts/$script --help shows no usage"; status=1; }
done
exit $status
