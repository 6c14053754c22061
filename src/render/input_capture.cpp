// Host refusals never raise here: a missing layer, a layer without an image or a failed state
// query show the own source; a frame outside the layer or the source, or a refused fetch, shows
// a transparent texture.
#include "render/input_capture.h"

#include <GL/glew.h>

#include <cstdint>
#include <cstring>
#include <cwchar>
#include <string>

#include "common/param_ids.h"
#include "gl/texture_units.h"
#include "render/layer_alignment.h"
#include "render/layer_state.h"

namespace veltrane {
namespace {

const WispRenderContext& renderContextOf(const tagWispAPI* api) {
  return *static_cast<const WispRenderContext*>(api->renderContext);
}

bool isDesignatedHost(WispHost* host, tagWispAPI* api) {
  const wchar_t* identifier = api->GetHostIdentifier(host);
  if (!identifier) return false;
  const std::size_t length = std::wcslen(kDesignatedHostIdentifier);
  return std::wcsncmp(identifier, kDesignatedHostIdentifier, length) == 0;
}

bool isNullGuid(const char* guid) {
  return std::strncmp(guid, kNullLayerGuid, kGuidTextLength) == 0;
}

// Source on unit 0, output attached: the state the region pass expects between inputs.
void bindSourceAndOutput(const WispRenderContext& context) {
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, context.source.id, true);
  setTextureUnitNearest(GL_TEXTURE0, GL_TEXTURE_2D, true);
  attachRenderTarget(context.output, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
}

// A new texture of the render-target size cleared to transparent black.
TextureRecord transparentTexture(WispHost* host, tagWispAPI* api,
                                 const WispRenderContext& context) {
  RenderTarget target = createRenderTarget(host, api, false);
  attachRenderTarget(target.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  GLfloat savedClear[4];
  glGetFloatv(GL_COLOR_CLEAR_VALUE, savedClear);
  glClearColor(0.0f, 0.0f, 0.0f, 0.0f);
  glClear(GL_COLOR_BUFFER_BIT);
  glClearColor(savedClear[0], savedClear[1], savedClear[2], savedClear[3]);
  attachRenderTarget(context.output, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  target.owned = false;  // handed to the caller
  return target.texture;
}

void readLayerGuid(WispHost* host, tagWispAPI* api, const char* paramId, int32_t time,
                   char (&guid)[kGuidBufferSize]) {
  std::memset(guid, 0, sizeof guid);
  std::strncpy(guid, kNullLayerGuid, kGuidBufferSize - 1);
  api->GetLayerParam(host, paramId, time, guid);
  guid[kGuidBufferSize - 1] = '\0';
}

const char* ownLayerGuid(const WispRenderContext& context) {
  return context.ownLayerGuid && context.ownLayerGuid[0] ? context.ownLayerGuid : kNullLayerGuid;
}

void ownLayerFallback(const WispRenderContext& context, LayerState& state) {
  std::memset(&state, 0, sizeof state);
  state.type = kLayerTypeEffect;
  state.frameCount = 1;
  state.width = context.width;
  state.height = context.height;
  for (int i = 0; i < 4; ++i) state.placement[i * 5] = 1.0f;
}

RenderTarget ownedTarget(WispHost* host, tagWispAPI* api, const TextureRecord& texture) {
  RenderTarget target = RenderTarget::borrowed(texture);
  target.owned = true;
  target.host = host;
  target.api = api;
  return target;
}

}  // namespace

bool captureSourceFrame(WispHost* host, tagWispAPI* api, int32_t frameIndex, bool clamp,
                        bool fallBackToSource, TextureRecord& out) {
  const WispRenderContext& context = renderContextOf(api);
  bindSourceAndOutput(context);
  if (clamp) {
    if (frameIndex > context.sourceFrameCount - 1) frameIndex = context.sourceFrameCount - 1;
    if (frameIndex < 0) frameIndex = 0;
  }
  const bool inRange = frameIndex >= 0 && frameIndex < context.sourceFrameCount;
  if (isDesignatedHost(host, api) || inRange) {
    if (api->GetSourceFrame(host, api->renderContext, frameIndex, &out) == 0) {
      bindSourceAndOutput(context);
      return true;
    }
  }
  if (fallBackToSource) {
    out = context.source;
    return false;
  }
  out = transparentTexture(host, api, context);
  return true;
}

bool captureLayerFrame(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                       const char* layerParamId, int32_t currentTimeMs, TextureRecord& out,
                       int32_t frameShift) {
  LayerState own{};
  const char* ownGuid = ownLayerGuid(context);
  if (!isNullGuid(ownGuid) &&
      getLayerState(host, api, context, ownGuid, context.layerTimeMs, own, true) != 0)
    ownGuid = kNullLayerGuid;
  if (isNullGuid(ownGuid) &&
      getLayerState(host, api, context, ownLayerGuid(context), context.layerTimeMs, own, true) != 0)
    ownLayerFallback(context, own);

  char guid[kGuidBufferSize];
  readLayerGuid(host, api, layerParamId, context.time, guid);

  LayerState chosen{};
  auto chooseOwnLayer = [&] {
    getLayerState(host, api, context, ownLayerGuid(context), currentTimeMs, chosen, true);
  };
  RenderTarget result = RenderTarget::borrowed(context.source);
  if (isNullGuid(guid)) {
    chooseOwnLayer();
  } else {
    const double rate = compositionFrameRate(host, api);
    // In 64 bits: a shift near the i32 limits must not wrap into a frame inside the layer.
    const int64_t frame = static_cast<int64_t>(frameOfTime(currentTimeMs, rate)) + frameShift;
    const bool frameRepresentable = frame >= INT32_MIN && frame <= INT32_MAX;
    const int32_t stateTime = frameShift == 0 || !frameRepresentable
                                  ? currentTimeMs
                                  : timeOfFrame(static_cast<int32_t>(frame), rate);
    const int32_t status = getLayerState(host, api, context, guid, stateTime, chosen, true);
    if (status != 0 || !layerTypeIn(chosen.type, kLayerTypesWithImage)) {
      chooseOwnLayer();
    } else {
      const int64_t frameInLayer = frame - chosen.firstFrame;
      const bool inRange =
          frameRepresentable && frameInLayer >= 0 && frameInLayer < chosen.frameCount;
      TextureRecord fetched{};
      if (frameRepresentable && (isDesignatedHost(host, api) || inRange) &&
          api->RenderLayerFrame(host, api->renderContext, guid, static_cast<int32_t>(frameInLayer),
                                &fetched) == 0) {
        result = ownedTarget(host, api, fetched);
      } else {
        chooseOwnLayer();
        result = ownedTarget(host, api, transparentTexture(host, api, context));
      }
    }
  }

  if (placementsDiffer(own, chosen)) {
    TextureRecord aligned = result.texture;
    alignLayer(host, api, context, aligned, own, chosen);
    // The fetched frame has served its purpose; give it back now rather than at message end.
    result = ownedTarget(host, api, aligned);
  }
  out = result.texture;
  const bool owned = result.owned;
  result.owned = false;
  return owned;
}

void fetchInputFrame(int inputIndex, RenderTarget& holder, WispHost* host, tagWispAPI* api) {
  const WispRenderContext& context = renderContextOf(api);
  const int32_t time = context.time;
  const std::string shiftId = inputParamId(param::kInputFrameShiftPrefix, inputIndex);
  const int32_t shift = api->GetIntParam(host, shiftId.c_str(), time);

  const std::string layerId = inputParamId(param::kInputLayerPrefix, inputIndex);
  char guid[kGuidBufferSize];
  readLayerGuid(host, api, layerId.c_str(), time, guid);
  LayerState state{};
  if (!isNullGuid(guid) &&
      getLayerState(host, api, context, guid, context.currentTimeMs, state, true) != 0)
    std::strncpy(guid, kNullLayerGuid, kGuidBufferSize - 1);
  if (isNullGuid(guid))
    getLayerState(host, api, context, ownLayerGuid(context), context.currentTimeMs, state, true);

  RenderTarget picture;
  TextureRecord texture{};
  if (!isNullGuid(guid)) {
    const bool owned = captureLayerFrame(host, api, context, layerId.c_str(), context.currentTimeMs,
                                         texture, shift);
    picture = owned ? ownedTarget(host, api, texture) : RenderTarget::borrowed(texture);
  } else if (shift != 0) {
    const int64_t index = static_cast<int64_t>(context.sourceFrameIndex) + shift;
    // Indices beyond the i32 range are out of range of every source as well.
    const int32_t frameIndex =
        index < INT32_MIN || index > INT32_MAX ? -1 : static_cast<int32_t>(index);
    const bool owned = captureSourceFrame(host, api, frameIndex, false, false, texture);
    picture = owned ? ownedTarget(host, api, texture) : RenderTarget::borrowed(texture);
  } else {
    picture = RenderTarget::borrowed(context.source);
  }
  holder = std::move(picture);
}

}  // namespace veltrane
