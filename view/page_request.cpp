#include "view/page_request.h"

#include <nlohmann/json.hpp>
#include <optional>

namespace vexel_yaml {

namespace {

using Json = nlohmann::ordered_json;

std::string TextAt(const Json& json, const char* key) {
  const auto found = json.find(key);
  if (found == json.end() || !found->is_string()) throw RequestError(400, std::string(key) + " is missing");
  return found->get<std::string>();
}

Choices::Change ChangeIn(const Json& json) {
  if (!json.is_object()) throw RequestError(400, "A choice is no JSON object");
  const std::string path = TextAt(json, "path");
  const auto choice = json.find("choice");
  if (choice != json.end() && choice->is_null()) return {path, std::nullopt};
  const std::string word = TextAt(json, "choice");
  if (word == "theirs") return {path, MergeResolve::kLeft};
  if (word == "ours") return {path, MergeResolve::kRight};
  if (word == "base") return {path, MergeResolve::kBase};
  throw RequestError(400, "A choice is theirs, ours, base or null");
}

}  // namespace

Json ParseRequest(std::string_view body) {
  Json json = Json::parse(body, nullptr, false);
  if (!json.is_object()) throw RequestError(400, "The request is no JSON object");
  return json;
}

size_t NumberAt(const Json& json, const char* key) {
  const auto found = json.find(key);
  if (found == json.end() || !found->is_number_unsigned())
    throw RequestError(400, std::string(key) + " is no number");
  return found->get<size_t>();
}

std::vector<Choices::Change> ChangesIn(const Json& json) {
  const auto choices = json.find("choices");
  if (choices == json.end() || !choices->is_array()) throw RequestError(400, "choices is no list");
  std::vector<Choices::Change> changes;
  for (const Json& choice : *choices) changes.push_back(ChangeIn(choice));
  return changes;
}

}  // namespace vexel_yaml
