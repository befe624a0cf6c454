function __vexel_merge_view_assets
    __fish_complete_path (string unescape -- (commandline -ct)) |
        string match -r '.*(?:/|\.(?:vexel|prefab|meta))(?:\t.*)?$'
end

set -l command complete -c vexel-merge-view

$command -f
$command -s i -rF -d "Settle conflicts as a record file says"
$command -s o -rF -d "Write a record of the merge"
$command -l plain -d "Merge value by value"
$command -l rules -rF -d "Other merge rules"
$command -l typeInfo -rF -d "Type information"
$command -l title -x -d "What the page calls the file"
$command -l theirs -x -d "Who is behind left"
$command -l ours -x -d "Who is behind right"
$command -l base -x -d "What base is"
$command -l port -x -d "Port of the page"
$command -l no-browser -d "Start no browser"
$command -l idle-timeout -x -d "Give up after so many seconds"
$command -l version -d "Print the version"
$command -l help -d "Print a short help"
$command -a "(__vexel_merge_view_assets)"
