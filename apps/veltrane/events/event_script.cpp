// Reading event scripts.
#include "events/event_script.h"

#include <climits>

#include "scene/json_fields.h"
#include "scene/json_file.h"

namespace veltrane_cli {
namespace {

using Kind = ViewerEvent::Kind;

const char kEventExpectation[] =
    "one event: {\"press\": [x, y]}, {\"move\": [x, y]}, {\"release\": [x, y]}, "
    "{\"keyDown\": K}, {\"keyUp\": K}, {\"pick\": m}, {\"layerMenu\": true}, {\"undo\": n} or "
    "{\"redo\": n}";

struct EventName {
  const char* name;
  Kind kind;
};

const EventName kEventNames[] = {
    {"press", Kind::Press},         {"move", Kind::Move},   {"release", Kind::Release},
    {"keyDown", Kind::KeyDown},     {"keyUp", Kind::KeyUp}, {"pick", Kind::Pick},
    {"layerMenu", Kind::LayerMenu}, {"undo", Kind::Undo},   {"redo", Kind::Redo}};

uint32_t readKey(const JsonField& field) {
  const char* expected = "\"Shift\", \"Escape\" or a key number (X11 keysym)";
  if (field.isString()) {
    std::string name = field.json().get<std::string>();
    if (name == "Shift") return kKeyLeftShift;
    if (name == "Escape") return kKeyEscape;
    field.fail(expected);
  }
  if (!field.isWholeNumber()) field.fail(expected);
  return static_cast<uint32_t>(field.integerIn(0, INT32_MAX));
}

ViewerEvent readEvent(const JsonField& field) {
  if (!field.present() || !field.json().is_object() || field.json().size() != 1)
    field.fail(kEventExpectation);
  const std::string name = field.json().begin().key();
  JsonField value = field.member(name);
  ViewerEvent event;
  const EventName* known = nullptr;
  for (const EventName& candidate : kEventNames) {
    if (name == candidate.name) known = &candidate;
  }
  if (!known) field.fail(kEventExpectation);
  event.kind = known->kind;
  switch (event.kind) {
    case Kind::Press:
    case Kind::Move:
    case Kind::Release:
      value.arraySize(2, 2, "a pointer position [x, y] in whole pixels (corner space)");
      event.x = value.element(0).integerIn(INT32_MIN, INT32_MAX);
      event.y = value.element(1).integerIn(INT32_MIN, INT32_MAX);
      break;
    case Kind::KeyDown:
    case Kind::KeyUp:
      event.key = readKey(value);
      break;
    case Kind::Pick:
      event.count = value.integerIn(INT32_MIN, INT32_MAX);
      break;
    case Kind::LayerMenu:
      if (!value.present() || value.json() != true) value.fail("true");
      break;
    case Kind::Undo:
    case Kind::Redo:
      event.count = value.integerIn(0, 100000);
      break;
  }
  return event;
}

}  // namespace

EventScript loadEventScript(const std::string& path) {
  nlohmann::ordered_json document = readJsonFile(path);
  JsonField top(document, path);
  top.requireObject({"$schema", "description", "viewScale", "uiScale", "hostId", "time", "events"});
  EventScript script;
  if (JsonField scale = top.member("viewScale"); scale.present()) {
    scale.arraySize(2, 2, "[sx, sy], two numbers above 0");
    script.viewScaleX = scale.element(0).numberIn(1e-6, 1e6);
    script.viewScaleY = scale.element(1).numberIn(1e-6, 1e6);
  }
  if (top.member("uiScale").present()) script.uiScale = top.member("uiScale").numberIn(1e-6, 1e6);
  if (top.member("hostId").present())
    script.hostId = top.member("hostId").integerIn(INT32_MIN, INT32_MAX);
  if (top.member("time").present())
    script.time = top.member("time").integerIn(INT32_MIN, INT32_MAX);
  JsonField events = top.member("events");
  std::size_t count = events.arraySize(0, 1000000, "an array of events");
  for (std::size_t i = 0; i < count; ++i) script.events.push_back(readEvent(events.element(i)));
  return script;
}

}  // namespace veltrane_cli
