// Kdenlive's composition description read the way Kdenlive 22.12 reads it: every parameter of
// a type it knows, with a list's shown names paired to its values and its default among them,
// and every parameter the module declares present once, as the type its kind needs.
#include <gtest/gtest.h>

#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include "layout_choice.h"
#include "layouts/layouts.h"
#include "refhost/engine.h"

namespace {

struct KdenliveParameter {
  std::map<std::string, std::string> attributes;
  std::string label;
  std::vector<std::string> shown;  // a list's names, in its values' order
};

std::vector<std::string> split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::stringstream in(text);
  for (std::string part; std::getline(in, part, separator);) parts.push_back(part);
  return parts;
}

std::vector<KdenliveParameter> kdenliveParameters(const std::string& xml) {
  std::vector<KdenliveParameter> parameters;
  const std::regex element(R"(<parameter ([^>]*)>([\s\S]*?)</parameter>)");
  const std::regex attribute(R"re((\w+)="([^"]*)")re");
  for (std::sregex_iterator at(xml.begin(), xml.end(), element), end; at != end; ++at) {
    KdenliveParameter parameter;
    const std::string attributes = (*at)[1];
    for (std::sregex_iterator a(attributes.begin(), attributes.end(), attribute); a != end; ++a)
      parameter.attributes[(*a)[1]] = (*a)[2];
    const std::string body = (*at)[2];
    std::smatch found;
    if (std::regex_search(body, found, std::regex("<name>([^<]*)</name>")))
      parameter.label = found[1];
    if (std::regex_search(body, found, std::regex("<paramlistdisplay>([^<]*)</paramlistdisplay>")))
      parameter.shown = split(found[1], ',');
    parameters.push_back(std::move(parameter));
  }
  return parameters;
}

std::string typeFor(refhost::ParamKind kind) {
  switch (kind) {
    case refhost::ParamKind::Float:
    case refhost::ParamKind::Int:
    case refhost::ParamKind::Angle:
      return "animated";
    case refhost::ParamKind::Point:
      return "animatedrect";
    case refhost::ParamKind::Color:
      return "color";
    case refhost::ParamKind::Bool:
      return "bool";
    case refhost::ParamKind::Choice:
    case refhost::ParamKind::Layer:
      return "list";
  }
  return "";
}

TEST(KdenliveDescription, ReadsAsKdenliveReadsIt) {
  std::ifstream file(VELTRANE_MLT_DATA "/veltrane/veltrane.xml");
  std::stringstream xml;
  xml << file.rdbuf();
  const std::vector<KdenliveParameter> parameters = kdenliveParameters(xml.str());

  refhost::EngineOptions options;
  options.modulePath = VELTRANE_MODULE_PATH;
  refhost::Engine engine(std::move(options));
  engine.start();
  std::map<std::string, const KdenliveParameter*> byName;
  // The parameter types Kdenlive 22.12 builds a control for.
  const std::set<std::string> known{"animated", "animatedrect", "bool",  "color",
                                    "constant", "double",       "fixed", "keyframe",
                                    "list",     "position",     "switch"};
  const std::regex numbered(R"(^(Cut|Picture) (\d+): )");
  for (const KdenliveParameter& parameter : parameters) {
    const std::string name = parameter.attributes.at("name");
    SCOPED_TRACE(name);
    EXPECT_TRUE(byName.emplace(name, &parameter).second) << "listed twice";
    EXPECT_TRUE(known.count(parameter.attributes.at("type"))) << parameter.attributes.at("type");
    EXPECT_FALSE(parameter.label.empty());
    std::smatch number;
    if (std::regex_search(parameter.label, number, numbered)) {
      const int shown = std::stoi(number[2]);
      EXPECT_GE(shown, 1);
      EXPECT_LE(shown,
                number[1] == "Cut" ? engine.vocabulary().cuts() : engine.vocabulary().inputs());
    }
    if (parameter.attributes.at("type") == "list") {
      const std::vector<std::string> values = split(parameter.attributes.at("paramlist"), ';');
      EXPECT_EQ(parameter.shown.size(), values.size());
      EXPECT_NE(std::find(values.begin(), values.end(), parameter.attributes.at("default")),
                values.end());
    }
  }
  for (const refhost::Param& param : engine.panel().params()) {
    if (param.kind == refhost::ParamKind::Choice && param.choices.size() < 2) continue;
    SCOPED_TRACE(param.id);
    auto found = byName.find(param.id);
    ASSERT_NE(found, byName.end()) << "not described";
    EXPECT_EQ(found->second->attributes.at("type"), typeFor(param.kind));
  }
  // The layout pick offers every layout of veltrane split, and a new composition splits the
  // two tracks along the diagonal with its pictures framed and its second on the lower track.
  const KdenliveParameter& layout = *byName.at(veltrane_mlt::kLayoutProperty);
  for (const veltrane_cli::LayoutInfo& info : veltrane_cli::layouts())
    EXPECT_NE(layout.attributes.at("paramlist").find(info.name), std::string::npos) << info.name;
  EXPECT_EQ(layout.attributes.at("default"), veltrane_cli::layouts().front().name);
  EXPECT_EQ(byName.at(veltrane_mlt::kFramePicturesProperty)->attributes.at("default"), "1");
  EXPECT_EQ(
      byName.at(engine.vocabulary().id(refhost::InputParam::Layer, 1))->attributes.at("default"),
      "lower");
  engine.finish();
}

}  // namespace
