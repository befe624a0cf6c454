# As they are called from the current folder.
function __vexel_merge_git_unmerged
    git ls-files --unmerged -z :/ 2>/dev/null | string split0 | string replace -r '^[^\t]*\t' '' | sort -u
end

# The places of the conflicts that the records name.
function __vexel_merge_git_conflicts
    for file in (__vexel_merge_git_unmerged)
        test -f $file.vexel-conflicts; and string replace -rf '^Left  (\S+).*' '$1' <$file.vexel-conflicts
    end
end

function __vexel_merge_git_revisions
    echo HEAD
    git for-each-ref --format='%(refname:short)' 2>/dev/null
end

set -l command complete -c vexel-merge-git
set -l first "test (count (commandline -opc)) -eq 1"
set -l resolve "__fish_seen_subcommand_from resolve"
set -l report "__fish_seen_subcommand_from report"

$command -f
$command -n $first -a enable -d "Set git up"
$command -n $first -a disable -d "Undo what enable did"
$command -n $first -a status -d "Say what is set"
$command -n $first -a resolve -d "Settle conflicts and merge again"
$command -n $first -a check -d "Say what nobody has settled"
$command -n $first -a preview -d "Say what a merge would do"
$command -n $first -a report -d "Write a page for each file"
$command -n $first -a review -d "Show what changed on a page"
$command -n $first -l version -d "Print the version"
$command -n $first -l help -d "Print a short help"

$command -n "__fish_seen_subcommand_from enable disable" -l global -d "For all your repositories"
$command -n "__fish_seen_subcommand_from enable" -l patterns -x -a "'*.vexel *.prefab *.meta'" -d "Which files"

$command -n $resolve -l theirs -l left -d "Take what they did"
$command -n $resolve -l ours -l right -d "Take what we did"
$command -n $resolve -l base -d "Take neither"
$command -n $resolve -l path -x -a "(__vexel_merge_git_conflicts)" -d "Only conflicts whose path fits"
$command -n $resolve -l web -d "Settle on a page in the browser"
$command -n "__fish_seen_subcommand_from resolve review" -l port -x -d "The page's port"
$command -n "__fish_seen_subcommand_from resolve review" -l no-browser -d "Print the page's address alone"
$command -n $resolve -s p -d "Ask conflict by conflict"
$command -n $resolve -l color -x -a "auto always never" -d "When to use colour"
$command -n $resolve -l as-is -d "With nothing left to decide"
$command -n $resolve -l force -d "Lose what was edited since"
$command -n $resolve -a "(__vexel_merge_git_unmerged)"

$command -n "__fish_seen_subcommand_from check" -l staged -d "Look at what is staged"
$command -n "__fish_seen_subcommand_from check" -l conflicts -d "Look for conflicts alone"
$command -n "__fish_seen_subcommand_from check preview review" -a "(__vexel_merge_git_revisions)"
$command -n "__fish_seen_subcommand_from check" -F

$command -n $report -s o -rF -d "Write the page to a file"
$command -n "$report; and not contains -- -- (commandline -opc)" -a "(__vexel_merge_git_revisions)"
$command -n "$report; and contains -- -- (commandline -opc)" -F
