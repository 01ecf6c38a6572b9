// Writes the machine as one page that needs no other file: what it is, its alerts, its drawing, all properties.
#include <ostream>
#include <sstream>

#include "values.h"
#include "writing.h"

namespace inventory {

namespace {

constexpr const char* style = R"css(
:root { color-scheme: light dark; --paper: #fff; --ink: #1b1e23; --dim: #5c6470; --line: #d9dde3; --field: #f4f6f8;
  --link: #0b57a8; --information: #1f6f3a; --warning: #8a5a00; --major: #b3261e; --critical: #b3261e }
@media (prefers-color-scheme: dark) {
  :root { --paper: #16181c; --ink: #e8eaed; --dim: #a0a8b3; --line: #353a42; --field: #20242a; --link: #8ab8f0;
    --information: #7fd39a; --warning: #f0c060; --major: #ff9a92; --critical: #ff9a92 } }
* { box-sizing: border-box }
[hidden] { display: none !important }
body { margin: 0 auto; padding: 1rem; max-width: 80rem; background: var(--paper); color: var(--ink);
  font: 15px/1.45 system-ui, sans-serif; overflow-wrap: anywhere }
h1 { font-size: 1.5rem; margin: 0 0 1rem }
h2 { font-size: 1.15rem; margin: 2rem 0 .5rem }
dl { display: grid; grid-template-columns: max-content minmax(0, 1fr); gap: .25rem 1.25rem; margin: 0 }
dt { color: var(--dim) }
dd { margin: 0 }
a { color: var(--link) }
table { width: 100%; border-collapse: collapse; table-layout: fixed }
th, td { text-align: left; vertical-align: top; padding: .25rem .5rem; border-bottom: 1px solid var(--line) }
th { color: var(--dim); font-weight: normal }
.alerts th:first-child { width: 7rem }
.nodes th:first-child { width: 36% }
.nodes th:nth-child(2) { width: 24% }
.nodes td:first-child { color: var(--dim) }
.nodes .node td { border-top: 2px solid var(--line); color: inherit; font-weight: 600 }
small { color: var(--dim) }
.information { color: var(--information) }
.warning { color: var(--warning) }
.major { color: var(--major) }
.critical { color: var(--critical); font-weight: bold }
figure { margin: 0 }
figure svg { display: block; width: 100%; cursor: zoom-in }
figure.large { overflow: auto }
figure.large svg { width: auto; cursor: zoom-out }
.search { position: sticky; top: 0; padding: .5rem 0; background: var(--paper) }
input { width: 100%; padding: .5rem .75rem; font: inherit; color: inherit; background: var(--field);
  border: 1px solid var(--line); border-radius: .4rem }
@media (max-width: 40rem) {
  dl { grid-template-columns: minmax(0, 1fr) }
  dd { margin-bottom: .5rem }
  thead { display: none }
  tr, td { display: block }
  td { border: 0; padding: .1rem 0 }
  tr { border-bottom: 1px solid var(--line); padding: .3rem 0 }
  .nodes .node td { border: 0 }
}
)css";

// The rows' texts are kept, because reading them from the page again for each letter would be slow.
constexpr const char* script = R"js(
'use strict';
const search = document.getElementById('search');
const rows = Array.from(document.querySelectorAll('.nodes tbody tr'));
const texts = rows.map(row => row.textContent.toLowerCase());
function filter() {
  const wanted = search.value.trim().toLowerCase();
  let count = 0;
  rows.forEach((row, i) => {
    row.hidden = !texts[i].includes(wanted);
    count += row.hidden ? 0 : 1;
  });
  document.getElementById('count').textContent = count + ' of ' + rows.length;
}
search.addEventListener('input', filter);
for (const link of document.querySelectorAll('.alerts a'))
  link.addEventListener('click', () => { search.value = link.textContent; filter(); });
for (const figure of document.querySelectorAll('figure'))
  figure.addEventListener('click', () => {
    const svg = figure.querySelector('svg');
    svg.style.width = figure.classList.toggle('large') ? svg.viewBox.baseVal.width + 'px' : '';
  });
filter();
)js";

void writeRow(std::ostream& out, const char* kind, const std::string& path, const std::string& caption,
              const std::string& value, const std::string& exact = "")
{
    out << "<tr" << kind << "><td>" << escapedForXml(path) << "</td><td>" << escapedForXml(caption)
        << "</td><td>" << escapedForXml(value);
    if (!exact.empty())
        out << " <small>" << escapedForXml(exact) << "</small>";
    out << "</td></tr>\n";
}

void writeAlertsOf(std::ostream& out, const View& view)
{
    out << "<h2>Alerts</h2>\n";
    if (view.alerts().empty()) {
        out << "<p>None.</p>\n";
        return;
    }
    out << "<table class=\"alerts\">\n<thead><tr><th>Severity</th><th>Node</th><th>What is "
           "wrong</th></tr></thead>\n"
           "<tbody>\n";
    for (const View::AlertLine& alert : view.alerts())
        out << "<tr><td class=\"" << severityName(alert.severity) << "\">" << severityName(alert.severity)
            << "</td><td><a href=\"#nodes\">" << escapedForXml(alert.path) << "</a></td><td>"
            << escapedForXml(alert.message) << "</td></tr>\n";
    out << "</tbody>\n</table>\n";
}

void writeNodes(std::ostream& out, const View& view)
{
    out << "<h2 id=\"nodes\">Nodes and properties</h2>\n"
           "<p class=\"search\"><input id=\"search\" type=\"search\" autocomplete=\"off\" "
           "spellcheck=\"false\""
           " aria-label=\"Search\" placeholder=\"Search paths, properties and values\">\n"
           "<small id=\"count\"></small></p>\n"
           "<table "
           "class=\"nodes\">\n<thead><tr><th>Node</th><th>Property</th><th>Value</th></tr></"
           "thead>\n<tbody>\n";
    for (const Shown& shown : view.shown()) {
        writeRow(out, " class=\"node\"", shown.path, IC::pst[shown.node->getSensor()],
                 joined({joined(shown.kind), joined(shown.troubles)}, " -- "));
        for (const auto& [key, value] : shown.properties) {
            const KeyInfo* info = infoOf(key);
            const std::string words = valueInWords(key, shown.properties);
            const std::string exact = printable(exactText(value));
            const bool isNumber = value.getKind() == IC::PropertyValue::KIND_NUMBER
                || value.getKind() == IC::PropertyValue::KIND_ENUMVALUE;
            const std::string unit = info == nullptr ? "" : info->unit;
            writeRow(out, "", shown.path, info == nullptr ? "property " + std::to_string(key) : info->caption,
                     words,
                     words != exact && isNumber && key != KEY_READING ? joined({exact, unit}, " ") : "");
        }
    }
    out << "</tbody>\n</table>\n";
}

}  // namespace

void writeHtml(std::ostream& out, const View& view)
{
    const std::string title = escapedForXml(view.title());
    out << "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
           "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
           "<link rel=\"icon\" href=\"data:,\">\n<title>"
        << title << "</title>\n<style>" << style << "</style>\n</head>\n<body>\n<h1>" << title
        << "</h1>\n<dl>\n";
    for (const Entry& row : view.entries()) {
        out << "<dt>" << row.label << "</dt><dd>";
        for (const std::string& line : row.lines)
            out << (&line == &row.lines.front() ? "" : "<br>") << escapedForXml(line);
        out << "</dd>\n";
    }
    out << "</dl>\n";
    writeAlertsOf(out, view);
    out << "<h2>Drawing</h2>\n";
    std::ostringstream drawing;
    const int width = writeSvg(drawing, view);
    // Letters in the drawing are never larger than those around it.
    out << "<figure style=\"max-width: " << width * 5 / 4 << "px\">\n" << drawing.str() << "</figure>\n";
    writeNodes(out, view);
    out << "<script>" << script << "</script>\n</body>\n</html>\n";
}

}  // namespace inventory
