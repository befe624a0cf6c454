#include "scene/scene_documents.h"

#include "platform/error_channel.h"
#include "scene/damaged_side.h"

namespace vexel_yaml {

std::unique_ptr<SceneDocuments> SceneDocuments::Copy() const {
  auto copy = std::make_unique<SceneDocuments>();
  CopyTo(*copy);
  return copy;
}

void SceneDocuments::CopyTo(SceneDocuments& target) const {
  base.CopyTo(target.base);
  left.CopyTo(target.left);
  right.CopyTo(target.right);
  target.renumbered = renumbered;
  target.repeated_keys = repeated_keys;
}

void ReadScenes(const std::string& base_path, const std::string& left_path, const std::string& right_path,
                SceneDocuments& documents, bool threads, TimerStat& timer) {
  const std::vector<FileToRead> files = {{"Read base", base_path, documents.base},
                                         {"Read left", left_path, documents.left},
                                         {"Read right", right_path, documents.right}};
  ReadFiles(files, threads, timer, Losses::kRefused);
  TimerStat step(timer, "Creating mappings");
  TimerStat preprocessing(step, "Preprocess mappings");
  documents.repeated_keys.MakeUnique(files);
  // A stripped object stands for one of a prefab; merged with a whole one it would be neither.
  documents.renumbered =
      PrepareForDiff(documents.base, documents.left, documents.right, SameObject::kSameClassAndMark);
  documents.repeated_keys.Renumber(documents.renumbered);
  for (const std::string& line : DescribeDamage(files)) WriteErrorLine(line);
}

}  // namespace vexel_yaml
