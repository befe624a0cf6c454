#include "yaml/write_objects.h"

#include <algorithm>
#include <span>
#include <sstream>
#include <vector>

#include "platform/thread.h"

namespace vexel_yaml {

namespace {

// The texts made ahead of the writing stay small beside the objects.
constexpr size_t kObjectsAThread = 4096;

// The next piece of at most kObjectsAThread slots, taken off the front of `slots`.
std::span<const YAMLMapping::Slot> TakePiece(std::span<const YAMLMapping::Slot>& slots) {
  const size_t count = std::min(kObjectsAThread, slots.size());
  const auto piece = slots.first(count);
  slots = slots.subspan(count);
  return piece;
}

}  // namespace

void WriteObjects(VexelObjects& objects, std::ostream& out, bool threads) {
  if (!threads) {
    objects.Output(out);
    return;
  }
  std::vector<YAMLMapping::Slot> slots;
  slots.reserve(objects.Size());
  for (const YAMLMapping::Slot& slot : objects) slots.push_back(slot);

  objects.OutputHeader(out);
  for (std::span<const YAMLMapping::Slot> rest = slots; !rest.empty();) {
    const auto first = TakePiece(rest);
    const auto second = TakePiece(rest);
    std::ostringstream second_text;
    Thread thread;
    thread.Start([&] {
      for (const YAMLMapping::Slot& slot : second) VexelObjects::OutputObject(second_text, slot);
    });
    for (const YAMLMapping::Slot& slot : first) VexelObjects::OutputObject(out, slot);
    thread.Join();
    thread.CheckForExceptions();
    out << second_text.view();
  }
  out.flush();
}

}  // namespace vexel_yaml
