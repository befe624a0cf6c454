#include <algorithm>
#include <cerrno>
#include <limits>
#include <optional>
#include <sstream>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "platform/files.h"
#include "platform/hinted_error.h"
#include "platform/read_whole_file.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

std::vector<SequenceInfo> YAMLSequenceRemapper::s_ArrayUniqueKeyMap;
std::vector<ExclusionPathInfo> YAMLSequenceRemapper::s_ExclusionFieldPaths;
std::vector<ExclusionInfo> YAMLSequenceRemapper::s_DiffExclusionFieldPaths;
std::vector<ComparisonInfo> YAMLSequenceRemapper::s_ComparisonFieldPaths;
bool YAMLSequenceRemapper::s_PremergeBaseValues = false;
std::vector<FieldPath> YAMLSequenceRemapper::defaultPath;
std::vector<FieldPath> YAMLSequenceRemapper::defaultDirectPath;
const std::vector<FieldPath> YAMLSequenceRemapper::noPaths;

namespace {

using Remapper = YAMLSequenceRemapper;

enum class Section { kNone, kArrays, kExclusions, kComparisons, kPremerge };

bool ReadSectionHeader(const std::string& token, Section& section) {
  if (token == "[arrays]") {
    section = Section::kArrays;
  } else if (token == "[exclusions]") {
    section = Section::kExclusions;
  } else if (token == "[comparisons]") {
    section = Section::kComparisons;
  } else if (token == "[premerge]") {
    section = Section::kPremerge;
  } else {
    return false;
  }
  return true;
}

FieldPath SplitPath(std::string_view text) {
  std::vector<std::string> components;
  Remapper::Tokenize(text, '.', components);
  FieldPath path;
  path.reserve(components.size());
  for (const std::string& component : components) path.push_back(YAMLScalar::Lookup(component));
  return path;
}

// One line that is neither empty nor a comment nor a section header.
class Rule {
 public:
  Rule(const std::vector<std::string>& tokens, size_t line) : tokens_(tokens), line_(line) {}

  void Add(Section section) const {
    switch (section) {
      case Section::kNone:
        Fail("Rules file must specify section before any rules e.g. [arrays]. at line ");
      case Section::kArrays:
        return AddArray();
      case Section::kExclusions:
        return AddExclusion();
      case Section::kComparisons:
        return AddComparison();
      case Section::kPremerge:
        return AddPremerge();
    }
  }

 private:
  [[noreturn]] void Fail(const std::string& message) const {
    throw std::runtime_error(message + std::to_string(line_) + "\n");
  }
  [[noreturn]] void FailFormat() const { Fail("Invalid rule format at line "); }
  [[noreturn]] void FailAction() const { Fail("Invalid rule format missing action at line "); }

  FieldPath GetPath() const { return SplitPath(tokens_[1]); }

  std::vector<FieldPath> GetKeys() const {
    std::vector<FieldPath> keys;
    for (size_t i = 2; i < tokens_.size(); ++i) keys.push_back(SplitPath(tokens_[i]));
    return keys;
  }

  void AddArray() const {
    if (tokens_.size() < 2) FailFormat();
    const bool set = tokens_[0] == "set";
    if (!set && tokens_[0] != "plain") FailAction();
    if (set && tokens_.size() == 2) Fail("Invalid format of unique key specification at line ");
    Remapper::AddSequenceUniqueKeys(set ? SequenceType::Set : SequenceType::Plain, GetPath(), GetKeys());
  }

  void AddExclusion() const {
    if (tokens_.size() < 2) FailFormat();
    const std::string& action = tokens_[0];
    const bool exclude = action == "exclude" || action == "excludeIfContains";
    if (action == "include" || action == "exclude") {
      return Remapper::AddExclusionFieldPath(GetPath(), exclude);
    }
    if (action != "includeIfContains" && action != "excludeIfContains") {
      Fail("Invalid format of excluded key specification at line ");
    }
    if (tokens_.size() == 2) Fail("Invalid format of excludeIfContains specification at line ");
    Remapper::AddExclusionIfContainsFieldPath(GetPath(), GetKeys(), exclude);
  }

  void AddComparison() const {
    if (tokens_.size() < 2 || tokens_.size() > 4) FailFormat();
    if (tokens_[0] != "float") FailAction();
    const float relative = GetNumber(2, std::numeric_limits<float>::epsilon());
    Remapper::AddComparisonFieldPath(GetPath(), relative, GetNumber(3, relative));
  }

  // Read like a value of an asset file, so that both mean the same number.
  float GetNumber(size_t token, float otherwise) const {
    return token < tokens_.size() ? YAMLScalar::Lookup(tokens_[token])->GetFloatValue() : otherwise;
  }

  void AddPremerge() const {
    if (tokens_.size() != 1) FailFormat();
    if (tokens_[0] != "legacyBlankPremergeBase") FailAction();
    Remapper::s_PremergeBaseValues = true;
  }

  const std::vector<std::string>& tokens_;
  const size_t line_;
};

}  // namespace

void YAMLSequenceRemapper::Initialize() {
  defaultDirectPath.push_back({YAMLScalar::underscore});
  defaultPath.push_back({YAMLScalar::fileID});
}

void YAMLSequenceRemapper::LoadSequenceUniqueKeys(std::istream& stream) {
  Initialize();
  Section section = Section::kNone;
  std::vector<std::string> tokens;
  std::string line;
  for (size_t number = 1; std::getline(stream, line); ++number) {
    if (line.starts_with('#')) continue;
    tokens.clear();
    Tokenize(line, ' ', tokens);
    if (tokens.empty() || ReadSectionHeader(tokens[0], section)) continue;
    Rule(tokens, number).Add(section);
  }
}

void YAMLSequenceRemapper::Tokenize(std::string_view text, char delimiter, std::vector<std::string>& tokens) {
  while (!text.empty()) {
    const std::string_view token = text.substr(0, text.find(delimiter));
    if (!token.empty()) tokens.emplace_back(token);
    text.remove_prefix(std::min(token.size() + 1, text.size()));
  }
}

void YAMLSequenceRemapper::AddSequenceUniqueKeys(SequenceType type, FieldPath path,
                                                 std::vector<FieldPath> keys) {
  s_ArrayUniqueKeyMap.push_back({type, std::move(path), std::move(keys)});
}

void YAMLSequenceRemapper::AddExclusionFieldPath(FieldPath path, bool exclude) {
  s_ExclusionFieldPaths.push_back({std::move(path), !exclude});
}

void YAMLSequenceRemapper::AddExclusionIfContainsFieldPath(FieldPath path, std::vector<FieldPath> keys,
                                                           bool exclude) {
  s_DiffExclusionFieldPaths.push_back({std::move(path), std::move(keys), !exclude});
}

void YAMLSequenceRemapper::AddComparisonFieldPath(FieldPath path, float relative_tolerance,
                                                  float absolute_tolerance) {
  s_ComparisonFieldPaths.push_back({std::move(path), relative_tolerance, absolute_tolerance});
}

void SetupRules(const std::string& path) {
  const std::string file = path == "auto" ? GetDataFilePath("mergerules.txt") : path;
  const std::optional<std::string> text = ReadWholeFile(VexelToNativePath(file));
  if (!text) {
    throw YAMLError("Cannot open rules file for reading:" + file, std::generic_category().message(errno));
  }
  std::istringstream stream(*text);
  try {
    YAMLSequenceRemapper::LoadSequenceUniqueKeys(stream);
  } catch (const std::runtime_error& error) {
    throw HintedError(error.what(), "in rules file '" + file + "'");
  }
}

}  // namespace vexel_yaml
