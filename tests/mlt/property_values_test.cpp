// The rules by which MLT property texts become the effect's parameter values or are refused.
#include "property_values.h"

#include <gtest/gtest.h>

#include <optional>

namespace veltrane_mlt {
namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamValue;

Param param(ParamKind kind, const char* id, ParamValue fallback, double minimum = 0,
            double maximum = 0, std::vector<std::string> choices = {}) {
  Param p;
  p.kind = kind;
  p.id = id;
  p.defaultValue = fallback;
  p.minimum = minimum;
  p.maximum = maximum;
  p.choices = std::move(choices);
  return p;
}

refhost::ParamPanel panel() {
  refhost::ParamPanel result;
  result.add(param(ParamKind::Float, "width", ParamValue::ofFloat(2), 0, 200));
  result.add(param(ParamKind::Int, "count", ParamValue::ofInt(1), 1, 8));
  result.add(param(ParamKind::Angle, "angle", ParamValue::ofFloat(225)));
  result.add(param(ParamKind::Point, "point", ParamValue::ofPoint(0, 0)));
  result.add(param(ParamKind::Color, "colour", ParamValue::ofColor(0, 0, 0)));
  result.add(param(ParamKind::Bool, "flag", ParamValue::ofInt(0)));
  result.add(param(ParamKind::Choice, "mode", ParamValue::ofInt(0), 0, 0, {"Local", "Radial"}));
  result.add(param(ParamKind::Layer, "layer", ParamValue::ofLayer(refhost::kNoLayer)));
  return result;
}

struct Case {
  const char* id;
  const char* text;                 // null: the property is not set
  int position;                     // of an item 11 frames long
  std::optional<ParamValue> value;  // none: refused, with `reason` in the refusal
  const char* reason = "";
};

TEST(PropertyValues, ReadsOrRefusesEveryKind) {
  const ParamValue lower = ParamValue::ofLayer(trackGuid(4));
  const ParamValue third = ParamValue::ofLayer(trackGuid(2));
  const Case cases[] = {
      {"width", nullptr, 0, ParamValue::ofFloat(2)},
      {"width", "", 0, ParamValue::ofFloat(2)},
      {"width", " 12.5 ", 0, ParamValue::ofFloat(12.5)},
      {"width", "0=10;10=20", 5, ParamValue::ofFloat(15)},
      {"width", "0|=10;10=20", 5, ParamValue::ofFloat(10)},
      {"width", "300", 0, std::nullopt, "expected a number from 0 to 200"},
      {"width", "0=10;10=250", 0, std::nullopt, "expected a number from 0 to 200"},
      {"width", "12px", 0, std::nullopt, "expected a number"},
      {"width", "nan", 0, std::nullopt, "expected a number"},
      {"count", "3", 0, ParamValue::ofInt(3)},
      {"count", "0=1;10=8", 5, ParamValue::ofInt(5)},
      {"count", "2.5", 0, std::nullopt, "expected a whole number from 1 to 8"},
      {"count", "9", 0, std::nullopt, "expected a whole number from 1 to 8"},
      {"angle", "-720", 0, ParamValue::ofFloat(-720)},
      {"angle", "0=15;10=75", 5, ParamValue::ofFloat(45)},
      {"angle", "north", 0, std::nullopt, "expected an angle in degrees"},
      {"point", "10 -20", 0, ParamValue::ofPoint(10, -20)},
      {"point", "10 -20 0 0 1", 0, ParamValue::ofPoint(10, -20)},
      // A 100x50 frame: a rectangle's centre, from the top-left corner, y down.
      {"point", "0 0 100 50 1", 0, ParamValue::ofPoint(0, 0)},
      {"point", "30 5 40 20", 0, ParamValue::ofPoint(0, 10)},
      {"point", "0=0 0;10=10 20", 5, ParamValue::ofPoint(5, 10)},
      {"point", "10", 0, std::nullopt, "expected a point"},
      {"colour", "#ff8000", 0, ParamValue::ofColor(1, 128 / 255.0f, 0)},
      {"colour", "0x00ff00ff", 0, ParamValue::ofColor(0, 1, 0)},
      {"colour", "pink", 0, std::nullopt, "expected a colour"},
      {"flag", "1", 0, ParamValue::ofInt(1)},
      {"flag", "false", 0, ParamValue::ofInt(0)},
      {"flag", "2", 0, std::nullopt, "expected 0 or 1"},
      {"mode", "radial", 0, ParamValue::ofInt(1)},
      {"mode", "1", 0, ParamValue::ofInt(1)},
      {"mode", "0=Local;6=Radial", 7, ParamValue::ofInt(1)},
      {"mode", "2", 0, std::nullopt, "expected one of Local, Radial or an index from 0 to 1"},
      {"layer", "own", 0, ParamValue::ofLayer(refhost::kNoLayer)},
      {"layer", "LOWER", 0, lower},
      {"layer", " Track:2 ", 0, third},
      {"layer", "track:V3", 0, third},
      {"layer", "0=own;6=track:2", 7, third},
      {"layer", "track:12", 0, ParamValue::ofLayer(refhost::kNoLayer)},  // no such track
      {"layer", "track:", 0, std::nullopt, "expected own, lower, track:K"},
      {"layer", "upper", 0, std::nullopt, "expected own, lower, track:K"},
  };
  const refhost::ParamPanel declared = panel();
  for (const Case& c : cases) {
    SCOPED_TRACE(std::string(c.id) + " = " + (c.text ? c.text : "(unset)"));
    mlt_properties properties = mlt_properties_new();
    if (c.text) mlt_properties_set(properties, c.id, c.text);
    // Five tracks, "lower" the fifth; names stand for the track two.
    const LayerResolver tracks = [](const LayerName& name) {
      switch (name.kind) {
        case LayerName::Kind::Lower:
          return 4;
        case LayerName::Kind::TrackIndex:
          return name.track < 5 ? name.track : -1;
        case LayerName::Kind::TrackName:
          return name.trackName == "V3" ? 2 : -1;
        default:
          return -1;
      }
    };
    ParamReading reading = readParams(properties, declared, c.position, 11, {100, 50}, tracks);
    const Param& p = *declared.find(std::string_view(c.id));
    const ParamValue& value =
        reading.values.at(static_cast<std::size_t>(&p - &declared.params()[0]));
    if (c.value) {
      EXPECT_TRUE(reading.refusals.empty());
      EXPECT_EQ(refhost::formatValue(p.kind, value), refhost::formatValue(p.kind, *c.value));
    } else {
      ASSERT_EQ(reading.refusals.size(), 1u);
      EXPECT_EQ(reading.refusals[0].id, c.id);
      EXPECT_NE(reading.refusals[0].reason.find(c.reason), std::string::npos)
          << reading.refusals[0].reason;
      EXPECT_EQ(value, p.defaultValue);
    }
    EXPECT_EQ(reading.values.size(), declared.params().size());
    mlt_properties_close(properties);
  }
}

}  // namespace
}  // namespace veltrane_mlt
