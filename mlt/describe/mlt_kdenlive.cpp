// MLT's metadata and Kdenlive's composition description.
#include <sstream>

#include "descriptions.h"

namespace veltrane_describe {

const char* const kTitle = "Veltrane Split Screen";
const char* const kDescription =
    "Divides the frame into regions with up to eight straight cuts and fills each region with "
    "a track's picture, a time-shifted copy of it or another track's.";

namespace {

using Kind = Setting::Kind;

std::string quoted(const std::string& text) {
  std::string out = "\"";
  for (char c : text) out += c == '"' ? std::string("\\\"") : std::string(1, c);
  return out + "\"";
}

std::string yamlParameter(const Setting& setting) {
  std::ostringstream out;
  out << "  - identifier: " << setting.property << "\n    title: " << quoted(setting.label())
      << "\n";
  switch (setting.kind) {
    case Kind::Number:
    case Kind::WholeNumber:
      out << "    type: " << (setting.kind == Kind::WholeNumber ? "integer" : "float")
          << "\n    minimum: " << number(setting.minimum)
          << "\n    maximum: " << number(setting.maximum) << "\n    widget: spinner\n";
      break;
    case Kind::Angle:
      out << "    type: float\n    widget: knob\n";
      break;
    case Kind::Point:
      out << "    type: rect\n";
      break;
    case Kind::Color:
      out << "    type: color\n    widget: color\n";
      break;
    case Kind::Bool:
      out << "    type: boolean\n    widget: checkbox\n";
      break;
    case Kind::List:
      out << "    type: string\n    widget: combo\n    values:\n";
      for (const auto& [value, shown] : setting.choices) out << "      - " << quoted(value) << "\n";
      break;
  }
  if (!setting.unit.empty()) out << "    unit: " << quoted(setting.unit) << "\n";
  if (setting.animated) out << "    animation: yes\n";
  if (!setting.description.empty())
    out << "    description: " << quoted(setting.description) << "\n";
  out << "    default: " << quoted(setting.fallback) << "\n    mutable: yes\n";
  return out.str();
}

// Kdenlive's list splits the shown names at commas.
std::string withoutCommas(const std::string& text) {
  std::string out;
  for (char c : text)
    if (c != ',') out += c;
  return out;
}

// A point as Kdenlive's rectangle: the whole frame, moved so that its centre is the point
// (pixels from the top-left corner, y down), which its monitor drags.
std::string rectangleDefault(const std::string& point) {
  std::istringstream in(point);
  double x = 0, y = 0;
  in >> x >> y;
  return number(x) + " " + number(-y) + " %width %height 1";
}

std::string kdenliveParameter(const Setting& setting) {
  std::ostringstream out;
  const std::string start = "  <parameter name=\"" + setting.property + "\" default=\"";
  const std::string fallback = xmlEscaped(setting.editorDefault);
  switch (setting.kind) {
    case Kind::Number:
    case Kind::WholeNumber:
    case Kind::Angle:
      out << start << fallback << "\" type=\"animated\" min=\"" << number(setting.minimum)
          << "\" max=\"" << number(setting.maximum) << "\" decimals=\"" << setting.decimals << "\""
          << (setting.unit.empty() ? "" : " suffix=\"" + xmlEscaped(" " + setting.unit) + "\"")
          << ">\n";
      break;
    case Kind::Point:
      out << start << rectangleDefault(setting.editorDefault)
          << "\" type=\"animatedrect\" opacity=\"false\">\n";
      break;
    case Kind::Color:
      out << start << fallback << "\" type=\"color\">\n";
      break;
    case Kind::Bool:
      out << start << fallback << "\" type=\"bool\">\n";
      break;
    case Kind::List: {
      std::string values, shown;
      for (const auto& [value, name] : setting.choices) {
        values += (values.empty() ? "" : ";") + xmlEscaped(value);
        shown += (shown.empty() ? "" : ",") + xmlEscaped(withoutCommas(name));
      }
      out << start << fallback << "\" type=\"list\" paramlist=\"" << values
          << "\">\n    <paramlistdisplay>" << shown << "</paramlistdisplay>\n";
      break;
    }
  }
  out << "    <name>" << xmlEscaped(setting.label()) << "</name>\n";
  if (!setting.description.empty())
    out << "    <comment>" << xmlEscaped(setting.description) << "</comment>\n";
  out << "  </parameter>\n";
  return out.str();
}

}  // namespace

std::string xmlEscaped(const std::string& text) {
  std::string out;
  for (char c : text) {
    if (c == '&')
      out += "&amp;";
    else if (c == '<')
      out += "&lt;";
    else if (c == '>')
      out += "&gt;";
    else if (c == '"')
      out += "&quot;";
    else
      out += c;
  }
  return out;
}

std::string mltMetadata(const std::vector<Setting>& settings, bool transition) {
  std::ostringstream out;
  out << "schema_version: 7.0\ntype: " << (transition ? "transition" : "filter")
      << "\nidentifier: veltrane\ntitle: " << kTitle << "\nversion: 1\nlanguage: en\n"
      << "tags:\n  - Video\ndescription: " << quoted(kDescription) << "\nnotes: "
      << quoted(transition ? "The upper track is the effect's own source; a picture's track "
                             "can be lower (the track below), track:K (the tractor's track K, "
                             "0 at the bottom) or track:NAME (an editor's name for it)."
                           : "The clip's own picture is the effect's source; on a tractor a "
                             "picture's track can be track:K or track:NAME.")
      << "\nparameters:\n"
      << "  - identifier: plugin\n    title: \"Plug-in module\"\n    type: string\n"
      << "    description: The module's file; empty for $VELTRANE_PLUGIN or the installed one\n"
      << "    argument: yes\n";
  for (const Setting& setting : settings) out << yamlParameter(setting);
  return out.str();
}

std::string kdenliveComposition(const std::vector<Setting>& settings) {
  std::ostringstream out;
  out << "<!DOCTYPE kpartgui>\n<transition tag=\"veltrane\" id=\"veltrane\">\n  <name>" << kTitle
      << "</name>\n  <description>" << kDescription
      << "</description>\n  <author>Tavrix</author>\n";
  for (const Setting& setting : settings) out << kdenliveParameter(setting);
  out << "</transition>\n";
  return out.str();
}

}  // namespace veltrane_describe
