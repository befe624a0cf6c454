#include "git/web/review.h"

#include "git/asset_names.h"
#include "git/git_call.h"
#include "git/merged_commits.h"
#include "git/repository.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/web/page_options.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

struct Arguments {
  std::string range;
  std::string port;
  bool opens_browser = true;
  std::vector<std::string> paths;
};

Arguments Parse(const std::vector<std::string>& arguments) {
  Arguments parsed;
  auto argument = arguments.begin();
  for (; argument != arguments.end() && *argument != "--"; ++argument) {
    if (*argument == "--no-browser") {
      parsed.opens_browser = false;
    } else if (*argument == "--port") {
      if (++argument == arguments.end()) throw WrongUsage("--port needs a value");
      parsed.port = *argument;
    } else if (argument->starts_with('-')) {
      throw WrongUsage("unknown option '" + *argument + "'");
    } else {
      if (!parsed.range.empty())
        throw WrongUsage("review needs one <from> or <from>..<to>; paths stand behind --");
      parsed.range = *argument;
    }
  }
  if (argument != arguments.end()) parsed.paths.assign(argument + 1, arguments.end());
  if (parsed.range.empty()) throw WrongUsage("review needs <from> or <from>..<to>");
  return parsed;
}

// Two versions of the work tree, by commits; no `to` is the work tree as it is.
struct Range {
  std::string from;
  std::string to;
  std::string from_name;
  std::string to_name;
};

// As git diff reads them: three dots are what happened on the second branch alone.
Range FindRange(const std::string& text) {
  const size_t dots = text.find("..");
  if (dots == std::string::npos) return {FindCommit(text), {}, text, "as it is now"};
  const bool is_from_fork = text.substr(dots).starts_with("...");
  const auto side = [](const std::string& name) { return name.empty() ? std::string("HEAD") : name; };
  Range range = {{}, {}, side(text.substr(0, dots)), side(text.substr(dots + (is_from_fork ? 3 : 2)))};
  range.from = FindCommit(range.from_name);
  range.to = FindCommit(range.to_name);
  if (!is_from_fork) return range;
  const ProgramResult fork = Git({"merge-base", range.from, range.to});
  if (fork.status != 0) throw CommandError("there is no common ancestor in " + text);
  range.from = Line(fork);
  range.from_name = "before " + range.to_name;
  return range;
}

class Review {
 public:
  explicit Review(Range range) : range_(std::move(range)) {}

  // Adds it to the files, unless it is no scene in any of the two versions.
  void Add(const std::string& asset, std::vector<ViewFile>& files) {
    const std::string number = std::to_string(files.size());
    const std::string before = Version(range_.from, "before " + number, asset);
    const std::string after = Version(range_.to, "after " + number, asset);
    if (!IsAsset(before) && !IsAsset(after)) return;
    ViewFile file = {asset, before, after, {}, true};
    file.base_name = range_.from_name;
    file.theirs_name = range_.to_name;
    file.asset_search = FindAssetNames;
    file.has_temporary_paths = true;
    files.push_back(std::move(file));
  }

 private:
  // No object where the file isn't there: all of it was added, or removed.
  std::string Version(const std::string& commit, const std::string& name, const std::string& asset) {
    constexpr std::string_view kNoObjects = "%YAML 1.1\n";
    const bool is_there = commit.empty() && IsPlain(asset) && IsFile("./" + asset);
    const std::string version = is_there         ? scratch_.Write(name, TextOf("./" + asset))
                                : commit.empty() ? std::string()
                                                 : WriteVersion(commit, name, asset, scratch_);
    return version.empty() ? scratch_.Write(name, kNoObjects) : version;
  }

  const Range range_;
  ScratchFolder scratch_;
};

}  // namespace

int ReviewOnPage(const std::vector<std::string>& arguments) {
  const Arguments parsed = Parse(arguments);
  const ViewServerOptions options = PageOptions(parsed.port, parsed.opens_browser);
  TopFolder();
  const Range range = FindRange(parsed.range);
  const std::vector<std::string> changed = ChangedPaths(range.from, range.to, parsed.paths);
  GoToTop();
  LoadForPage(SettingsQuery().Get());
  Review review(range);
  std::vector<ViewFile> files;
  for (const std::string& asset : OursAmong(changed)) review.Add(asset, files);
  if (files.empty()) throw CommandError("no file of ours has changed in " + parsed.range);
  return ShowPage(std::move(files), options, {});
}

}  // namespace vexel_yaml
