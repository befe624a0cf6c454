#include <sstream>
#include <stdexcept>

#include "fuzz/support.h"
#include "merge/conflict_record_file.h"
#include "platform/thread.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

namespace {

enum class Way : uint8_t { kRead, kFolded, kFoldedOnThreads };

void ReadVersions(const std::vector<std::string>& texts, Way way, VexelObjects* versions) {
  DocumentCache cache;
  std::vector<Thread> readers(texts.size());
  for (size_t i = 0; i < texts.size(); ++i) {
    const auto read = [&, i] { ParseYAMLText(FileText(texts[i]), versions[i], cache); };
    if (way == Way::kRead) {
      ParseYAMLString(texts[i], versions[i]);
    } else if (way == Way::kFolded) {
      read();
    } else {
      readers[i].Start(read);
    }
  }
  if (way != Way::kFoldedOnThreads) return;
  for (Thread& reader : readers) reader.Join();
  for (Thread& reader : readers) reader.CheckForExceptions();
}

// All that a user would get to see of a merge: the file and the records, or the error.
std::string Merge(const std::vector<std::string>& texts, Way way) try {
  VexelObjects versions[3];
  ReadVersions(texts, way, versions);
  RecordingConflictResolver resolver(MergeResolve::kBase);
  const auto merged =
      fuzz::Merge(versions[0], versions[1], versions[2], resolver, way == Way::kFoldedOnThreads);
  std::ostringstream records;
  OutputConflictRecords(records, resolver, true);
  return fuzz::Written(*merged) + records.str();
} catch (const YAMLError& error) {
  return std::string(error.what()) + error.GetHint();
} catch (const std::runtime_error& error) {
  return error.what();
} catch (const std::logic_error& error) {
  return error.what();
}

}  // namespace

// A merge gives the same whether what stands in all versions is taken apart or not, on one thread or on
// several.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  std::vector<std::string> texts = fuzz::SplitTexts(data, size, 3);
  for (std::string& text : texts) text = fuzz::WithDirectives(text);
  const std::string expected = Merge(texts, Way::kRead);
  fuzz::Require(Merge(texts, Way::kFolded) == expected, "folded objects are merged like others");
  fuzz::Require(Merge(texts, Way::kFoldedOnThreads) == expected, "threads merge like one");
  return 0;
}
