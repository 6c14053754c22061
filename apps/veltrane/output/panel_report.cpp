// Text and JSON renderings of the registration and the parameter panel.
#include "output/panel_report.h"

#include <algorithm>
#include <cstdio>

#include "refhost/platform/text.h"

namespace veltrane_cli {
namespace {

using refhost::formatFloat;
using refhost::PanelItem;
using refhost::Param;
using refhost::ParamKind;
using refhost::ParamPanel;

std::string hex(uint32_t value) {
  char buffer[16];
  std::snprintf(buffer, sizeof buffer, "0x%X", value);
  return buffer;
}

std::string withUnit(const std::string& value, const std::string& unit) {
  return unit.empty() ? value : value + " " + unit;
}

std::string defaultText(const Param& param) {
  const refhost::ParamValue& value = param.defaultValue;
  switch (param.kind) {
    case ParamKind::Float:
      return withUnit(formatFloat(value.number[0]), param.unit);
    case ParamKind::Int:
      return withUnit(std::to_string(value.integer), param.unit);
    case ParamKind::Bool:
      return value.integer ? "on" : "off";
    case ParamKind::Choice:
      if (value.integer >= 0 && static_cast<std::size_t>(value.integer) < param.choices.size())
        return param.choices[static_cast<std::size_t>(value.integer)];
      return "index " + std::to_string(value.integer);
    case ParamKind::Angle:
      return formatFloat(value.number[0]) + " deg";
    case ParamKind::Layer:
      return value.layer == refhost::kNoLayer ? "none" : value.layer;
    case ParamKind::Point:
    case ParamKind::Color:
      return refhost::formatValue(param.kind, value);
  }
  return "";
}

std::string rangeText(const Param& param) {
  switch (param.kind) {
    case ParamKind::Float:
      return formatFloat(static_cast<float>(param.minimum)) + " to " +
             withUnit(formatFloat(static_cast<float>(param.maximum)), param.unit) + ", precision " +
             std::to_string(param.precision);
    case ParamKind::Int:
      return std::to_string(static_cast<long long>(param.minimum)) + " to " +
             withUnit(std::to_string(static_cast<long long>(param.maximum)), param.unit);
    case ParamKind::Choice: {
      std::string text;
      for (const std::string& choice : param.choices) text += (text.empty() ? "" : "|") + choice;
      return "choices " + text;
    }
    case ParamKind::Angle:
      return "extra " + std::to_string(param.extra);
    default:
      return "";
  }
}

nlohmann::ordered_json defaultJson(const Param& param) {
  const refhost::ParamValue& value = param.defaultValue;
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Angle:
      return value.number[0];
    case ParamKind::Int:
    case ParamKind::Choice:
      return value.integer;
    case ParamKind::Bool:
      return value.integer != 0;
    case ParamKind::Point:
      return {value.number[0], value.number[1]};
    case ParamKind::Color:
      return {value.number[0], value.number[1], value.number[2]};
    case ParamKind::Layer:
      return std::string(value.layer);
  }
  return nullptr;
}

nlohmann::ordered_json paramJson(const Param& param) {
  nlohmann::ordered_json out = {{"id", param.id},
                                {"displayName", param.displayName},
                                {"kind", refhost::kindName(param.kind)},
                                {"flags", param.flags},
                                {"enabled", param.enabled},
                                {"default", defaultJson(param)}};
  switch (param.kind) {
    case ParamKind::Float:
      out["precision"] = param.precision;
      [[fallthrough]];
    case ParamKind::Int:
      out["minimum"] = param.minimum;
      out["maximum"] = param.maximum;
      out["unit"] = param.unit;
      break;
    case ParamKind::Choice:
      out["choices"] = param.choices;
      break;
    case ParamKind::Angle:
      out["extra"] = param.extra;
      break;
    default:
      break;
  }
  return out;
}

nlohmann::ordered_json itemsJson(const ParamPanel& panel, const std::vector<PanelItem>& items) {
  nlohmann::ordered_json out = nlohmann::ordered_json::array();
  for (const PanelItem& item : items) {
    if (item.isGroup) {
      const refhost::ParamGroup& group = panel.groups()[static_cast<std::size_t>(item.index)];
      out.push_back({{"group", group.displayName}, {"items", itemsJson(panel, group.items)}});
    } else {
      out.push_back(paramJson(panel.params()[static_cast<std::size_t>(item.index)]));
    }
  }
  return out;
}

struct Row {
  std::string first;  // indentation and id, or a group heading
  bool isGroup = false;
  const Param* param = nullptr;
};

void collectRows(const ParamPanel& panel, const std::vector<PanelItem>& items, int depth,
                 std::vector<Row>& rows) {
  std::string indent(static_cast<std::size_t>(2 + 2 * depth), ' ');
  for (const PanelItem& item : items) {
    if (item.isGroup) {
      const refhost::ParamGroup& group = panel.groups()[static_cast<std::size_t>(item.index)];
      rows.push_back(Row{indent + "[" + group.displayName + "]", true, nullptr});
      collectRows(panel, group.items, depth + 1, rows);
    } else {
      const Param& param = panel.params()[static_cast<std::size_t>(item.index)];
      rows.push_back(Row{indent + param.id, false, &param});
    }
  }
}

std::string padded(const std::string& text, std::size_t width) {
  return text.size() >= width ? text : text + std::string(width - text.size(), ' ');
}

}  // namespace

nlohmann::ordered_json registrationJson(const refhost::Registration& registration) {
  return {{"name", registration.name},
          {"category", registration.category},
          {"vendor", registration.vendor},
          {"notice", registration.notice},
          {"version", registration.versionText()},
          {"capabilityFlags", registration.capabilityFlags},
          {"identifier", registration.identifier},
          {"guid", registration.guidText()},
          {"kind", registration.kind},
          {"interfaceWord", registration.interfaceWord},
          {"interfaceRevision", registration.interfaceRevision}};
}

nlohmann::ordered_json panelJson(const ParamPanel& panel) {
  return {{"parameterCount", panel.params().size()},
          {"groupCount", panel.groups().size()},
          {"items", itemsJson(panel, panel.topLevel())}};
}

std::string registrationText(const refhost::Registration& registration) {
  std::string text = registration.name + "\n";
  auto line = [&](const char* label, const std::string& value) {
    text += "  " + padded(label, 12) + value + "\n";
  };
  line("category", registration.category);
  line("vendor", registration.vendor);
  line("version", registration.versionText());
  line("flags", hex(registration.capabilityFlags));
  line("identifier", registration.identifier);
  line("guid", registration.guidText());
  line("interface", hex(registration.interfaceWord) + " revision " +
                        std::to_string(registration.interfaceRevision));
  if (!registration.notice.empty()) line("notice", registration.notice);
  return text;
}

std::string panelText(const ParamPanel& panel) {
  std::vector<Row> rows;
  collectRows(panel, panel.topLevel(), 0, rows);
  std::size_t firstWidth = 0, nameWidth = 0, defaultWidth = 0, rangeWidth = 0;
  for (const Row& row : rows) {
    if (row.isGroup) continue;
    firstWidth = std::max(firstWidth, row.first.size());
    nameWidth = std::max(nameWidth, row.param->displayName.size());
    defaultWidth = std::max(defaultWidth, defaultText(*row.param).size());
    rangeWidth = std::max(rangeWidth, rangeText(*row.param).size());
  }
  std::string text = "Parameters: " + std::to_string(panel.params().size()) + " in " +
                     std::to_string(panel.groups().size()) + " groups\n";
  firstWidth = std::max<std::size_t>(firstWidth, 4);
  nameWidth = std::max<std::size_t>(nameWidth, 12);
  defaultWidth = std::max<std::size_t>(defaultWidth, 7);
  rangeWidth = std::max<std::size_t>(rangeWidth, 5);
  text += padded("  id", firstWidth + 2) + padded("display name", nameWidth + 2) +
          padded("kind", 8) + padded("default", defaultWidth + 2) +
          padded("range", rangeWidth + 2) + padded("flags", 8) + "state\n";
  for (const Row& row : rows) {
    if (row.isGroup) {
      text += row.first + "\n";
      continue;
    }
    const Param& param = *row.param;
    std::string line =
        padded(row.first, firstWidth + 2) + padded(param.displayName, nameWidth + 2) +
        padded(refhost::kindName(param.kind), 8) + padded(defaultText(param), defaultWidth + 2) +
        padded(rangeText(param), rangeWidth + 2) +
        padded(hex(static_cast<uint32_t>(param.flags)), 8) +
        (param.enabled ? "enabled" : "disabled");
    text += line + "\n";
  }
  return text;
}

}  // namespace veltrane_cli
