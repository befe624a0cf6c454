#include "report/named_note.h"

#include <algorithm>
#include <string_view>

#include "merge/conflict_record_file.h"
#include "report/typed_value.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

// The name of what a word stands for, the word itself where it stands for nothing else.
std::string Named(std::string_view word, ObjectNames& names) {
  const FieldPath path = StringToPath(std::string(word));
  const std::string name = path.empty() ? std::string() : names.Describe(path.front());
  if (name.empty()) return std::string(word);
  return path.size() < 3 ? name : name + " > " + FieldLabel(path);
}

}  // namespace

std::string NamedNote(const std::string& note, ObjectNames& names) {
  std::string named;
  for (std::string_view rest = note; !rest.empty();) {
    const std::string_view word = rest.substr(0, rest.find_first_of(" ,:"));
    const size_t length = std::min(std::max<size_t>(word.size(), 1), rest.size());
    named += word.empty() ? std::string(rest.substr(0, 1)) : Named(word, names);
    rest.remove_prefix(length);
  }
  return OnOneLine(named);
}

}  // namespace vexel_yaml
