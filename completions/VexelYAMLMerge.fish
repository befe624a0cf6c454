function __vexel_yaml_merge_assets
    __fish_complete_path (string unescape -- (commandline -ct)) |
        string match -r '.*(?:/|\.(?:vexel|prefab|meta))(?:\t.*)?$'
end

set -l command complete -c VexelYAMLMerge
set -l first "test (count (commandline -opc)) -eq 1"
set -l merge "__fish_seen_subcommand_from merge"
set -l on_files "__fish_seen_subcommand_from merge diff strip"

$command -f
$command -n $first -a merge -d "Merge two versions of a file"
$command -n $first -a diff -d "Print what changed between two files"
$command -n $first -a strip -d "Write what is new in the second file"
$command -n $first -a unittest -d "Check the program"

$command -n $merge -s l -d "Take the left value at conflicts"
$command -n $merge -s r -d "Take the right value at conflicts"
$command -n $merge -s p -d "Premerge for another merge tool"
$command -n $merge -s i -rF -d "Settle conflicts as a record file says"
$command -n $merge -s o -rF -d "Write the records to a file"
$command -n $merge -l fallback -rF -a "none auto" -d "Other fallback tools"
$command -n $merge -l force -d "Merge a file whatever its extension"
$command -n $merge -l describe -d "Record also what merged without conflict"
$command -n $merge -l safe -d "Merge scenes as scenes"
$command -n $on_files -l rules -rF -d "Other merge rules"
$command -n $on_files -l typeInfo -rF -d "Type information"
$command -n $on_files -s h -d "No dialogs"
$command -n $on_files -l timing -d "Print how long each step took"
$command -n $on_files -l nothreads -d "Read one file after the other"

$command -n "not $first; and not contains -- --force (commandline -opc)" -a "(__vexel_yaml_merge_assets)"
$command -n "not $first; and contains -- --force (commandline -opc)" -F
