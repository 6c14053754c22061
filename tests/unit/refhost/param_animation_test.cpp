// Keyframed parameter values as the plug-in reads them: linear for the continuous kinds, held
// for the discrete ones, and the edit rule for animated parameters.
#include <gtest/gtest.h>

#include <cmath>

#include "refhost/host.h"

namespace refhost {
namespace {

// Declares one parameter of every kind through the plug-in's declaration operations.
void declareOneOfEach(Host& host) {
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
  int32_t first = 0;
  ASSERT_EQ(api.AddFloatParam(h, L"Width", L"px", "f", 1, 0, 200, 2, 1), 0);
  ASSERT_EQ(api.AddIntParam(h, L"Count", L"", "i", 0, 1, 8, 1), 0);
  ASSERT_EQ(api.AddBoolParam(h, L"Show", "b", 1, 0), 0);
  ASSERT_EQ(api.AddChoiceParam(h, L"Type", "c", 0, L"A|B|C", &first, 0), 0);
  ASSERT_EQ(api.AddPointParam(h, L"Position", "p", 1, 0, 0), 0);
  ASSERT_EQ(api.AddAngleParam(h, L"Direction", "a", 17, 1, 0), 0);
  ASSERT_EQ(api.AddColorParam(h, L"Color", "col", 1, 0, 0, 0), 0);
  ASSERT_EQ(api.AddLayerParam(h, L"Layer", "l", 1), 0);
}

// Reads a parameter through the operation the plug-in would use for its kind, as text.
std::string readAsPlugin(Host& host, const std::string& id, int32_t time) {
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
  const char* name = id.c_str();
  switch (host.param(id).kind) {
    case ParamKind::Float:
      return formatValue(ParamKind::Float, ParamValue::ofFloat(api.GetFloatParam(h, name, time)));
    case ParamKind::Angle:
      return formatValue(ParamKind::Angle, ParamValue::ofFloat(api.GetAngleParam(h, name, time)));
    case ParamKind::Int:
      return std::to_string(api.GetIntParam(h, name, time));
    case ParamKind::Bool:
      return std::to_string(api.GetBoolParam(h, name, time));
    case ParamKind::Choice:
      return std::to_string(api.GetChoiceParam(h, name, time));
    case ParamKind::Point: {
      float x = -1, y = -1;
      api.GetPointParam(h, name, time, &x, &y);
      return formatValue(ParamKind::Point, ParamValue::ofPoint(x, y));
    }
    case ParamKind::Color: {
      float r = -1, g = -1, b = -1;
      api.GetColorParam(h, name, time, &r, &g, &b);
      return formatValue(ParamKind::Color, ParamValue::ofColor(r, g, b));
    }
    case ParamKind::Layer: {
      char buffer[40] = "garbage";
      api.GetLayerParam(h, name, time, buffer);
      return buffer;
    }
  }
  return "";
}

const char* const kLayerA = "11111111-2222-3333-4444-555555555555";
const char* const kLayerB = "aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee";

TEST(ParamAnimation, InterpolatesContinuousKindsAndHoldsDiscreteOnes) {
  Host host;
  declareOneOfEach(host);
  // Keyframes at 10 and 20 for every parameter.
  struct Keys {
    const char* id;
    ParamValue at10;
    ParamValue at20;
  };
  const Keys keys[] = {
      {"f", ParamValue::ofFloat(0), ParamValue::ofFloat(100)},
      {"i", ParamValue::ofInt(1), ParamValue::ofInt(8)},
      {"b", ParamValue::ofInt(0), ParamValue::ofInt(1)},
      {"c", ParamValue::ofInt(2), ParamValue::ofInt(0)},
      {"p", ParamValue::ofPoint(-10, 4), ParamValue::ofPoint(10, 8)},
      {"a", ParamValue::ofFloat(90), ParamValue::ofFloat(-270)},
      {"col", ParamValue::ofColor(0, 1, 0.5f), ParamValue::ofColor(1, 0, 0.5f)},
      {"l", ParamValue::ofLayer(kLayerA), ParamValue::ofLayer(kLayerB)},
  };
  for (const Keys& key : keys) {
    host.setKeyframe(key.id, 10, key.at10);
    host.setKeyframe(key.id, 20, key.at20);
  }
  struct Case {
    const char* id;
    int32_t time;
    std::string expected;
  };
  const Case cases[] = {
      {"f", 5, "0"},
      {"f", 10, "0"},
      {"f", 15, "50"},
      {"f", 12, "20"},
      {"f", 20, "100"},
      {"f", 99, "100"},
      {"a", 15, "-90"},
      {"a", 11, "54"},
      {"p", 15, "(0, 6)"},
      {"p", 0, "(-10, 4)"},
      {"col", 15, "(0.5, 0.5, 0.5)"},
      {"i", 15, "1"},
      {"i", 19, "1"},
      {"i", 20, "8"},
      {"i", -5, "1"},
      {"b", 19, "0"},
      {"b", 20, "1"},
      {"c", 15, "2"},
      {"c", 25, "0"},
      {"l", 19, kLayerA},
      {"l", 20, kLayerB},
      {"l", 9, kLayerA},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(readAsPlugin(host, c.id, c.time), c.expected) << c.id << " at " << c.time;
  }
  EXPECT_TRUE(host.problems().empty());
}

TEST(ParamAnimation, StaticValuesAndDefaultsReadAtEveryTime) {
  Host host;
  declareOneOfEach(host);
  EXPECT_EQ(readAsPlugin(host, "f", -1000), "2");
  EXPECT_EQ(readAsPlugin(host, "l", 0), kNoLayer);
  // Values outside the declared range are stored as given: the plug-in must cope with them.
  host.setValue("i", ParamValue::ofInt(-3));
  host.setValue("f", ParamValue::ofFloat(1e30f));
  EXPECT_EQ(readAsPlugin(host, "i", 7), "-3");
  EXPECT_EQ(readAsPlugin(host, "f", 7), "1e+30");
  host.setValue("f", ParamValue::ofFloat(NAN));
  EXPECT_TRUE(std::isnan(host.api().GetFloatParam(host.handle(), "f", 0)));
}

TEST(ParamAnimation, PluginEditsSetAStaticValueOrAKeyframe) {
  Host host;
  declareOneOfEach(host);
  tagWispAPI& api = host.api();
  api.SetFloatParam(host.handle(), "f", 50, 7, 0);
  EXPECT_TRUE(host.param("f").state.keyframes.empty());
  EXPECT_EQ(readAsPlugin(host, "f", 0), "7");

  host.setKeyframe("f", 0, ParamValue::ofFloat(0));
  host.setKeyframe("f", 100, ParamValue::ofFloat(100));
  api.SetFloatParam(host.handle(), "f", 50, 10, 0);  // animated: a new keyframe at 50
  EXPECT_EQ(host.param("f").state.keyframes.size(), 3u);
  EXPECT_EQ(readAsPlugin(host, "f", 25), "5");
  EXPECT_EQ(readAsPlugin(host, "f", 75), "55");
}

TEST(ParamAnimation, UnknownIdsAndKindMismatchesReadZeroAndAreReported) {
  Host host;
  declareOneOfEach(host);
  host.setValue("i", ParamValue::ofInt(5));
  host.setValue("l", ParamValue::ofLayer(kLayerA));
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
  EXPECT_EQ(api.GetIntParam(h, "nope", 0), 0);
  EXPECT_EQ(api.GetChoiceParam(h, "i", 0), 0);  // an int is not a choice
  float x = 3, y = 3;
  api.GetPointParam(h, nullptr, 0, &x, &y);
  EXPECT_EQ(x, 0.0f);
  EXPECT_EQ(y, 0.0f);
  char guid[40];
  api.GetLayerParam(h, "missing", 0, guid);
  EXPECT_STREQ(guid, kNoLayer);
  api.SetFloatParam(h, "i", 0, 1.5f, 0);  // refused: not stored
  EXPECT_EQ(host.valueAt("i", 0).integer, 5);
  EXPECT_EQ(host.problems().size(), 5u);
  EXPECT_EQ(host.callLog().back(), "SetFloatParam i 0 1.5 0");
  EXPECT_THROW(host.setValue("typo", ParamValue::ofInt(1)), std::out_of_range);
}

}  // namespace
}  // namespace refhost
