#include "git/web/web_command.h"

#include "git/shown_text.h"
#include "git/web/review.h"
#include "git/web/settle_on_page.h"

namespace vexel_yaml {

int RunOnPage(const std::vector<std::string>& arguments) {
  const std::string command = arguments.empty() ? std::string() : arguments.front();
  const std::vector<std::string> rest(arguments.begin() + (arguments.empty() ? 0 : 1), arguments.end());
  if (command == "resolve") return ResolveOnPage(rest);
  if (command == "mergetool") return MergetoolOnPage(rest);
  if (command == "review") return ReviewOnPage(rest);
  throw WrongUsage("--git is for vexel-merge-git alone");
}

}  // namespace vexel_yaml
