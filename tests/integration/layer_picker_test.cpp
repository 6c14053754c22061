// Choosing a layer for the selected input from the host's popup menu.
#include "loaded_plugin.h"
#include "viewer_events.h"

namespace {

using refhost::ParamValue;

const std::string kOwn = "0000000a-0000-4000-8000-00000000000a";

refhost::Layer layer(const std::string& guid, const std::string& name, int32_t kind) {
  refhost::Layer result;
  result.guid = guid;
  result.name = name;
  result.kind = kind;
  return result;
}

class LayerPicker : public LoadedPlugin {
 protected:
  // Selects input 1 (left of a vertical cut) and leaves the pointer over it.
  void selectInputOne() {
    setCut(host(), 0, 0.0f, 0.0f, 0.0f);
    ViewerEvents viewer(host(), 160, 90);
    viewer.press(20, 45);
    viewer.release(20, 45);
    ASSERT_EQ(host().send(kMessagePointerOverSelection), 1);
  }
  int32_t pick(int32_t answer) {
    host().queuePopupAnswer(answer);
    WispLayerPickerContext context{kOwn.c_str()};
    host().setRenderContext(&context);
    const int32_t result = host().send(kMessagePickLayer);
    host().setRenderContext(nullptr);
    return result;
  }
  std::string layerOfInputOne() { return host().valueAt("inputLayer1", 0).layer; }
};

TEST_F(LayerPicker, OffersImageLayersAndStoresTheChoiceWithoutAnUndoStep) {
  host().addLayer(layer("aaaaaaaa-0000-4000-8000-000000000001", "A", kLayerTypeFootage));
  host().addLayer(layer(kOwn, "Own", kLayerTypeFootage));
  host().addLayer(layer("bbbbbbbb-0000-4000-8000-000000000002", "B", kLayerTypeEffect));
  host().addLayer(layer("dddddddd-0000-4000-8000-000000000004", "D", kLayerTypeAudio));
  host().addLayer(layer("eeeeeeee-0000-4000-8000-000000000005", "", kLayerTypeModel));
  selectInputOne();
  const size_t stepsBefore = host().undoStepNames().size();
  const size_t bracketsBefore = host().callsTo("BeginUndo").size();

  EXPECT_EQ(pick(2), 1);
  EXPECT_EQ(host().popupMenus().back(), "A|Own|B|");
  EXPECT_EQ(layerOfInputOne(), "bbbbbbbb-0000-4000-8000-000000000002");

  EXPECT_EQ(pick(1), 1);  // the own layer means no layer: the effect's own source
  EXPECT_EQ(layerOfInputOne(), refhost::kNoLayer);

  EXPECT_EQ(pick(0), 1);
  EXPECT_EQ(pick(-1), 1);  // dismissed
  EXPECT_EQ(pick(4), 1);   // past the end
  EXPECT_EQ(layerOfInputOne(), "aaaaaaaa-0000-4000-8000-000000000001");
  EXPECT_EQ(host().undoStepNames().size(), stepsBefore);
  EXPECT_EQ(host().callsTo("BeginUndo").size(), bracketsBefore);
}

TEST_F(LayerPicker, EffectLayersBeforeTheOwnLayerAreNotOffered) {
  host().addLayer(layer("bbbbbbbb-0000-4000-8000-000000000002", "B", kLayerTypeEffect));
  host().addLayer(layer(kOwn, "Own", kLayerTypeFootage));
  selectInputOne();
  EXPECT_EQ(pick(0), 1);
  EXPECT_EQ(host().popupMenus().back(), "Own");
}

// Without a selection under the pointer the pick is declined; with one, an empty composition
// shows an empty menu and stores nothing.
TEST_F(LayerPicker, DeclinesWithoutASelectionAndOffersNothingInAnEmptyComposition) {
  EXPECT_EQ(pick(0), 0);
  EXPECT_TRUE(host().popupMenus().empty());
  EXPECT_TRUE(host().callsTo("GetLayerCount").empty());
  selectInputOne();
  EXPECT_EQ(pick(0), 1);
  EXPECT_EQ(host().popupMenus().back(), "");
  EXPECT_EQ(layerOfInputOne(), refhost::kNoLayer);
}

}  // namespace
