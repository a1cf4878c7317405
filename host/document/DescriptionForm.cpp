// SPDX-License-Identifier: Apache-2.0
#include "host/document/DescriptionForm.h"

#include <algorithm>
#include <map>
#include <vector>

namespace {

using Parameter = DescriptionDocument::Parameter;

constexpr const char* kStyle = R"css(
:root { color-scheme: light dark; font-family: system-ui, sans-serif; line-height: 1.45; }
body { max-width: 62rem; margin: 0 auto; padding: 1rem; }
h1 { font-size: 1.5rem; margin: 0; }
h2 { font-size: 1.15rem; margin: 2rem 0 .5rem; }
fieldset { border: 1px solid #8888; border-radius: .5rem; margin: 1rem 0; padding: .5rem 1rem; }
legend { font-weight: 600; padding: 0 .4rem; }
.field { display: grid; grid-template-columns: 14rem 14rem 1fr; gap: .2rem 1rem;
  align-items: center; padding: .35rem 0; }
.field p { margin: 0; font-size: .9rem; }
.key { display: block; font-family: ui-monospace, monospace; font-size: .85rem; opacity: .75; }
input, select, textarea { font: inherit; padding: .25rem .4rem; width: 100%;
  box-sizing: border-box; }
input[type=checkbox] { width: 1.2rem; height: 1.2rem; }
:user-invalid, .wrong { outline: 2px solid #c22; }
:focus-visible { outline: 3px solid #27c; outline-offset: 1px; }
.result { position: sticky; bottom: 0; background: Canvas; padding: .5rem 0; }
textarea { font-family: ui-monospace, monospace; }
table { border-collapse: collapse; width: 100%; font-size: .9rem; }
caption { text-align: left; font-weight: 600; padding: .3rem 0; }
th, td { text-align: left; padding: .2rem .6rem .2rem 0; border-bottom: 1px solid #8884; }
td:first-child, th:first-child { font-family: ui-monospace, monospace; }
@media (max-width: 45rem) { .field { grid-template-columns: 1fr; } }
)css";

// No character that XML would want escaped.
constexpr const char* kScript = R"js(
"use strict";
const form = document.querySelector("form");
const text = document.getElementById("configuration");
const state = document.getElementById("state");
function write() {
  const words = [];
  const wrong = [];
  for (const input of form.querySelectorAll("[data-default]")) {
    const value = input.type === "checkbox" ? String(input.checked) : input.value.trim();
    const isWrong = !input.checkValidity();
    input.classList.toggle("wrong", isWrong);
    input.setAttribute("aria-invalid", String(isWrong));
    if (isWrong) wrong.push(input.name);
    const isKept = input.dataset.mandatory === "true" ? true : value !== input.dataset.default;
    if (isKept) words.push(input.name + "=" + value);
  }
  text.value = words.join(" ");
  state.textContent = wrong.length === 0 ? "" : "Not right yet: " + wrong.join(", ");
}
form.addEventListener("input", write);
form.addEventListener("reset", () => setTimeout(write));
form.addEventListener("submit", (event) => event.preventDefault());
write();
)js";

std::string Escaped(const std::string& text) {
  static const std::map<char, std::string> kEntities = {
      {'&', "&amp;"}, {'<', "&lt;"}, {'>', "&gt;"}, {'"', "&quot;"}};
  std::string escaped;
  for (const char c : text) {
    const auto entity = kEntities.find(c);
    escaped += entity == kEntities.end() ? std::string(1, c) : entity->second;
  }
  return escaped;
}

std::string Attribute(const std::string& name, const std::string& value) {
  return " " + name + "=\"" + Escaped(value) + "\"";
}

// What every input has: its name, what it is called by, and what the script compares with.
std::string Common(const Parameter& parameter) {
  std::string text = Attribute("id", "key-" + parameter.key) + Attribute("name", parameter.key) +
                     Attribute("aria-describedby", "help-" + parameter.key) +
                     Attribute("data-default", parameter.defaultText);
  return text + (parameter.isMandatory ? Attribute("data-mandatory", "true") : "");
}

std::string Choice(const Parameter& parameter, const std::vector<std::string>& entries) {
  std::string text = "<select" + Common(parameter) + ">";
  for (const std::string& entry : entries) {
    text += "<option" + Attribute("value", entry) +
            (entry == parameter.defaultText ? " selected=\"selected\"" : "") + ">" +
            Escaped(entry) + "</option>";
  }
  return text + "</select>";
}

std::string Number(const Parameter& parameter) {
  std::string text = R"(<input type="number" step="1" required="required")" + Common(parameter);
  text += parameter.min ? Attribute("min", std::to_string(*parameter.min)) : "";
  text += parameter.max ? Attribute("max", std::to_string(*parameter.max)) : "";
  return text + Attribute("value", parameter.defaultText) + " />";
}

std::string Text(const Parameter& parameter, const ParameterNotes::Note& note) {
  return R"(<input type="text" autocomplete="off" spellcheck="false")" + Common(parameter) +
         (note.pattern.empty() ? "" : Attribute("pattern", note.pattern)) +
         Attribute("value", parameter.defaultText) + " />";
}

std::string Input(const Parameter& parameter, const DescriptionDocument& document,
                  const ParameterNotes::Note& note) {
  std::vector<std::string> entries = parameter.entries;
  if (parameter.type == "prop_modelRef") {
    for (const DescriptionDocument::Model& model : document.models) {
      entries.push_back(model.name);
    }
  }
  if (!entries.empty()) {
    if (!note.extraEntry.empty()) {
      entries.push_back(note.extraEntry);
    }
    return Choice(parameter, entries);
  }
  if (parameter.type == "prop_bool") {
    return "<input type=\"checkbox\"" + Common(parameter) +
           (parameter.defaultText == "true" ? " checked=\"checked\"" : "") + " />";
  }
  return parameter.type == "prop_integer" ? Number(parameter) : Text(parameter, note);
}

std::string Help(const Parameter& parameter, const ParameterNotes::Note& note) {
  std::string text = note.meaning;
  if (parameter.min && parameter.max) {
    text += (text.empty() ? "" : "; ") + std::to_string(*parameter.min) + " to " +
            std::to_string(*parameter.max);
  }
  text += note.also.empty() ? "" : "; the driver takes as well: " + note.also;
  text += (text.empty() ? "" : " ");
  return text + (parameter.defaultText.empty() ? "[none]" : "[" + parameter.defaultText + "]");
}

std::string Field(const Parameter& parameter, const DescriptionDocument& document,
                  const ParameterNotes::Note& note) {
  const std::string display = parameter.display == "none" ? parameter.key : parameter.display;
  return "<div class=\"field\"><label" + Attribute("for", "key-" + parameter.key) + ">" +
         Escaped(display) + "<span class=\"key\">" + Escaped(parameter.key) + "</span></label>" +
         Input(parameter, document, note) + "<p" + Attribute("id", "help-" + parameter.key) + ">" +
         Escaped(Help(parameter, note)) + "</p></div>\n";
}

// One field set a group, in the order in which the groups come.
std::string FieldSets(const DescriptionDocument& document, const ParameterNotes& notes) {
  std::vector<std::string> groups;
  for (const Parameter& parameter : document.parameters) {
    if (std::find(groups.begin(), groups.end(), parameter.group) == groups.end()) {
      groups.push_back(parameter.group);
    }
  }
  std::string text;
  for (const std::string& group : groups) {
    const std::string title = group == "none" ? "tokens and driver" : group;
    text += "<fieldset><legend>" + Escaped(title) + "</legend>\n";
    for (const Parameter& parameter : document.parameters) {
      text += parameter.group == group ? Field(parameter, document, notes.Of(parameter.key)) : "";
    }
    text += "</fieldset>\n";
  }
  return text;
}

// What the script writes as long as nothing is changed, for a browser that runs none.
std::string StartText(const DescriptionDocument& document) {
  std::string text;
  for (const Parameter& parameter : document.parameters) {
    if (parameter.isMandatory) {
      text += (text.empty() ? "" : " ") + parameter.key + "=" + parameter.defaultText;
    }
  }
  return text;
}

std::string Table(const std::string& caption, const std::vector<std::string>& head,
                  const std::vector<std::vector<std::string>>& rows) {
  std::string text = "<table><caption>" + Escaped(caption) + "</caption>\n<thead><tr>";
  for (const std::string& cell : head) {
    text += "<th scope=\"col\">" + Escaped(cell) + "</th>";
  }
  text += "</tr></thead>\n<tbody>\n";
  for (const std::vector<std::string>& row : rows) {
    text += "<tr>";
    for (std::size_t i = 0; i < row.size(); ++i) {
      text +=
          (i == 0 ? "<th scope=\"row\">" : "<td>") + Escaped(row[i]) + (i == 0 ? "</th>" : "</td>");
    }
    text += "</tr>\n";
  }
  return text + "</tbody></table>\n";
}

std::string MemoryTypes(const DescriptionDocument& document) {
  std::vector<std::vector<std::string>> rows;
  for (const DescriptionDocument::MemoryType& type : document.memoryTypes) {
    const std::string access = type.isReadOnly    ? "read"
                               : type.isWriteOnly ? "write"
                                                  : "read, write";
    rows.push_back({type.name, type.display, type.naturalType, access});
  }
  return Table("What tags can address", {"Memory type", "Meaning", "Type", "Access"}, rows);
}

std::string Settings(const ParameterNotes& notes) {
  std::vector<std::vector<std::string>> rows;
  for (const ParameterNotes::Setting& setting : notes.settings) {
    rows.push_back({setting.name, setting.key, setting.values, setting.tagUri});
  }
  return rows.empty() ? ""
                      : Table("What can change while the driver runs",
                              {"Setting", "Key", "Values", "Tag"}, rows);
}

}  // namespace

std::string DescribeAsForm(const DescriptionBlock& block, const DescriptionDocument& document,
                           const ParameterNotes& notes) {
  const std::string title =
      (block.fullName.empty() ? block.name : block.fullName) + " " + std::to_string(block.version);
  return "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\" />\n"
         "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\" />\n"
         "<meta http-equiv=\"Content-Security-Policy\" content=\"default-src 'none'; "
         "style-src 'unsafe-inline'; script-src 'unsafe-inline'\" />\n<title>" +
         Escaped(title) + "</title>\n<style>" + kStyle + "</style>\n</head>\n<body>\n<main>\n<h1>" +
         Escaped(title) + "</h1>\n<form>\n<h2>Configuration</h2>\n" + FieldSets(document, notes) +
         "<div class=\"result\"><label for=\"configuration\">Configuration text</label>\n"
         "<textarea id=\"configuration\" rows=\"3\" readonly=\"readonly\">" +
         Escaped(StartText(document)) +
         "</textarea>\n<p id=\"state\" role=\"status\"></p>\n"
         "<button type=\"reset\">Defaults</button></div>\n</form>\n<h2>Tags</h2>\n" +
         MemoryTypes(document) + "<h2>Settings</h2>\n" + Settings(notes) + "</main>\n<script>" +
         kScript + "</script>\n</body>\n</html>\n";
}
