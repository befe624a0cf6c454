#pragma once

#include <cstdint>
#include <istream>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

/// How the elements of a sequence are identified.
enum class SequenceType {
  Set = 0,    // by the values of their key fields
  Plain = 1,  // without keys, by equality
};

struct SequenceInfo {
  SequenceType type;
  FieldPath path;
  std::vector<FieldPath> keys;
};

struct ExclusionPathInfo {
  FieldPath path;
  bool mergeable;
};

struct ExclusionInfo {
  FieldPath path;
  std::vector<FieldPath> keys;
  bool mergeable;
};

struct ComparisonInfo {
  FieldPath path;
  float relativeTolerance;
  float absoluteTolerance;
};

/// Lines the elements of two versions of one list up, by identity where the rules give one.
///
/// An entry of the mapping is the destination index of that source element, or kDropped.
/// "No remapper" (a null pointer) always means the identity: finders never return one.
class YAMLSequenceRemapper {
 public:
  static constexpr uint32_t kDropped = 0xFFFFFFFF;

  YAMLSequenceRemapper() = default;

  /// Every entry is kDropped at first.
  YAMLSequenceRemapper(uint32_t source_count, uint32_t destination_count);

  /// A remapper from the pool that leaves everything in place, owned by the caller; marked as found by
  /// identity.
  static YAMLSequenceRemapper* CreateIdentity(uint32_t count);

  const std::vector<uint32_t>& GetMapping() const { return mapping_; }
  uint32_t GetDestinationCount() const { return destination_count_; }

  /// Whether the elements were matched by identity (keys), not by equality.
  bool IsSetRemapper() const { return is_set_; }
  bool IsIdentity() const;

  /// Takes destination positions out, each named once; the later ones move down. Each must lie below the
  /// destination count, and no source element may be mapped to it.
  void RemoveDestinations(const std::vector<uint32_t>& ascending);

  /// Matches `base` with `changed`, both at field path `path`: by keys, or by equality where the rules want
  /// it or an element has no key or shares it with another. Returns a remapper from the pool, owned by the
  /// caller, or null for the identity. Throws std::length_error where the common prefix and suffix overlap in
  /// `changed`.
  static YAMLSequenceRemapper* FindMapping(const FieldPath& path, const YAMLSequence& base,
                                           const YAMLSequence& changed);

  /// Matches by equality; `path` only names the place in the length error. Otherwise like FindMapping.
  static YAMLSequenceRemapper* FindGenericMapping(const FieldPath& path, const YAMLSequence& base,
                                                  const YAMLSequence& changed);

  /// Matches by keys; elements without key values stay unmatched, and of several target elements with one
  /// key the first has it. With `keep_identity` never null.
  static YAMLSequenceRemapper* FindIdMapping(const std::vector<FieldPath>& key_paths,
                                             const YAMLSequence& source, const YAMLSequence& target,
                                             bool keep_identity);

  /// Builds the common layout of a three-way merge from base -> left and base -> right, which have an entry
  /// for each element of the same base: an addition follows the base element that it was inserted after,
  /// left's before right's. What one side removed is kept or dropped as the flag says, what both removed is
  /// dropped. Returns base -> merged; `left_out` and `right_out` receive left -> merged and right -> merged.
  /// All three from the pool, owned by the caller.
  static YAMLSequenceRemapper* Merge(const YAMLSequenceRemapper& left, const YAMLSequenceRemapper& right,
                                     YAMLSequenceRemapper*& left_out, YAMLSequenceRemapper*& right_out,
                                     bool drop_if_removed_on_either_side);

  /// Rearranges `sequence` in place. Dropped elements are freed; slots that receive nothing are null.
  void Apply(YAMLSequence& sequence) const;

  /// The key paths by which the elements at `path` are matched: one of the lists below, or a rule's own.
  /// Empty where they are matched by equality.
  static const std::vector<FieldPath>& ChooseKeyPaths(const FieldPath& path);

  /// What stands at `path` below `node`: "_" stays where it is, "*" steps to the first value of a mapping.
  /// Null where nothing does, also where a step leads through a mapping with duplicate keys.
  static const YAMLNode* GetYAMLNodeFieldByPath(const YAMLNode* node, const FieldPath& path);
  /// The scalars at the key paths, in their order; nothing at all where one of them has none.
  static std::vector<const YAMLScalar*> GetUniqueMappingValues(const std::vector<FieldPath>& key_paths,
                                                               const YAMLNode* node);
  /// The values joined with ":", as a scalar, so that keys compare as pointers.
  static const YAMLScalar* CollapseKeyElementValues(const std::vector<const YAMLScalar*>& values);

  /// Fills the tables below from a rules file. One load a process. Throws std::runtime_error with the
  /// message, the 1-based line number and a line break.
  static void LoadSequenceUniqueKeys(std::istream& stream);
  /// Adds the pieces of `text` between the delimiters to `tokens`, save the empty ones.
  static void Tokenize(std::string_view text, char delimiter, std::vector<std::string>& tokens);
  static void AddSequenceUniqueKeys(SequenceType type, FieldPath path, std::vector<FieldPath> keys);
  static void AddExclusionFieldPath(FieldPath path, bool exclude);
  static void AddExclusionIfContainsFieldPath(FieldPath path, std::vector<FieldPath> keys, bool exclude);
  static void AddComparisonFieldPath(FieldPath path, float relative_tolerance, float absolute_tolerance);

  /// Whether changes at `path` may be merged part by part.
  static bool IsMergeablePath(const FieldPath& path);

  /// The same for a value, by what it contains; `matched` tells whether a rule said so.
  static bool IsMergeablePath(const FieldPath& path, const YAMLNode* node, bool& matched);

  /// The first comparison rule for `path`, null where there is none.
  static const ComparisonInfo* FindComparison(const FieldPath& path);

  /// The first include/exclude rule for `path`, null where there is none.
  static const ExclusionPathInfo* FindExclusion(const FieldPath& path);

  static bool CheckBlankPremergeBaseEnabled() { return s_PremergeBaseValues; }

  /// Rule tables, in file order; filled before any file is read, only queried afterwards.
  static std::vector<SequenceInfo> s_ArrayUniqueKeyMap;
  static std::vector<ExclusionPathInfo> s_ExclusionFieldPaths;
  static std::vector<ExclusionInfo> s_DiffExclusionFieldPaths;
  static std::vector<ComparisonInfo> s_ComparisonFieldPaths;
  static bool s_PremergeBaseValues;

  /// [["fileID"]], [["_"]] and nothing.
  static std::vector<FieldPath> defaultPath;
  static std::vector<FieldPath> defaultDirectPath;
  static const std::vector<FieldPath> noPaths;

  /// Back to nothing, for the pool.
  void ResetForAlloc();

 private:
  using KeyIndexes = std::unordered_map<const YAMLScalar*, uint32_t>;

  static void Initialize();

  /// Finds the element of every key; false where an element has no key or shares it.
  static bool FindUniqueIndexes(const std::vector<FieldPath>& key_paths, const YAMLSequence& sequence,
                                KeyIndexes& indexes);

  /// What the finders return for `found`: a remapper from the pool, null for the identity.
  static YAMLSequenceRemapper* IntoPoolUnlessIdentity(YAMLSequenceRemapper found);

  std::vector<uint32_t> mapping_;
  uint32_t destination_count_ = 0;
  bool is_set_ = false;
};

/// Whether `path` has as many components as `pattern`, each equal to the pattern's or met by its "*".
bool MatchesPattern(const FieldPath& pattern, const FieldPath& path);

/// The components joined by ".", on one line: control characters, line breaks and marks that turn the
/// direction of a text are written as in C, "\n" or "\x1b", a character of several bytes as one "\x" for
/// each. Nothing else is escaped, not even a dot.
std::string PathToString(const FieldPath& path);

/// A pattern for a line of a record file that matches `path` and, of the paths whose components are all among
/// `others`, no other one, neither as it stands nor with its escapes resolved.
std::string PathPattern(const FieldPath& path, const std::unordered_set<const YAMLScalar*>& others);

/// The component that such a text stands for: `component` itself where it holds no escape. "\x" takes exactly
/// two digits, so that every byte can be written, a dot or a blank too; "\&" stands for nothing.
const YAMLScalar* ResolveEscapes(const YAMLScalar* component);

/// Reads the rules file: `path` is the value of "--rules", "auto" for the default file beside the executable.
/// Throws YAMLError "Cannot open rules file for reading:" + the file's path (a folder counts), and what
/// LoadSequenceUniqueKeys throws.
void SetupRules(const std::string& path);

}  // namespace vexel_yaml
