#include "git/web/page_options.h"

#include <charconv>
#include <new>

#include "git/asset_merge.h"
#include "git/shown_text.h"
#include "report/merged_files.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

// What the merge throws, as an error of the command.
template <typename Action>
auto AsCommandErrors(Action action) {
  try {
    return action();
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const CommandError&) {
    throw;
  } catch (const YAMLError& error) {
    throw CommandError(OnOneLine(Explained(error)));
  } catch (const std::exception& error) {
    throw CommandError(OnOneLine(Explained(error)));
  }
}

}  // namespace

ViewServerOptions PageOptions(const std::string& port, bool opens_browser) {
  ViewServerOptions options;
  options.opens_browser = opens_browser;
  if (port.empty()) return options;
  const char* const end = port.data() + port.size();
  const auto [rest, error] = std::from_chars(port.data(), end, options.port);
  if (error != std::errc() || rest != end || options.port < 1 || options.port > 65535)
    throw WrongUsage("--port takes a number from 1 to 65535");
  return options;
}

void LoadForPage(const MergeSettings& settings) {
  AsCommandErrors([&] { LoadRulesAndTypes(settings); });
}

int ShowPage(std::vector<ViewFile> files, const ViewServerOptions& options, ViewGuide guide) {
  return AsCommandErrors([&] { return RunViewServer(std::move(files), options, std::move(guide)); });
}

}  // namespace vexel_yaml
