// Renders a module's registration and declared parameter panel as an indented text tree or as
// one JSON document.
#pragma once

#include <nlohmann/json.hpp>
#include <string>

#include "refhost/core/module.h"
#include "refhost/core/params.h"

namespace veltrane_cli {

nlohmann::ordered_json registrationJson(const refhost::Registration& registration);
// {"parameterCount", "groupCount", "items": [parameter or {"group", "items"}...]}.
nlohmann::ordered_json panelJson(const refhost::ParamPanel& panel);

std::string registrationText(const refhost::Registration& registration);
// One line per parameter (id, display name, kind, default, range, flags, enabled) with groups
// as bracketed headings, indented by nesting.
std::string panelText(const refhost::ParamPanel& panel);

}  // namespace veltrane_cli
