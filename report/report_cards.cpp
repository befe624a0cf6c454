#include "report/report_cards.h"

#include <algorithm>
#include <unordered_map>

#include "report/natural_order.h"

namespace vexel_yaml {

std::vector<ReportCard> MakeCards(std::vector<ReportObject> objects, ObjectNames& names) {
  std::vector<ReportCard> cards;
  std::unordered_map<const YAMLScalar*, size_t> places;
  for (ReportObject& object : objects) {
    const YAMLScalar* whole = names.GetWhole(object.file_id);
    const auto [place, is_new] = places.emplace(whole, cards.size());
    if (is_new) {
      cards.push_back({whole, names.GetOwnName(whole), names.GetPath(whole), names.GetClass(whole), {}});
    }
    cards[place->second].objects.push_back(std::move(object));
  }
  for (ReportCard& card : cards) {
    std::ranges::sort(card.objects, [&](const ReportObject& a, const ReportObject& b) {
      const bool is_part_a = a.file_id != card.file_id;
      const bool is_part_b = b.file_id != card.file_id;
      if (is_part_a != is_part_b) return is_part_b;
      if (a.class_name != b.class_name) return a.class_name < b.class_name;
      return ComesBefore(a.file_id->GetText(), b.file_id->GetText());
    });
  }
  return cards;
}

}  // namespace vexel_yaml
