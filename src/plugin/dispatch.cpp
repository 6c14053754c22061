// One switch over the message table. Handlers run synchronously; only the plug-in's two
// exception types are turned into a result here, and nothing they changed is rolled back.
#include "plugin/dispatch.h"

#include "common/plugin_exception.h"
#include "controls/instance_record.h"
#include "controls/key_handling.h"
#include "controls/overlay_drawing.h"
#include "controls/pointer_handling.h"
#include "effect/frame_requests.h"
#include "effect/layer_picker.h"
#include "effect/param_change.h"
#include "effect/param_declaration.h"
#include "gl/effect_data.h"
#include "plugin/fault_guard.h"
#include "render/frame_render.h"
#include "render/gl_startup.h"

namespace veltrane {
namespace {

void destroyEffectData(void* effectData) { delete static_cast<EffectData*>(effectData); }

// Any exception or machine fault while destroying the registry answers 2; the slot is cleared
// either way, since a half-destroyed registry cannot be destroyed again.
int32_t unloadPlugin(tagWispAPI* api) {
  int32_t result = kResultDone;
  if (api->pluginData) {
    try {
      if (!runCatchingMachineFaults(destroyEffectData, api->pluginData)) result = kResultNotHandled;
    } catch (...) {
      result = kResultNotHandled;
    }
  }
  api->pluginData = nullptr;
  return result;
}

const char* eventParameterId(const tagWispAPI* api) {
  const auto* event = static_cast<const WispParamEvent*>(api->event);
  return event ? event->id : nullptr;
}

uint32_t eventKeyCode(const tagWispAPI* api) {
  const auto* event = static_cast<const WispKeyEvent*>(api->event);
  return event ? event->keyCode : 0;
}

int32_t handle(WispHost* host, tagWispAPI* api, int32_t message) {
  switch (message) {
    case kMessageLoad:
      api->pluginData = static_cast<EffectData*>(new EffectData());
      return kResultDone;
    case kMessageUnload:
      return unloadPlugin(api);
    case kMessageDeclareParameters:
      return declareParameters(host, api);
    case kMessageCreateInstance:
      createInstance(api);
      return kResultDone;
    case kMessageDestroyInstance:
      destroyInstance(api);
      return kResultDone;
    case kMessageParameterChanged:
      return onParameterChanged(host, api, eventParameterId(api));
    case kMessagePrepareGl:
      return prepareGl(host, api);
    case kMessageRender:
      return renderFrame(host, api);
    case kMessageRequestFrames:
      return requestFrames(host, api);
    case kMessageParameterEditBegan:
    case kMessageParameterEditEnded:
    case kMessageViewerOpened:
    case kMessageViewerClosed:
      return kResultDone;
    case kMessageDrawOverlay:
      return drawOverlay(host, api);
    case kMessagePointerMove: {
      const int32_t pressedPass = onPointerMove(host, api, true);
      return pressedPass != 0 ? pressedPass : onPointerMove(host, api, false);
    }
    case kMessagePointerPress:
      return onPointerPress(host, api);
    case kMessagePointerRelease:
      return onPointerRelease(host, api);
    case kMessageKeyDown:
      return onKeyDown(host, api, eventKeyCode(api));
    case kMessageKeyUp:
      return onKeyUp(host, api, eventKeyCode(api));
    case kMessagePointerEntered:
    case kMessagePointerLeft:
    case kMessageDoubleClick:
      return kResultNotDone;
    case kMessagePointerOverSelection: {
      const EffectInstance* instance = instanceOf(api);
      return instance ? pointerOverSelectedInput(*instance) : kResultNotDone;
    }
    case kMessagePickLayer:
      return pickLayerForSelectedInput(host, api);
    case kMessageCopyInstance:
      copyInstance(api, static_cast<const EffectInstance*>(api->renderContext));
      return kResultNotDone;
    default:
      return kResultNotHandled;
  }
}

}  // namespace

int32_t dispatchMessage(WispHost* host, tagWispAPI* api, int32_t message) {
  if (!api) return kResultNotHandled;
  try {
    return handle(host, api, message);
  } catch (const PluginException&) {
    return kResultException;
  } catch (const Plugin::gl::FXGLSLexception&) {
    return kResultException;
  }
}

}  // namespace veltrane
