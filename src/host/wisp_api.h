// The host interface: the record of operations and data a host hands the plug-in with every
// message, and the fixed-layout records the two sides exchange. The numbers that travel in
// them are named in wisp_protocol.h.
#pragma once

#include <cstddef>
#include <cstdint>

#include "host/wisp_protocol.h"

extern "C" {

// Opaque host handle, passed back as the first argument of every host operation.
typedef struct WispHost WispHost;

// A GL texture together with the sub-rectangle of it that holds the image. The host may hand
// out textures larger than their image, so every sampler scales its coordinates by (s1, t1).
struct TextureRecord {
  uint32_t id;
  uint32_t pixelType;  // GL data type carried with the texture
  uint32_t format;     // GL internal format
  int32_t allocatedWidth;
  int32_t allocatedHeight;
  int32_t imageWidth;
  int32_t imageHeight;
  float s0;
  float t0;
  float s1;
  float t1;
  float scaleX;  // carried unchanged
  float scaleY;
};

// The host's description of a layer at one time. Only the named offsets are the plug-in's
// business; the bytes between them are the host's.
struct LayerState {
  uint8_t hostReserved0[0x28];
  uint32_t type;       // 0x28, WispLayerType
  int32_t firstFrame;  // 0x2C
  uint8_t hostReserved1[4];
  int32_t frameCount;  // 0x34
  uint8_t hostReserved2[4];
  int32_t is3D;  // 0x3C
  uint8_t hostReserved3[0x6C - 0x40];
  int32_t width;           // 0x6C
  int32_t height;          // 0x70
  float placement[16];     // 0x74, column-major
  float secondMatrix[16];  // 0xB4
};
static_assert(offsetof(LayerState, type) == 0x28, "layer type offset");
static_assert(offsetof(LayerState, firstFrame) == 0x2C, "first frame offset");
static_assert(offsetof(LayerState, frameCount) == 0x34, "frame count offset");
static_assert(offsetof(LayerState, is3D) == 0x3C, "3D flag offset");
static_assert(offsetof(LayerState, width) == 0x6C, "width offset");
static_assert(offsetof(LayerState, height) == 0x70, "height offset");
static_assert(offsetof(LayerState, placement) == 0x74, "placement offset");
static_assert(offsetof(LayerState, secondMatrix) == 0xB4, "second matrix offset");

// Composition timing from GetTimeInfo.
struct WispTimeInfo {
  int32_t width;
  int32_t height;
  double frameRate;
};

// The camera of the viewer a layer is seen through: the lens matrix, the view matrix and the
// current time in milliseconds.
struct WispViewRecord {
  float lens[16];
  float view[16];
  int32_t timeMs;
};

// renderContext for the render and request-frames messages.
struct WispRenderContext {
  TextureRecord source;
  TextureRecord output;
  TextureRecord second;
  int32_t width;
  int32_t height;
  int32_t time;  // the time value passed to every parameter read
  uint32_t frameNumber;
  int32_t sourceFrameIndex;
  int32_t sourceFrameCount;
  float pixelAspect;
  uint8_t hasPixelAspect;
  float projection[16];
  float modelView[16];
  const char* ownLayerGuid;  // may be null or empty
  float layerSpaceMatrix[16];
  uint8_t hasLayerSpaceMatrix;
  WispViewRecord view;
  int32_t currentTimeMs;
  int32_t layerTimeMs;  // time at which the own layer's state is asked
};

// renderContext for the viewer messages: draw overlay and the three pointer messages.
struct WispViewerContext {
  const char* name;  // null or empty for the main viewer
  int32_t width;
  int32_t height;
  double viewScaleX;
  double viewScaleY;
  double uiScale;
  int32_t time;
  float projection[16];
};

// renderContext for pick layer: the own layer's GUID text comes first.
struct WispLayerPickerContext {
  const char* ownLayerGuid;
};

// event for parameter changed and the two parameter edit messages.
struct WispParamEvent {
  const char* id;
};

// event for the pointer messages: corner-space pointer position and button (> 0.5 held).
struct WispPointerEvent {
  int32_t x;
  int32_t y;
  double button;
};

// event for key down and key up (X11 keysym numbering, WispKey).
struct WispKeyEvent {
  uint32_t keyCode;
};

struct tagWispAPI {
  void* pluginData;
  void* instanceData;
  void* event;
  void* renderContext;
  uint8_t verbose;
  uint32_t textureFormatMode;

  const wchar_t* (*GetHostIdentifier)(WispHost* host);
  int32_t (*GetHostId)(WispHost* host);

  // Declaration, in slot order.
  int32_t (*BeginParamGroup)(WispHost* host, const wchar_t* displayName);
  int32_t (*EndParamGroup)(WispHost* host);
  int32_t (*AddFloatParam)(WispHost* host, const wchar_t* displayName, const wchar_t* unit,
                           const char* id, int32_t flags, float minimum, float maximum,
                           float defaultValue, int32_t precision);
  int32_t (*AddIntParam)(WispHost* host, const wchar_t* displayName, const wchar_t* unit,
                         const char* id, int32_t flags, int32_t minimum, int32_t maximum,
                         int32_t defaultValue);
  int32_t (*AddBoolParam)(WispHost* host, const wchar_t* displayName, const char* id, int32_t flags,
                          uint8_t defaultValue);
  int32_t (*AddChoiceParam)(WispHost* host, const wchar_t* displayName, const char* id,
                            int32_t flags, const wchar_t* choices, const int32_t* defaultIndex,
                            int32_t reserved);
  int32_t (*AddPointParam)(WispHost* host, const wchar_t* displayName, const char* id,
                           int32_t flags, float defaultX, float defaultY);
  int32_t (*AddAngleParam)(WispHost* host, const wchar_t* displayName, const char* id,
                           int32_t flags, uint8_t extra, float defaultDegrees);
  int32_t (*AddColorParam)(WispHost* host, const wchar_t* displayName, const char* id,
                           int32_t flags, float red, float green, float blue);
  int32_t (*AddLayerParam)(WispHost* host, const wchar_t* displayName, const char* id,
                           int32_t flags);

  void (*SetParamEnabled)(WispHost* host, const char* id, const uint8_t* enabled);

  // Parameter reads at a time value.
  int32_t (*GetIntParam)(WispHost* host, const char* id, int32_t time);
  float (*GetFloatParam)(WispHost* host, const char* id, int32_t time);
  uint8_t (*GetBoolParam)(WispHost* host, const char* id, int32_t time);
  int32_t (*GetChoiceParam)(WispHost* host, const char* id, int32_t time);
  float (*GetAngleParam)(WispHost* host, const char* id, int32_t time);  // degrees
  void (*GetPointParam)(WispHost* host, const char* id, int32_t time, float* x, float* y);
  void (*GetColorParam)(WispHost* host, const char* id, int32_t time, float* red, float* green,
                        float* blue);
  // Writes the GUID text (36 characters and a terminator) into a buffer of at least 37 chars.
  void (*GetLayerParam)(WispHost* host, const char* id, int32_t time, char* guidBuffer);

  // Parameter writes; the last argument is always 0.
  void (*SetIntParam)(WispHost* host, const char* id, int32_t time, int32_t value,
                      int32_t reserved);
  void (*SetFloatParam)(WispHost* host, const char* id, int32_t time, float value,
                        int32_t reserved);
  void (*SetPointParam)(WispHost* host, const char* id, int32_t time, const float* x,
                        const float* y, int32_t reserved);
  void (*SetAngleParam)(WispHost* host, const char* id, int32_t time, float degrees,
                        int32_t reserved);
  void (*SetLayerParam)(WispHost* host, const char* id, int32_t time, const char* guid,
                        int32_t reserved);

  void (*BeginUndo)(WispHost* host, const char* stepName);
  void (*EndUndo)(WispHost* host);
  void (*Redraw)(WispHost* host, int32_t reserved);
  void (*SetCursor)(WispHost* host, int32_t shape);
  int32_t (*ShowPopupMenu)(WispHost* host, const char* items);

  int32_t (*GetLayerCount)(WispHost* host);
  void (*GetLayerInfo)(WispHost* host, int32_t index, char* guidBuffer, char* nameBuffer,
                       int32_t nameSize, int32_t* kind);

  void (*RequestFrames)(WispHost* host, int32_t count, const uint32_t* frames);
  void (*RequestLayerFrames)(WispHost* host, const char* guid, int32_t count,
                             const uint32_t* frames);

  // Textures: returns the GL name and writes the allocated size.
  uint32_t (*AllocateTexture)(WispHost* host, void* renderContext, int32_t width, int32_t height,
                              uint32_t internalFormat, uint32_t pixelFormat, uint32_t pixelType,
                              const void* data, int32_t* allocatedWidth, int32_t* allocatedHeight);
  void (*ReleaseTexture)(WispHost* host, void* renderContext, uint32_t id);
  int32_t (*GetSourceFrame)(WispHost* host, void* renderContext, int32_t frameIndex,
                            TextureRecord* out);
  int32_t (*RenderLayerFrame)(WispHost* host, void* renderContext, const char* guid, int32_t frame,
                              TextureRecord* out);
  int32_t (*QueryLayerState)(WispHost* host, const char* guid, int32_t timeMs, LayerState* out);
  int32_t (*GetTimeInfo)(WispHost* host, WispTimeInfo* out);

  // Vertex arrays and buffers: GL names owned by the host.
  uint32_t (*CreateVertexArray)(WispHost* host);
  uint32_t (*AcquireBuffer)(WispHost* host, uint32_t target, int64_t size, const void* data,
                            uint32_t usage, uint32_t* hostOutput);
  void (*ReleaseBuffer)(WispHost* host, uint32_t id);
};

// The registration record PluginInfo fills. Host-owned, text buffers included.
struct PluginRegistration {
  uint32_t kind;
  uint8_t guid[16];
  uint8_t unused0[4];
  wchar_t* name;      // room for 512 characters
  wchar_t* category;  // 300
  wchar_t* vendor;    // 100
  wchar_t* notice;    // 400
  uint32_t version[4];
  uint32_t capabilityFlags;
  uint8_t unused1[12];
  uint32_t interfaceWord;
  uint32_t interfaceRevision;
  uint8_t unused2[8];
  char* identifier;  // narrow, room for 100 characters
};

// A browser page links the module in, built in one go with its host: the record never crosses
// between separately built binaries there, and WebAssembly's pointers are 4 bytes.
#ifndef __EMSCRIPTEN__
static_assert(sizeof(void*) == 8, "the registration layout is defined for 64-bit hosts");
static_assert(offsetof(PluginRegistration, kind) == 0, "kind offset");
static_assert(offsetof(PluginRegistration, guid) == 4, "guid offset");
static_assert(offsetof(PluginRegistration, name) == 24, "name offset");
static_assert(offsetof(PluginRegistration, category) == 32, "category offset");
static_assert(offsetof(PluginRegistration, vendor) == 40, "vendor offset");
static_assert(offsetof(PluginRegistration, notice) == 48, "notice offset");
static_assert(offsetof(PluginRegistration, version) == 56, "version offset");
static_assert(offsetof(PluginRegistration, capabilityFlags) == 72, "flags offset");
static_assert(offsetof(PluginRegistration, interfaceWord) == 88, "interface word offset");
static_assert(offsetof(PluginRegistration, interfaceRevision) == 92, "revision offset");
static_assert(offsetof(PluginRegistration, identifier) == 104, "identifier offset");
static_assert(sizeof(PluginRegistration) == 112, "registration record size");
#endif

// Buffer sizes of the registration record, in characters.
enum : std::size_t {
  kRegistrationNameChars = 512,
  kRegistrationCategoryChars = 300,
  kRegistrationVendorChars = 100,
  kRegistrationNoticeChars = 400,
  kRegistrationIdentifierChars = 100,
};

typedef void (*PluginInfoFunction)(void* unused0, void* unused1, PluginRegistration* record);
typedef int32_t (*NotifyFunction)(WispHost* host, tagWispAPI* api, int32_t message);

}  // extern "C"
