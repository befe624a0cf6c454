#include <algorithm>

#include "yaml/asset_text.h"
#include "yaml/document_cache.h"
#include "yaml/document_reader.h"
#include "yaml/read_yaml.h"
#include "yaml/written_object.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// Reads the documents of one file, in any order.
class FileReader {
 public:
  const AssetText& GetText() const { return text_; }

  explicit FileReader(std::string_view file, bool keeps_equal_pairs = false)
      : text_(file), documents_(text_.GetHeader(), file.data(), keeps_equal_pairs), objects_(Count()) {}

  bool ReadAll() {
    for (size_t i = 0; i < Count(); ++i) {
      if (!Read(i)) return false;
    }
    return true;
  }

  // Each reader starts at a place of its own, so that each looks at a part of what they have in common and
  // finds the rest known. `shared` may be null; it may hold this file's own documents.
  bool ReadAllSharing(size_t reader, ObjectFolder& folder, SharedDocuments* shared, bool is_first) {
    size_t expected = Count() * (reader % 3) / 3;
    for (size_t step = 0, i = expected; step < Count(); ++step, i = (i + 1) % Count()) {
      uint32_t found = SharedDocuments::kNone;
      if (is_first) {
        found = static_cast<uint32_t>(i);
      } else if (shared != nullptr) {
        found = shared->Find(text_.GetDocuments()[i], expected);
        expected = found == SharedDocuments::kNone ? expected : found + 1;
      }
      if (!ReadSharing(i, folder, found == SharedDocuments::kNone ? nullptr : shared, found)) return false;
    }
    return true;
  }

  void MoveInto(VexelObjects& objects) {
    objects.Reserve(Count());
    std::ranges::sort(remarks_, {}, &Remark::index);
    for (const auto& [file_id, object] : objects_) objects.Append(file_id, object);
    for (const Remark& remark : remarks_) {
      const YAMLScalar* file_id = objects_[remark.index].key;
      if (remark.holds_duplicate_keys) objects.AddObjectWithDuplicateKeys(file_id);
      for (const size_t line : remark.skipped_key_lines) objects.AddSkippedKey({file_id, line});
    }
    if (!text_.GetTagPrefix().empty()) objects.SetTagPrefix(std::string(text_.GetTagPrefix()));
    objects.RebuildHash(true);
  }

 private:
  // What is to be told of few objects.
  struct Remark {
    size_t index;
    bool holds_duplicate_keys;
    std::vector<size_t> skipped_key_lines;
  };

  size_t Count() const { return text_.GetDocuments().size(); }

  bool Read(size_t index) {
    bool is_shareable = false;
    return Read(index, is_shareable);
  }

  // Shareable is what a copy can stand for.
  bool Read(size_t index, bool& is_shareable) {
    ReadObject read;
    if (!documents_.Read(text_.GetDocuments()[index], index + 1 == Count(), read)) return false;
    objects_[index] = {read.file_id, read.object};
    const bool is_remarkable = read.holds_duplicate_keys || !read.skipped_key_lines.empty();
    if (is_remarkable) {
      remarks_.push_back({index, read.holds_duplicate_keys, std::move(read.skipped_key_lines)});
    }
    is_shareable = !is_remarkable && !read.counts_for_limits;
    return true;
  }

  // `shared` is null where the document isn't one of theirs.
  bool ReadSharing(size_t index, ObjectFolder& folder, SharedDocuments* shared, size_t shared_index) {
    using Known = SharedDocuments::Known;
    Known known = shared == nullptr ? Known() : shared->Get(shared_index);
    // At the end of a file libyaml refuses what it takes for the next document's directives elsewhere.
    const bool is_last = index + 1 == Count();
    if (known.object != nullptr && !is_last) {
      objects_[index] = {known.object->Get(YAMLScalar::fileIDPlaceHolderName)->AsScalar(),
                         known.object->Clone()};
      return true;
    }
    if (known.folded == nullptr) {
      // The shared text stays, this file's may go.
      known.folded =
          folder.Fold(shared == nullptr ? text_.GetDocuments()[index] : shared->GetText(shared_index));
      if (known.folded != nullptr && shared != nullptr) shared->Publish(shared_index, known);
    }
    if (known.folded != nullptr) {
      auto* object = YAMLAlloc<YAMLMapping>::create(false);
      object->SetLine(kLineOfWrittenObject);
      object->Fold(*known.folded);
      objects_[index] = {known.folded->file_id, object};
      return true;
    }
    bool is_shareable = false;
    if (!Read(index, is_shareable)) return false;
    known.object = objects_[index].value->AsMapping();
    if (is_shareable && !is_last && shared != nullptr) shared->Publish(shared_index, known);
    return true;
  }

  AssetText text_;
  DocumentReader documents_;
  std::vector<YAMLMapping::Slot> objects_;
  std::vector<Remark> remarks_;
};

}  // namespace

bool ParseYAMLString(std::string_view text, VexelObjects& objects) {
  FileReader file(text);
  if (!file.ReadAll()) return false;
  file.MoveInto(objects);
  return true;
}

bool ParseYAMLText(FileText text, VexelObjects& objects, DocumentCache& cache) {
  KeptTexts& texts = *cache.GetTexts();
  objects.KeepTexts(cache.GetTexts());
  objects.SetEndsInLineBreak(text.View().ends_with('\n'));
  const size_t reader = cache.Enter();
  const std::string_view view = text.View();
  FileReader file(view, cache.KeepsEqualPairs());
  bool is_first = false;
  SharedDocuments* shared = cache.Share(file.GetText().GetHeader(), file.GetText().GetDocuments(), is_first);
  // The others look at it while this one reads.
  if (is_first) texts.Keep(std::move(text));
  ObjectFolder& folder = texts.CreateFolder(file.GetText().GetHeader());
  try {
    if (!file.ReadAllSharing(reader, folder, shared, is_first)) return false;
  } catch (const YAMLError&) {
    // In its own order, so that of several errors the first is reported.
    FileReader(view).ReadAll();
    throw;
  }
  if (!is_first && !folder.CopyTextsFrom(view)) texts.Keep(std::move(text));
  file.MoveInto(objects);
  return true;
}

}  // namespace vexel_yaml
