#include "git/report_index.h"

#include <cctype>

#include "git/git_call.h"
#include "report/page_files.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

// What is no character isn't shown.
std::string InMarkup(const std::string& text) {
  std::string markup;
  for (const char c : OnOneLine(text)) {
    markup += c == '<' ? "&lt;" : c == '&' ? "&amp;" : c == '"' ? "&quot;" : std::string(1, c);
  }
  return markup;
}

// A path as a relative address, whatever bytes it has.
std::string LinkTo(const std::string& path) {
  constexpr char kDigits[] = "0123456789ABCDEF";
  std::string link = "./";
  for (const char c : path) {
    const auto byte = static_cast<unsigned char>(c);
    if (std::isalnum(byte) != 0 || c == '/' || c == '.' || c == '-' || c == '_') {
      link += c;
    } else {
      link += {'%', kDigits[byte >> 4U], kDigits[byte & 0xFU]};
    }
  }
  return link;
}

}  // namespace

std::string IndexPage(const std::vector<IndexedPage>& pages) {
  const std::string title = std::to_string(pages.size()) + " merged scenes";
  std::string text =
      "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
      "<meta http-equiv=\"Content-Security-Policy\" content=\"default-src 'none'; style-src '" +
      std::string(kPageStyleHash) +
      "'; base-uri 'none'; form-action 'none'\">\n"
      "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
      "<meta name=\"color-scheme\" content=\"light dark\">\n<title>" +
      title + "</title>\n<style>" + std::string(kPageStyle) + "</style>\n</head>\n<body>\n<header><h1>" +
      title +
      "</h1></header>\n<main>\n<table class=\"index\"><caption>Objects that were touched, and "
      "conflicts</caption>\n<thead><tr><th scope=\"col\">Scene</th>";
  for (const char* column : {"added", "changed", "removed", "conflicts"})
    text += std::string("<th scope=\"col\">") + column + "</th>";
  text += "</tr></thead>\n<tbody>\n";
  for (const IndexedPage& page : pages) {
    text +=
        "<tr><th scope=\"row\"><a href=\"" + LinkTo(page.path) + "\">" + InMarkup(page.asset) + "</a></th>";
    for (const std::string& count : Pieces(page.counts, '\t'))
      text += "<td class=\"number\">" + InMarkup(count) + "</td>";
    text += "</tr>\n";
  }
  return text + "</tbody></table>\n</main>\n</body>\n</html>\n";
}

}  // namespace vexel_yaml
