#include "yaml/write_objects.h"

#include <algorithm>
#include <span>
#include <sstream>
#include <string_view>
#include <vector>

#include "platform/thread.h"
#include "yaml/folded_object.h"

namespace vexel_yaml {

namespace {

using Slots = std::span<const YAMLMapping::Slot>;

// The texts made ahead of the writing stay small beside the objects.
constexpr size_t kReadObjectsAThread = 2048;

// Writes the texts of folded objects in pieces as large as they come: neighbours in the file they were read
// from lie side by side, so an untouched scene is one piece.
class ObjectWriter {
 public:
  explicit ObjectWriter(std::ostream& out) : out_(out) {}
  ObjectWriter(const ObjectWriter&) = delete;
  ObjectWriter& operator=(const ObjectWriter&) = delete;

  void Write(const YAMLMapping::Slot& slot) {
    const FoldedObject* folded = GetFolded(slot.value);
    if (folded == nullptr) {
      Flush();
      VexelObjects::OutputObject(out_, slot);
    } else if (gathered_.data() + gathered_.size() == folded->text.data()) {
      gathered_ = {gathered_.data(), gathered_.size() + folded->text.size()};
    } else {
      Flush();
      gathered_ = folded->text;
    }
  }

  void Flush() {
    out_ << gathered_;
    gathered_ = {};
  }

 private:
  std::ostream& out_;
  std::string_view gathered_;
};

void WriteAll(Slots slots, std::ostream& out) {
  ObjectWriter writer(out);
  for (const YAMLMapping::Slot& slot : slots) writer.Write(slot);
  writer.Flush();
}

// The next piece with not too many objects that must be turned into text, taken off the front of `slots`.
Slots TakePiece(Slots& slots) {
  size_t read = 0;
  size_t count = 0;
  for (; count < slots.size() && read < kReadObjectsAThread; ++count) {
    if (GetFolded(slots[count].value) == nullptr) ++read;
  }
  const Slots piece = slots.first(count);
  slots = slots.subspan(count);
  return piece;
}

}  // namespace

void WriteObjects(VexelObjects& objects, std::ostream& out, bool threads) {
  std::vector<YAMLMapping::Slot> slots;
  slots.reserve(objects.Size());
  for (const YAMLMapping::Slot& slot : objects) slots.push_back(slot);

  objects.OutputHeader(out);
  for (Slots rest = slots; !rest.empty();) {
    const Slots first = TakePiece(rest);
    const Slots second = threads ? TakePiece(rest) : Slots();
    std::ostringstream second_text;
    RunBoth(
        !second.empty(), [&] { WriteAll(second, second_text); }, [&] { WriteAll(first, out); });
    out << second_text.view();
  }
  out.flush();
}

}  // namespace vexel_yaml
