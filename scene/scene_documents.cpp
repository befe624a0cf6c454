#include "scene/scene_documents.h"

namespace vexel_yaml {

std::unique_ptr<SceneDocuments> SceneDocuments::Copy() const {
  auto copy = std::make_unique<SceneDocuments>();
  base.CopyTo(copy->base);
  left.CopyTo(copy->left);
  right.CopyTo(copy->right);
  copy->renumbered = renumbered;
  return copy;
}

void ReadScenes(const std::string& base_path, const std::string& left_path, const std::string& right_path,
                SceneDocuments& documents, bool threads, TimerStat& timer) {
  ReadMergeDocuments(base_path, left_path, right_path, documents, threads, timer);
  TimerStat step(timer, "Creating mappings");
  TimerStat preprocessing(step, "Preprocess mappings");
  documents.renumbered = PrepareForDiff(documents.base, documents.left, documents.right);
}

}  // namespace vexel_yaml
