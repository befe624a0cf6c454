// lost_edits BASE LEFT RIGHT MERGED RECORDS checks one merge, whose records were written with --describe.
// lost_edits --random FIRST COUNT [--spoil] merges so many random triples and checks each merge; with --spoil
// it also spoils the results, and each that is spoiled must be found.
#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <iterator>
#include <sstream>
#include <stdexcept>

#include "app/random_scenes.h"
#include "fixups/three_way_merge.h"
#include "merge/conflict_record_file.h"
#include "tests/lost_edits/checker.h"
#include "tests/lost_edits/hostile_scenes.h"
#include "yaml/read_yaml.h"

namespace vexel_yaml::lost_edits {

namespace {

// A merge, as the walk sees it.
struct Merged {
  Value base, left, right, merged;
  std::string records;
};

// How many of the checker's exceptions random scenes need: all but that of repaired references.
constexpr long kExceptions = 10;

std::map<std::string, size_t> totals;

Checker Check(const Merged& merge) {
  Checker checker(merge.records);
  checker.Check(merge.base, merge.left, merge.right, merge.merged);
  return checker;
}

// Every other seed gives a hostile scene, the rest scenes with odd texts and moved fields.
SceneTriple MakeTriple(uint32_t seed) {
  if (seed % 2 == 1) return RandomTriple(seed);
  const auto [base, left, right] = MakeHostileTriple(seed);
  return {ReadScene(base), ReadScene(left), ReadScene(right), true};
}

// Every third seed with each default side, every fifth with a choice of the user.
Merged Merge(const SceneTriple& triple, uint32_t seed) {
  RecordingConflictResolver resolver(static_cast<MergeResolve>(1 + seed / 2 % 3));
  if (seed % 5 == 0) {
    constexpr const char* kChoices[] = {"left *.*.a", "right *.*.list", "base *.*.inner", "left *",
                                        "right 2"};
    std::istringstream choices(std::string("Conflict handling:\n") + kChoices[seed / 5 % 5] + "\n");
    InputConflictRecords(choices, resolver);
  }
  TimerStat silent("", nullptr);
  const DiffPair diffs =
      CreateDiffPair({*triple.base, *triple.left}, {*triple.base, *triple.right}, false, silent);
  const std::unique_ptr<VexelObjects> merged = MergeIntoCopy(*triple.base, diffs, resolver, silent);
  std::ostringstream records, text;
  OutputConflictRecords(records, resolver, true);
  merged->Output(text);
  VexelObjects read;
  ParseYAMLString(text.str(), read);
  return {FromNode(triple.base.get()), FromNode(triple.left.get()), FromNode(triple.right.get()),
          FromNode(&read), records.str()};
}

// Puts base's value back at the first place that differs; false where none does.
bool UndoOne(const Value& base, Value& merged) {
  if (merged == base) return false;
  for (auto& [key, field] : merged.fields) {
    const auto in_base = base.fields.find(key);
    if (in_base == base.fields.end()) return merged.fields.erase(key) == 1;
    if (field != in_base->second) return UndoOne(in_base->second, field);
  }
  merged = base;
  return true;
}

// False where a spoiled result was not found out.
bool CheckSpoiled(const Merged& merge, uint32_t seed) {
  const auto is_found = [](const std::string& how, const Merged& spoiled) {
    ++totals["spoiled: " + how];
    return !Check(spoiled).findings.empty();
  };
  Merged invented = merge, undone = merge, silent = merge;
  invented.merged.fields["invented"] = merge.base;
  if (!is_found("an object that nobody added", invented)) return false;
  if (seed % 5 == 0) return true;
  if (merge.right == merge.base && UndoOne(merge.base, undone.merged) &&
      !is_found("an edit undone", undone)) {
    return false;
  }
  silent.records = "";
  // With a side as the default, all that was edited may be in the result.
  const bool has_records = seed / 2 % 3 == 0 && merge.records.find("Left  ") != std::string::npos;
  return !has_records || is_found("the records lost", silent);
}

bool CheckRandom(uint32_t seed, bool spoil) {
  const SceneTriple triple = MakeTriple(seed);
  Merged merge;
  try {
    merge = Merge(triple, seed);
  } catch (const std::length_error&) {
    return ++totals["refused"] > 0;
  }
  ++totals["merged"];
  totals["merged with conflicts"] += merge.records.find("Left  ") != std::string::npos ? 1 : 0;
  const Checker checker = Check(merge);
  for (const auto& [name, count] : checker.exceptions) totals["exception: " + name] += count;
  for (const std::string& finding : checker.findings) std::cout << "seed " << seed << ": " << finding << "\n";
  if (!checker.findings.empty()) return false;
  if (!spoil || CheckSpoiled(merge, seed)) return true;
  std::cout << "seed " << seed << ": what was spoiled was not found\n";
  return false;
}

bool CheckFiles(char** paths) {
  Value values[4];
  for (Value& value : values) {
    VexelObjects objects;
    ReadYAMLPath(*paths++, objects);
    value = FromNode(&objects);
  }
  std::ifstream records(*paths);
  const Checker checker =
      Check({values[0],
             values[1],
             values[2],
             values[3],
             {std::istreambuf_iterator<char>(records), std::istreambuf_iterator<char>()}});
  for (const std::string& finding : checker.findings) std::cout << finding << "\n";
  for (const auto& [name, count] : checker.exceptions) totals["exception: " + name] += count;
  return checker.findings.empty();
}

bool Run(int argc, char** argv) {
  if (argc == 6) return CheckFiles(argv + 1);
  if (argc < 4)
    throw std::runtime_error("usage: BASE LEFT RIGHT MERGED RECORDS, or --random FIRST COUNT [--spoil]");
  std::stringstream rules;
  rules << std::ifstream(VEXEL_RULES_FILE).rdbuf() << "[arrays]\nplain *.*.plain\n";
  YAMLSequenceRemapper::LoadSequenceUniqueKeys(rules);
  const auto first = static_cast<uint32_t>(std::atoi(argv[2]));
  const auto count = static_cast<uint32_t>(std::atoi(argv[3]));
  size_t bad = 0;
  for (uint32_t seed = first; seed < first + count; ++seed) bad += CheckRandom(seed, argc > 4) ? 0 : 1;
  // An exception that is never needed would only hide faults.
  const auto taken =
      std::ranges::count_if(totals, [](const auto& t) { return t.first.starts_with("exception: "); });
  if (count >= 10000 && taken < kExceptions) std::cout << "an exception was never needed\n";
  return bad == 0 && totals["merged"] > count / 4 * 3 && (count < 10000 || taken >= kExceptions);
}

}  // namespace

}  // namespace vexel_yaml::lost_edits

int main(int argc, char** argv) {
  vexel_yaml::initialize();
  const bool good = vexel_yaml::lost_edits::Run(argc, argv);
  for (const auto& [name, count] : vexel_yaml::lost_edits::totals) std::cout << name << ": " << count << "\n";
  return good ? 0 : 1;
}
