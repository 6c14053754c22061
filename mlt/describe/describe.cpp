// Writes what MLT and the editors read to list the effect, from the panel the module itself
// declares, so that the descriptions cannot drift from the parameters:
//   describe MODULE.so FOLDER
// FOLDER receives transition_veltrane.yml and filter_veltrane.yml (MLT's metadata), veltrane.xml
// (Kdenlive's composition) and meta.qml (Shotcut's filter).
#include <cmath>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>

#include "refhost/engine.h"

namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamPanel;

constexpr char kTitle[] = "Veltrane Split Screen";
constexpr char kDescription[] =
    "Divides the frame into regions with up to eight straight cuts and fills each region with "
    "the picture, a time-shifted copy of it or another track.";

std::string number(double value) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.9g", value);
  return buffer;
}

// The name an editor shows: the parameter's own, after its innermost group's ("Cut 1: Position").
std::string label(const ParamPanel& panel, const Param& param) {
  std::vector<std::string> groups = panel.groupPath(param);
  return groups.empty() ? param.displayName : groups.back() + ": " + param.displayName;
}

// A choice with a single entry offers nothing to pick; editors leave it out.
bool editable(const Param& param) {
  return param.kind != ParamKind::Choice || param.choices.size() > 1;
}

std::string colourText(const refhost::ParamValue& value) {
  char buffer[16];
  auto channel = [](float c) {
    return static_cast<int>(std::lround(std::fmin(std::fmax(c, 0), 1) * 255));
  };
  std::snprintf(buffer, sizeof buffer, "#%02x%02x%02x", channel(value.number[0]),
                channel(value.number[1]), channel(value.number[2]));
  return buffer;
}

// The default as the MLT property's text.
std::string defaultText(const Param& param) {
  const refhost::ParamValue& value = param.defaultValue;
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Angle:
      return number(value.number[0]);
    case ParamKind::Int:
    case ParamKind::Bool:
      return std::to_string(value.integer);
    case ParamKind::Choice:
      return param.choices.at(static_cast<std::size_t>(value.integer));
    case ParamKind::Point:
      return number(value.number[0]) + " " + number(value.number[1]);
    case ParamKind::Color:
      return colourText(value);
    case ParamKind::Layer:
      return "own";
  }
  return "";
}

std::string quoted(const std::string& text) {
  std::string out = "\"";
  for (char c : text) out += c == '"' ? std::string("\\\"") : std::string(1, c);
  return out + "\"";
}

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

std::string yamlParameter(const ParamPanel& panel, const Param& param) {
  std::ostringstream out;
  out << "  - identifier: " << param.id << "\n    title: " << quoted(label(panel, param)) << "\n";
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Int:
      out << "    type: " << (param.kind == ParamKind::Int ? "integer" : "float")
          << "\n    minimum: " << number(param.minimum)
          << "\n    maximum: " << number(param.maximum)
          << "\n    animation: yes\n    widget: spinner\n";
      if (!param.unit.empty()) out << "    unit: " << quoted(param.unit) << "\n";
      break;
    case ParamKind::Angle:
      out << "    type: float\n    unit: degrees\n    animation: yes\n    widget: knob\n";
      break;
    case ParamKind::Point:
      out << "    type: rect\n    description: x and y in pixels from the frame's centre, y up\n"
             "    animation: yes\n";
      break;
    case ParamKind::Color:
      out << "    type: color\n    animation: yes\n    widget: color\n";
      break;
    case ParamKind::Bool:
      out << "    type: boolean\n    widget: checkbox\n";
      break;
    case ParamKind::Choice:
    case ParamKind::Layer:
      out << "    type: string\n    widget: combo\n    values:\n";
      if (param.kind == ParamKind::Layer) {
        out << "      - own\n      - lower\n";
      } else {
        for (const std::string& choice : param.choices) out << "      - " << quoted(choice) << "\n";
      }
      break;
  }
  out << "    default: " << quoted(defaultText(param)) << "\n    mutable: yes\n";
  return out.str();
}

std::string yaml(const ParamPanel& panel, bool transition) {
  std::ostringstream out;
  out << "schema_version: 7.0\ntype: " << (transition ? "transition" : "filter")
      << "\nidentifier: veltrane\ntitle: " << kTitle << "\nversion: 1\nlanguage: en\n"
      << "tags:\n  - Video\ndescription: " << quoted(kDescription) << "\nnotes: "
      << quoted(transition ? "The upper track is the effect's own source; an input's layer "
                             "lower shows the lower track."
                           : "The track's own picture is the effect's source; inputs show it "
                             "or, shifted, the same track at other frames.")
      << "\nparameters:\n"
      << "  - identifier: plugin\n    title: \"Plug-in module\"\n    type: string\n"
      << "    description: The module's file; empty for $VELTRANE_PLUGIN or the installed one\n"
      << "    argument: yes\n";
  for (const Param& param : panel.params()) out << yamlParameter(panel, param);
  return out.str();
}

std::string kdenliveParameter(const ParamPanel& panel, const Param& param) {
  std::ostringstream out;
  const std::string name = xmlEscaped(label(panel, param));
  const std::string id = param.id;
  const std::string fallback = xmlEscaped(defaultText(param));
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Int:
      out << "  <parameter type=\"animated\" name=\"" << id << "\" default=\"" << fallback
          << "\" min=\"" << number(param.minimum) << "\" max=\"" << number(param.maximum)
          << "\" decimals=\"" << (param.kind == ParamKind::Int ? 0 : param.precision) << "\""
          << (param.unit.empty() ? "" : " suffix=\"" + xmlEscaped(param.unit) + "\"") << ">\n";
      break;
    case ParamKind::Angle:
      out << "  <parameter type=\"animated\" name=\"" << id << "\" default=\"" << fallback
          << "\" min=\"-360\" max=\"360\" decimals=\"1\" suffix=\"°\">\n";
      break;
    case ParamKind::Point:
      // Typed as "x y": pixels from the frame's centre, y up, as the effect measures them.
      out << "  <parameter type=\"keywords\" name=\"" << id << "\" default=\"" << fallback
          << "\" keywords=\"0 0\" keywordsdisplay=\"centre\">\n";
      break;
    case ParamKind::Color:
      out << "  <parameter type=\"color\" name=\"" << id << "\" default=\"" << fallback << "\">\n";
      break;
    case ParamKind::Bool:
      out << "  <parameter type=\"bool\" name=\"" << id << "\" default=\"" << fallback << "\">\n";
      break;
    case ParamKind::Choice: {
      std::string values, shown;
      for (const std::string& choice : param.choices) {
        values += (values.empty() ? "" : ";") + xmlEscaped(choice);
        shown += (shown.empty() ? "" : ",") + xmlEscaped(choice);
      }
      out << "  <parameter type=\"list\" name=\"" << id << "\" default=\"" << fallback
          << "\" paramlist=\"" << values << "\">\n    <paramlistdisplay>" << shown
          << "</paramlistdisplay>\n";
      break;
    }
    case ParamKind::Layer:
      out << "  <parameter type=\"list\" name=\"" << id
          << "\" default=\"own\" paramlist=\"own;lower\">\n"
             "    <paramlistdisplay>This track,Lower track</paramlistdisplay>\n";
      break;
  }
  out << "    <name>" << name << "</name>\n  </parameter>\n";
  return out.str();
}

std::string kdenlive(const ParamPanel& panel) {
  std::ostringstream out;
  out << "<!DOCTYPE kpartgui>\n<transition tag=\"veltrane\" id=\"veltrane\">\n  <name>" << kTitle
      << "</name>\n  <description>" << kDescription
      << "</description>\n  <author>Tavrix</author>\n";
  for (const Param& param : panel.params()) {
    if (editable(param)) out << kdenliveParameter(panel, param);
  }
  out << "</transition>\n";
  return out.str();
}

std::string shotcut(const ParamPanel& panel) {
  std::ostringstream out;
  out << "import QtQuick 2.0\nimport org.shotcut.qml 1.0\n\nMetadata {\n"
      << "    type: Metadata.Filter\n    objectName: 'veltrane'\n    name: qsTr('" << kTitle
      << "')\n    keywords: qsTr('split screen cut region diagonal')\n"
      << "    mlt_service: 'veltrane'\n    qml: 'ui.qml'\n    keyframes {\n"
      << "        allowAnimateIn: true\n        allowAnimateOut: true\n        parameters: [\n";
  std::string separator;
  for (const Param& param : panel.params()) {
    if (param.kind != ParamKind::Float && param.kind != ParamKind::Angle) continue;
    const bool angle = param.kind == ParamKind::Angle;
    out << separator << "            Parameter {\n                name: qsTr('"
        << label(panel, param) << "')\n                property: '" << param.id
        << "'\n                isCurve: true\n                minimum: "
        << (angle ? "-360" : number(param.minimum))
        << "\n                maximum: " << (angle ? "360" : number(param.maximum))
        << "\n            }";
    separator = ",\n";
  }
  out << "\n        ]\n    }\n}\n";
  return out.str();
}

void write(const std::string& path, const std::string& text) {
  std::ofstream file(path, std::ios::binary);
  file << text;
  if (!file.flush()) throw std::runtime_error("cannot write " + path);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: describe MODULE.so FOLDER\n");
    return 2;
  }
  try {
    refhost::EngineOptions options;
    options.modulePath = argv[1];
    // No context: declaring the panel draws nothing.
    refhost::Engine engine(std::move(options));
    engine.start();
    const ParamPanel& panel = engine.panel();
    const std::string folder = argv[2];
    write(folder + "/transition_veltrane.yml", yaml(panel, true));
    write(folder + "/filter_veltrane.yml", yaml(panel, false));
    write(folder + "/veltrane.xml", kdenlive(panel));
    write(folder + "/meta.qml", shotcut(panel));
    engine.finish();
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "describe: %s\n", error.what());
    return 1;
  }
}
