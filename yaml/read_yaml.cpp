#include "yaml/read_yaml.h"

#include <filesystem>
#include <iterator>
#include <system_error>
#include <utility>

#include "platform/error_channel.h"
#include "platform/files.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// "%YAML" must begin within the first bytes; a byte-order mark may stand before it.
void CheckHeader(const std::string& text) {
  if (text.substr(0, 9).find("%YAML") != std::string::npos) return;
  throw YAMLError(
      "File is not a valid text serialized YAML file. Make sure that Asset Serialization is set to 'Force "
      "text' in Editor Settings.");
}

std::string ReadWhole(std::ifstream& stream) {
  stream.seekg(0, std::ios::end);
  const std::streamoff size = stream.tellg();
  if (size < 0) {
    // A pipe has no size.
    stream.clear();
    return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
  }
  stream.seekg(0);
  std::string text(static_cast<size_t>(size), '\0');
  stream.read(text.data(), size);
  return text;
}

}  // namespace

bool ParseYAMLFile(std::ifstream& stream, VexelObjects& objects, DocumentCache* cache) {
  std::string text = ReadWhole(stream);
  if (stream.fail()) return false;
  CheckHeader(text);
  return ParseYAMLString(std::move(text), objects, cache);
}

bool ParseYAMLFile(const std::string& path, VexelObjects& objects, DocumentCache* cache) {
  std::error_code error;
  std::ifstream stream(path, std::ios::binary);
  if (!stream || std::filesystem::is_directory(path, error)) throw YAMLError("Cannot open file");
  return ParseYAMLFile(stream, objects, cache);
}

void ReadYAMLPath(const std::string& path, VexelObjects& objects, DocumentCache* cache) {
  const std::string prefix = "Error parsing file '" + path + "'";
  try {
    if (!ParseYAMLFile(VexelToNativePath(path), objects, cache)) throw YAMLError("Cannot read file");
  } catch (const YAMLError& error) {
    throw YAMLError(prefix + ": " + error.what(), error.GetHint());
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

}  // namespace vexel_yaml
