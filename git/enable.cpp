#include <sys/stat.h>
#include <unistd.h>

#include <iostream>
#include <sstream>

#include "git/conflict_records.h"
#include "git/git_call.h"
#include "git/repository.h"
#include "git/setup.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kDefaultPatterns = "*.vexel *.prefab *.meta";

struct Options {
  bool is_global = false;
  std::optional<std::string> patterns;
};

std::string AttributeLines(std::string_view patterns) {
  std::istringstream words{std::string(patterns)};
  std::string lines;
  for (std::string pattern; words >> pattern;) {
    lines += (lines.empty() ? "" : "\n") + pattern + " merge=vexel diff=vexel";
  }
  return lines;
}

Options Parse(const std::vector<std::string>& arguments) {
  Options options;
  for (auto argument = arguments.begin(); argument != arguments.end(); ++argument) {
    if (*argument == "--global") {
      options.is_global = true;
    } else if (*argument == "--patterns") {
      if (++argument == arguments.end()) throw WrongUsage("--patterns needs a value");
      options.patterns = *argument;
    } else if (argument->starts_with("--patterns=")) {
      options.patterns = argument->substr(11);
    } else {
      throw WrongUsage("unknown argument '" + *argument + "'");
    }
  }
  if (!options.patterns) return options;
  if (AttributeLines(*options.patterns).empty()) throw CommandError("--patterns is empty");
  if (options.patterns->find(',') != std::string::npos) {
    throw CommandError("patterns stand with blanks between them, not commas");
  }
  return options;
}

void CopyFile(const std::string& from, const std::string& to) {
  struct stat status = {};
  const mode_t mode = stat(from.c_str(), &status) == 0 ? status.st_mode & 0777 : 0600;
  if (!PutFile(to, TextOf(from), mode)) throw CommandError("cannot write " + to);
}

// The keys of git's configuration, with what is remembered of each.
class Configuration {
 public:
  explicit Configuration(const SetupPlaces& places) : places_(places) {}

  void Check(const std::string& key) const {
    const ProgramResult values = Git({"config", places_.scope, "-z", "--get-all", key});
    if (Pieces(values.output, '\0').size() > 1)
      throw CommandError(key + " has several values; leave one at most");
  }

  // Comments, order and blanks are only in a copy of the whole file. It is good as long as the file stays as
  // enable left it; after that, one key after the other is restored.
  void Keep() const {
    if (!SetKeys().empty()) {
      if (TextOf(places_.config) == TextOf(After())) return;
      unlink(Before().c_str());
      unlink(After().c_str());
    } else if (IsFile(places_.config)) {
      CopyFile(places_.config, Before());
    } else {
      places_.state.Remember("config.absent", "true");
    }
  }

  // Returns whether that changed anything.
  bool Set(const std::string& key, const std::string& value) const {
    const std::optional<std::string> current = Get(key);
    if (current == value) return false;
    // A value that is neither ours nor the wanted one is somebody's own.
    if (current && current != places_.state.Recall("key." + key + ".added").value_or("")) {
      places_.state.Remember("key." + key + ".previous", *current);
    }
    places_.state.Remember("key." + key + ".added", value);
    Change({key, value});
    return true;
  }

  void NoteChanges() const {
    if (IsFile(Before())) CopyFile(places_.config, After());
  }

  void Restore() const {
    if (IsFile(Before()) && TextOf(places_.config) == TextOf(After())) {
      ReplaceOwnFile(places_.config, TextOf(Before()));
      return;
    }
    for (const std::string& key : SetKeys()) RestoreKey(key);
    const bool is_empty = IsFile(places_.config) && TextOf(places_.config).empty();
    if (is_empty && places_.state.Recall("config.absent")) unlink(places_.config.c_str());
  }

 private:
  std::string Before() const { return places_.state.Beside("before"); }
  std::string After() const { return places_.state.Beside("after"); }

  std::optional<std::string> Get(const std::string& key) const {
    const ProgramResult result = Git({"config", places_.scope, "--get", key});
    if (result.status != 0) return std::nullopt;
    return Line(result);
  }

  void Change(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), {"config", places_.scope});
    if (Git(std::move(arguments)).status != 0) throw CommandError("cannot change " + places_.config);
  }

  void RestoreKey(const std::string& key) const {
    const std::optional<std::string> current = Get(key);
    if (!current || current != places_.state.Recall("key." + key + ".added")) return;
    if (const auto previous = places_.state.Recall("key." + key + ".previous")) {
      Change({key, *previous});
    } else {
      Change({"--unset", key});
    }
  }

  std::vector<std::string> SetKeys() const {
    constexpr std::string_view kBefore = "key.";
    constexpr std::string_view kBehind = ".added";
    if (!IsFile(places_.state.GetPath())) return {};
    std::vector<std::string> keys = Pieces(Git({"config", "-f", places_.state.GetPath(), "-z", "--name-only",
                                                "--get-regexp", R"(^key\..*\.added$)"})
                                               .output,
                                           '\0');
    for (std::string& key : keys)
      key = key.substr(kBefore.size(), key.size() - kBefore.size() - kBehind.size());
    return keys;
  }

  const SetupPlaces& places_;
};

// Git's list of changes alone would tell.
void TellAttributes() {
  const std::string state = Git({"status", "--porcelain", "--", ".gitattributes"}).output;
  if (state.empty() || state.starts_with("??")) return;
  Tell(std::string(".gitattributes is tracked, and has ") + (IsFile(".gitattributes") ? "changed" : "gone") +
       ": commit that if your colleagues are to merge scenes as text again, or else: git checkout "
       ".gitattributes");
}

// A file that the configuration includes may have the last word.
void CheckEffect(const std::string& key, const std::string& value) {
  if (Line(Git({"config", "--get", key})) == value) return;
  throw CommandError("another setting of " + key + " counts here: git config --show-origin --get-all " + key);
}

}  // namespace

int RunEnable(const std::vector<std::string>& arguments) {
  const Options options = Parse(arguments);
  const SetupPlaces places = SetupPlaces::Find(options.is_global);
  const std::string folder = GetDataFilesDir();
  if (access((folder + "VexelYAMLMerge").c_str(), X_OK) != 0) {
    throw CommandError("VexelYAMLMerge is not beside vexel-merge-git, in " +
                       folder.substr(0, folder.size() - 1));
  }
  if (!places.is_global && !IsPlain(places.attributes)) {
    throw CommandError("git follows no symbolic link or folder at " + places.attributes);
  }
  auto wanted = WantedConfiguration();
  // Git has one tool for all files, and somebody's own choice counts more.
  const ProgramResult tool = GitQuietly({"config", "--get", "merge.tool"});
  if (tool.status != 0 || Line(tool) == "vexel") wanted.emplace_back("merge.tool", "vexel");
  const Configuration configuration(places);
  const MarkedBlock block(places.attributes, "attributes", places.state);
  for (const auto& [key, value] : wanted) configuration.Check(key);
  const bool has_block = block.Exists();
  if (!MakeFoldersFor(places.state.GetPath())) throw CommandError("cannot write " + places.state.GetPath());
  configuration.Keep();
  bool has_changed = false;
  for (const auto& [key, value] : wanted) has_changed = configuration.Set(key, value) || has_changed;
  configuration.NoteChanges();
  // A block that is there already may be a colleague's, or edited: it counts unless others are asked for.
  if (options.patterns || !has_block) {
    has_changed = block.Set(AttributeLines(options.patterns ? std::string_view(*options.patterns)
                                                            : kDefaultPatterns)) ||
                  has_changed;
  }
  if (places.is_global) {
    places.state.Remember("attributes.path", places.attributes);
  } else {
    ExcludeRecords(Repository());
  }
  const std::string are_merged =
      Joined(GivenPatterns(places.attributes)) + " are merged structurally in " + places.Where() + ".";
  Tell((has_changed ? "From now on, " : "Nothing to change: ") + are_merged);
  if (places.is_global) return 0;
  if (has_changed && !Git({"status", "--porcelain", "--", ".gitattributes"}).output.empty()) {
    Tell(
        ".gitattributes has changed: commit it, and only 'vexel-merge-git enable' is left to your "
        "colleagues.");
  }
  for (const auto& [key, value] : wanted) CheckEffect(key, value);
  return 0;
}

int RunDisable(const std::vector<std::string>& arguments) {
  const Options options = Parse(arguments);
  if (options.patterns) throw WrongUsage("--patterns is only for enable");
  const SetupPlaces places = SetupPlaces::Find(options.is_global);
  const MarkedBlock attributes(places.attributes, "attributes", places.state);
  if (!places.is_global) {
    const Repository repository;
    const ConflictRecords records(repository);
    records.Sweep();
    if (records.HaveAny())
      throw CommandError("a merge is not done: settle its conflicts and commit it, or abort it first");
  }
  if (!IsFile(places.state.GetPath())) {
    Tell("Nothing to undo in " + places.Where() + ".");
    return 0;
  }
  if (places.is_global) {
    attributes.Restore();
  } else {
    // A symbolic link that has taken the file's place since then leads to somebody else's file.
    if (IsPlain(places.attributes)) attributes.Restore();
    const std::string exclude = ExcludeFile(Repository());
    if (!exclude.empty()) MarkedBlock(exclude, "exclude", places.state).Restore();
    TellAttributes();
  }
  // What git has kept of textconv, also where that was set for all repositories.
  GitQuietly({"update-ref", "-d", "refs/notes/textconv/vexel"});
  Configuration(places).Restore();
  unlink(places.state.GetPath().c_str());
  for (const char* suffix : {"before", "after", "attributes", "exclude"})
    unlink(places.state.Beside(suffix).c_str());
  Tell("Undone in " + places.Where() + ".");
  if (places.is_global) {
    Tell(
        "In other repositories, git keeps what it has shown of scenes: git update-ref -d "
        "refs/notes/textconv/vexel");
  }
  if (Line(Git({"config", "--get", "merge.vexel.driver"})).find("vexel-merge-git") != std::string::npos) {
    Tell("It is still set for all your repositories: see 'vexel-merge-git disable --global'.");
  }
  return 0;
}

}  // namespace vexel_yaml
