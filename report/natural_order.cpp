#include "report/natural_order.h"

#include <algorithm>

namespace vexel_yaml {

namespace {

// Takes the digits at the start of a text, of which leading zeros don't count.
std::string_view TakeNumber(std::string_view& text) {
  const size_t size = std::min(text.find_first_not_of("0123456789"), text.size());
  std::string_view number = text.substr(0, size);
  text.remove_prefix(size);
  number.remove_prefix(std::min(number.find_first_not_of('0'), number.size()));
  return number;
}

}  // namespace

bool ComesBefore(std::string_view a, std::string_view b) {
  const std::string_view whole_a = a;
  const std::string_view whole_b = b;
  const auto starts_with_digit = [](std::string_view text) {
    return text.front() >= '0' && text.front() <= '9';
  };
  while (!a.empty() && !b.empty()) {
    if (!starts_with_digit(a) || !starts_with_digit(b)) {
      if (a.front() != b.front()) return a < b;
      a.remove_prefix(1);
      b.remove_prefix(1);
      continue;
    }
    const std::string_view number_a = TakeNumber(a);
    const std::string_view number_b = TakeNumber(b);
    if (number_a.size() != number_b.size()) return number_a.size() < number_b.size();
    if (number_a != number_b) return number_a < number_b;
  }
  return a.empty() && b.empty() ? whole_a < whole_b : a.empty();
}

}  // namespace vexel_yaml
