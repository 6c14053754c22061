// The numbers of the host protocol, named once for the plug-in and its hosts: messages, Notify's
// results, parameter flag bits, cursor shapes, layer types, host product codes and keys.
// Header-only, so that including it links nothing; wisp_api.h holds the records they travel in.
#pragma once

#include <cstdint>
#include <string>

// The messages a host sends through Notify. Where the plug-in only acknowledges a message, the
// comment says what the host means by it.
enum WispMessage : int32_t {
  kMessageLoad = 0,                     // the module is loaded: create the program registry
  kMessageUnload = 1,                   // the module is about to be unloaded: destroy it
  kMessageDeclareParameters = 2,        // declare the parameter panel
  kMessageCreateInstance = 3,           // the effect was applied to a layer
  kMessageDestroyInstance = 4,          // the effect was removed from its layer
  kMessageParameterChanged = 7,         // a parameter (named in the event) has a new value
  kMessagePrepareGl = 8,                // the host's GL context is current: build the programs
  kMessageRender = 10,                  // render one frame into the output texture
  kMessageRequestFrames = 12,           // name the frames the next render will fetch
  kMessageParameterEditBegan = 13,      // the user took hold of a parameter's panel control
  kMessageParameterEditEnded = 14,      // the user let go of it
  kMessageViewerOpened = 1001,          // a viewer started showing the effect's controls
  kMessageViewerClosed = 1002,          // that viewer stopped showing them
  kMessageDrawOverlay = 1003,           // draw the on-screen controls over the viewer
  kMessagePointerMove = 1004,           // the pointer moved in the viewer
  kMessagePointerPress = 1005,          // a pointer button went down
  kMessagePointerRelease = 1006,        // the button came up
  kMessageKeyDown = 1007,               // a key went down (event: its keysym)
  kMessageKeyUp = 1008,                 // the key came up
  kMessagePointerEntered = 1009,        // the pointer entered the viewer
  kMessagePointerLeft = 1010,           // the pointer left the viewer
  kMessageDoubleClick = 1011,           // a double click in the viewer
  kMessagePointerOverSelection = 1012,  // may the host offer its layer action here?
  kMessagePickLayer = 1013,             // the user asked for the layer action
  kMessageCopyInstance = 1014,          // copy another instance's state into this one
};

// A short human name of each message for logs and errors; null for a number that is none.
// The switch has no default, so the compiler names any message left out of it.
constexpr const char* wispMessageName(int32_t message) {
  switch (static_cast<WispMessage>(message)) {
    case kMessageLoad:
      return "load";
    case kMessageUnload:
      return "unload";
    case kMessageDeclareParameters:
      return "declare parameters";
    case kMessageCreateInstance:
      return "create instance";
    case kMessageDestroyInstance:
      return "destroy instance";
    case kMessageParameterChanged:
      return "parameter changed";
    case kMessagePrepareGl:
      return "prepare GL";
    case kMessageRender:
      return "render";
    case kMessageRequestFrames:
      return "request frames";
    case kMessageParameterEditBegan:
      return "parameter edit began";
    case kMessageParameterEditEnded:
      return "parameter edit ended";
    case kMessageViewerOpened:
      return "viewer opened";
    case kMessageViewerClosed:
      return "viewer closed";
    case kMessageDrawOverlay:
      return "draw overlay";
    case kMessagePointerMove:
      return "pointer move";
    case kMessagePointerPress:
      return "pointer press";
    case kMessagePointerRelease:
      return "pointer release";
    case kMessageKeyDown:
      return "key down";
    case kMessageKeyUp:
      return "key up";
    case kMessagePointerEntered:
      return "pointer entered";
    case kMessagePointerLeft:
      return "pointer left";
    case kMessageDoubleClick:
      return "double click";
    case kMessagePointerOverSelection:
      return "pointer over selection";
    case kMessagePickLayer:
      return "pick layer";
    case kMessageCopyInstance:
      return "copy instance";
  }
  return nullptr;
}

// The message's name, or "unknown message N" for a number that is none.
inline std::string wispMessageText(int32_t message) {
  const char* name = wispMessageName(message);
  return name ? std::string(name) : "unknown message " + std::to_string(message);
}

// What Notify answers.
enum WispResult : int32_t {
  kResultNotDone = 0,     // not done, false, or the event left to the host
  kResultDone = 1,        // done, true, or the event taken
  kResultNotHandled = 2,  // a message number the plug-in does not know
  kResultException = 5,   // one of the plug-in's exceptions reached Notify
};

// A short name of each result; null for a number that is none.
struct WispResultName {
  WispResult result;
  const char* name;
};
inline constexpr WispResultName kWispResultNames[] = {{kResultNotDone, "not done"},
                                                      {kResultDone, "done"},
                                                      {kResultNotHandled, "not handled"},
                                                      {kResultException, "exception"}};
constexpr const char* wispResultName(int32_t result) {
  for (const auto& entry : kWispResultNames)
    if (entry.result == result) return entry.name;
  return nullptr;
}

// Bits of the flags a parameter is declared with. The host interprets them; the plug-in only
// chooses them.
enum WispParamFlag : int32_t {
  kParamFlagsNone = 0,           // a plain parameter: one value, not animated
  kParamFlagAnimated = 1,        // the host keeps keyframes for it
  kParamFlagNotInUse = 2,        // unused with the default settings: shown disabled at first
  kParamFlagWholeTurns = 4,      // an angle counted in whole turns, never wrapped at 360
  kParamFlagDirectionDial = 16,  // an angle the host edits with a dial
  kParamFlagHostPresets = 32,    // a choice the host fills with its saved presets
  kParamFlagNotSaved = 64,       // a value the host leaves out of the saved project
  kParamFlagHostHandle = 1024,   // a point the host gives a handle of its own in the viewer
};

// The flags an angle adds to its parameter's own: a direction turns on a dial; a rotation does
// too and keeps its whole turns.
constexpr int32_t kParamFlagsDirection = kParamFlagDirectionDial;
constexpr int32_t kParamFlagsRotation = kParamFlagDirectionDial | kParamFlagWholeTurns;

// The cursor shapes SetCursor shows. Resize cursors name the axis they move along and rotate
// cursors the octant of the handle, both with 0 degrees pointing along +y.
enum class CursorShape : int32_t {
  Default = 0,     // the viewer's own arrow
  Move = 3,        // a region's picture follows the pointer
  Resize0 = 6,     // resize along 0/180 degrees
  Resize45 = 7,    // resize along 45/225 degrees
  Resize90 = 8,    // resize along 90/270 degrees
  Resize135 = 9,   // resize along 135/315 degrees
  Rotate0 = 10,    // rotate, handle in the octant around 0 degrees
  Rotate45 = 11,   // ... around 45 degrees
  Rotate90 = 12,   // ... around 90 degrees
  Rotate135 = 13,  // ... around 135 degrees
  Rotate180 = 14,  // ... around 180 degrees
  Rotate225 = 15,  // ... around 225 degrees
  Rotate270 = 16,  // ... around 270 degrees
  Rotate315 = 17,  // ... around 315 degrees
  InsertCut = 19,  // a press inserts a cut
};

// Layer types, as the layer state record and the layer list give them.
enum WispLayerType : uint32_t {
  kLayerTypeFootage = 0,  // video or still media, placed in the composition
  kLayerTypeTitle = 1,    // text; its second matrix places the text box
  kLayerTypeAudio = 2,    // sound only
  kLayerTypeCamera = 3,   // the composition's point of view
  kLayerTypeEffect = 4,   // the picture of an effect, like the layer this one is applied to
  kLayerTypeLight = 5,    // lights 3D layers, shows nothing itself
  kLayerTypeNested = 6,   // a nested composition
  kLayerTypeModel = 7,    // a 3D model; its second matrix places the object
};

// Sets of layer types as bit masks over the type number.
constexpr uint32_t layerTypeBit(WispLayerType type) { return 1u << type; }
constexpr bool layerTypeIn(uint32_t type, uint32_t mask) {
  return type < 32 && ((mask >> type) & 1u);
}
// Types that carry a picture.
constexpr uint32_t kLayerTypesWithImage =
    layerTypeBit(kLayerTypeFootage) | layerTypeBit(kLayerTypeTitle) |
    layerTypeBit(kLayerTypeEffect) | layerTypeBit(kLayerTypeNested) | layerTypeBit(kLayerTypeModel);
// Types without a placement of their own, replaced by a flat default when a flat state is asked.
constexpr uint32_t kLayerTypesFlattened = kLayerTypesWithImage & ~layerTypeBit(kLayerTypeFootage);
// Types that carry no picture: nothing to offer as an input.
constexpr uint32_t kLayerTypesWithoutImage =
    layerTypeBit(kLayerTypeAudio) | layerTypeBit(kLayerTypeCamera) | layerTypeBit(kLayerTypeLight);
// Types whose second matrix is theirs to place.
constexpr uint32_t kLayerTypesWithSecondMatrix =
    layerTypeBit(kLayerTypeTitle) | layerTypeBit(kLayerTypeModel);

// Host product codes (GetHostId) that change what the plug-in does.
enum WispHostProduct : int32_t {
  // The touch edition: no hover, so a pressed control keeps its hover state through moves
  // without a button, and a selection lasts only until the release.
  kHostProductTouch = 3000,
  // The compositor family, whose layer menus list every layer parameter of a panel in one list,
  // so the input layer labels carry their input's number.
  kHostProductCompositor = 5100,
  kHostProductCompositorPro = 5200,
  kHostProductRenderNode = 5600,  // the compositor's command-line renderer
  kHostProductCompositorPreview = 6001,
};

// The host record's textureFormatMode: what the textures the plug-in asks for are modelled on.
// Any other mode gets a built-in RGBA format of no size.
enum WispTextureFormatMode : uint32_t {
  kTextureFormatLikeOutput = 0,  // the output texture's size, format and pixel type
  kTextureFormatLikeSecond = 2,  // those of the render context's second texture
};

// X11 keysyms of the keys the plug-in reacts to (key down and key up).
enum WispKey : uint32_t {
  kKeyLeftShift = 65505,  // held, a press inserts a cut
  kKeyEscape = 65307,     // drops the input selection
};
