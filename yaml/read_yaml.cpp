#include "yaml/read_yaml.h"

#include <cerrno>
#include <new>
#include <optional>
#include <system_error>
#include <utility>

#include "platform/error_channel.h"
#include "platform/file_error.h"
#include "platform/files.h"
#include "platform/read_whole_file.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// "%YAML" must begin within the first bytes; a byte-order mark may stand before it.
void CheckHeader(std::string_view text) {
  if (text.substr(0, 9).find("%YAML") != std::string_view::npos) return;
  throw YAMLError(
      "File is not a valid text serialized YAML file. Make sure that Asset Serialization is set to 'Force "
      "text' in Editor Settings.");
}

}  // namespace

bool ParseYAMLFile(const std::string& path, VexelObjects& objects, DocumentCache* cache) {
  std::optional<FileText> text = ReadFileText(path);
  if (!text) throw YAMLError("Cannot open file", std::generic_category().message(errno));
  CheckHeader(text->View());
  if (cache == nullptr) return ParseYAMLString(text->View(), objects);
  return ParseYAMLText(std::move(*text), objects, *cache);
}

void ReadYAMLPath(const std::string& path, VexelObjects& objects, DocumentCache* cache) {
  const std::string prefix = "Error parsing file '" + path + "'";
  try {
    if (!ParseYAMLFile(VexelToNativePath(path), objects, cache)) throw YAMLError("Cannot read file");
  } catch (const YAMLError& error) {
    throw YAMLError(prefix + ": " + error.what(), error.GetHint());
  } catch (const FileError& error) {
    throw YAMLError(prefix + ": Cannot read file", error.what());
  } catch (const std::bad_alloc&) {
    // No matter of this file.
    throw;
  } catch (const std::exception& error) {
    throw YAMLError(prefix + " caught unknown exception: " + error.what());
  }
}

void ReportSkippedKeys(const std::string& path, const VexelObjects& objects) {
  for (const VexelObjects::SkippedKey& key : objects.GetSkippedKeys()) {
    WriteErrorLine("Skipping a key that is not a scalar in file '" + path + "', object " +
                   key.file_id->GetText() + ", line " + std::to_string(key.line));
  }
}

void RefuseSkippedKeys(const std::string& path, const VexelObjects& objects) {
  if (objects.GetSkippedKeys().empty()) return;
  const VexelObjects::SkippedKey& key = objects.GetSkippedKeys().front();
  throw YAMLError("A key is not a scalar: file '" + path + "', object " + key.file_id->GetText(),
                  "see line " + std::to_string(key.line));
}

}  // namespace vexel_yaml
