#pragma once

#include <nlohmann/json_fwd.hpp>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "view/choices.h"

namespace vexel_yaml {

/// A request that can't be carried out, with the status that HTTP has for it and a text for people.
class RequestError : public std::runtime_error {
 public:
  RequestError(int status, const std::string& message) : std::runtime_error(message), status_(status) {}
  int GetStatus() const { return status_; }

 private:
  int status_;
};

/// What a request's body says; all of these throw RequestError for one that makes no sense.
nlohmann::ordered_json ParseRequest(std::string_view body);
size_t NumberAt(const nlohmann::ordered_json& json, const char* key);
std::vector<Choices::Change> ChangesIn(const nlohmann::ordered_json& json);

/// Runs a step that says why it can't be done with a std::runtime_error, and throws that as a refusal.
template <typename Step>
void OrRefuse(Step step) {
  try {
    step();
  } catch (const std::runtime_error& error) {
    throw RequestError(409, error.what());
  }
}

}  // namespace vexel_yaml
