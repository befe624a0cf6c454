#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "yaml/vexel_objects.h"

/// What the fuzz targets share. A target ends the process where the program would be wrong, and returns where
/// the program may refuse its input.
namespace vexel_yaml::fuzz {

/// Readies the document model and loads the default rules, once a process. Messages meant for a person go
/// nowhere: a target is run thousands of times a second.
void SetUp();

/// What is tried as the same bytes in every target that reads several texts: they are separated by zero
/// bytes, a missing one is empty.
std::vector<std::string> SplitTexts(const uint8_t* data, size_t size, size_t count);

/// `documents` behind the two directives that every asset file begins with.
std::string WithDirectives(const std::string& documents);

/// The text of all objects as it would be written to a file.
std::string Written(VexelObjects& objects);

/// What a merge of base, left and right comes to, repairs included; compared on two threads if `threads`.
/// Throws YAMLError.
std::unique_ptr<VexelObjects> Merge(VexelObjects& base, VexelObjects& left, VexelObjects& right,
                                    RecordingConflictResolver& resolver, bool threads = false);

/// A scene of a few objects and two edits of it, among them lists, references and a conflict: what rules,
/// records and type information are tried on. Read once; whoever changes one works on a copy.
struct Example {
  VexelObjects base;
  VexelObjects left;
  VexelObjects right;
};
const Example& GetExample();

/// Ends the process with a message where `holds` is false.
void Require(bool holds, const char* what);

}  // namespace vexel_yaml::fuzz
