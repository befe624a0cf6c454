function __vexel_merge_report_assets
    __fish_complete_path (string unescape -- (commandline -ct)) |
        string match -r '.*(?:/|\.(?:vexel|prefab|meta))(?:\t.*)?$'
end

set -l command complete -c vexel-merge-report

$command -f
$command -s o -rF -d "Write the page to a file"
$command -l title -x -d "Title of the page"
$command -l theirs -x -d "Who is behind left"
$command -l ours -x -d "Who is behind right"
$command -l committed -rF -d "What became of the result"
$command -s i -rF -d "Settle conflicts as a record file says"
$command -l assets -rF -d "Names of other assets"
$command -l rules -rF -d "Other merge rules"
$command -l typeInfo -rF -d "Type information"
$command -l safe -d "Merge scenes as scenes"
$command -l summary -d "Print what the page has in numbers"
$command -l json -d "Write JSON for other programs"
$command -l conflicts -d "Print the conflicts, one a line"
$command -l text -d "Print a file with readable headers"
$command -l version -d "Print the version"
$command -l help -d "Print a short help"
$command -a "(__vexel_merge_report_assets)"
