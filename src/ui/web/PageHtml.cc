#include "ui/web/PageHtml.h"

namespace ui::web {

namespace {

constexpr std::string_view kHead =
    "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
    "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1, "
    "viewport-fit=cover\">\n"
    "<meta name=\"color-scheme\" content=\"light dark\">\n"
    "<link rel=\"icon\" href=\"/assets/icon.svg\" type=\"image/svg+xml\">\n"
    "<link rel=\"stylesheet\" href=\"/assets/norvo.css\">\n";

void appendEscaped(std::string& out, std::string_view text) {
  for (const char c : text) {
    switch (c) {
      case '&':
        out += "&amp;";
        break;
      case '<':
        out += "&lt;";
        break;
      case '>':
        out += "&gt;";
        break;
      case '"':
        out += "&quot;";
        break;
      case '\'':
        out += "&#39;";
        break;
      default:
        out += c;
    }
  }
}

// Opens the document and its top bar; the caller closes the bar.
void openDocument(std::string& out, std::string_view title) {
  out += kHead;
  out += "<title>";
  appendEscaped(out, title);
  out += "</title>\n";
}

void appendSpan(std::string& out, std::string_view kind, const std::optional<std::string>& text) {
  out += "<span class=\"";
  out += kind;
  out += "\">";
  if (text) appendEscaped(out, *text);
  out += "</span>";
}

void appendRow(std::string& out, const RowView& row) {
  out += "<li class=\"row\">";
  if (row.href) {
    out += "<a href=\"";
    appendEscaped(out, *row.href);
    out += "\">";
  }
  appendSpan(out, "text", row.text);
  if (row.detail) appendSpan(out, "detail", row.detail);
  if (row.href) out += "</a>";
  out += "</li>\n";
}

}  // namespace

std::string escapeHtml(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  appendEscaped(out, text);
  return out;
}

std::string renderHtml(const PageView& page) {
  std::string out;
  out.reserve(4096);
  openDocument(out, page.title);
  // The chrome beside the table: links to the other views, alerts and a replay's player bar.
  out +=
      "<link rel=\"stylesheet\" href=\"/assets/chrome.css\">\n"
      "<script src=\"/assets/poll.js\" defer></script>\n"
      "<script src=\"/assets/norvo.js\" defer></script>\n"
      "<script src=\"/assets/chrome.js\" defer></script>\n</head>\n<body>\n<header class=\"bar\">";
  if (page.back) {
    out += "<a class=\"back\" href=\"";
    appendEscaped(out, page.back->href);
    out += "\" rel=\"up\">";
    appendEscaped(out, page.back->title);
    out += "</a>";
  }
  out += "<h1>";
  appendEscaped(out, page.title);
  out += "</h1>";
  if (!page.barLinks.empty()) {
    out += "<nav class=\"links\">";
    for (const BarLink& link : page.barLinks) {
      out += "<a href=\"";
      appendEscaped(out, link.href);
      out += "\">";
      appendEscaped(out, link.title);
      out += "</a>";
    }
    out += "</nav>";
  }
  out += "</header>\n<main id=\"table\" data-source=\"/api/screens";
  if (page.address != "/") appendEscaped(out, page.address);
  out += "\">\n";
  for (const SectionView& section : page.sections) {
    out += "<section class=\"group\">";
    if (section.header) {
      out += "<h2>";
      appendEscaped(out, *section.header);
      out += "</h2>";
    }
    out += "<ul>\n";
    for (const RowView& row : section.rows)
      appendRow(out, row);
    out += "</ul></section>\n";
  }
  out += "</main>\n</body>\n</html>\n";
  return out;
}

std::string renderMessagePage(std::string_view homeTitle, std::string_view title,
                              std::string_view message) {
  std::string out;
  openDocument(out, title);
  out += "</head>\n<body>\n<header class=\"bar\"><a class=\"back\" href=\"/\">";
  appendEscaped(out, homeTitle);
  out += "</a><h1>";
  appendEscaped(out, title);
  out += "</h1></header>\n<main class=\"message\"><p>";
  appendEscaped(out, message);
  out += "</p></main>\n</body>\n</html>\n";
  return out;
}

}  // namespace ui::web
