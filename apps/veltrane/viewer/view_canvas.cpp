// Canvas texture, picture copy and presentation through framebuffer blits.
#include "viewer/view_canvas.h"

#include <GL/glew.h>

#include <cmath>

namespace veltrane_viewer {
namespace {

// The background around the picture: a neutral dark grey that no test pattern uses.
constexpr float kBackground[4] = {0.16f, 0.16f, 0.17f, 1.0f};

GLint whole(double value) { return static_cast<GLint>(std::lround(value)); }

}  // namespace

ViewCanvas::ViewCanvas() {
  glGenFramebuffers(1, &canvasFramebuffer_);
  glGenFramebuffers(1, &pictureFramebuffer_);
}

ViewCanvas::~ViewCanvas() {
  glDeleteFramebuffers(1, &canvasFramebuffer_);
  glDeleteFramebuffers(1, &pictureFramebuffer_);
  if (texture_) glDeleteTextures(1, &texture_);
}

void ViewCanvas::resize(int32_t width, int32_t height) {
  if (width == width_ && height == height_ && texture_) return;
  width_ = width > 0 ? width : 1;
  height_ = height > 0 ? height : 1;
  if (texture_) glDeleteTextures(1, &texture_);
  glGenTextures(1, &texture_);
  glBindTexture(GL_TEXTURE_2D, texture_);
  glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, width_, height_, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
  glBindTexture(GL_TEXTURE_2D, 0);
  glBindFramebuffer(GL_FRAMEBUFFER, canvasFramebuffer_);
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, texture_, 0);
  glBindFramebuffer(GL_FRAMEBUFFER, 0);
}

void ViewCanvas::showPicture(uint32_t picture, int32_t frameWidth, int32_t frameHeight,
                             const PixelRect& where) {
  glDisable(GL_SCISSOR_TEST);
  glBindFramebuffer(GL_DRAW_FRAMEBUFFER, canvasFramebuffer_);
  glViewport(0, 0, width_, height_);
  glClearBufferfv(GL_COLOR, 0, kBackground);
  if (picture == 0) return;
  glBindFramebuffer(GL_READ_FRAMEBUFFER, pictureFramebuffer_);
  glFramebufferTexture2D(GL_READ_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, picture, 0);
  // Rows count from the bottom in GL: the frame's bottom edge lies at height - (y + h).
  GLint left = whole(where.x);
  GLint right = whole(where.x + where.width);
  GLint bottom = whole(height_ - (where.y + where.height));
  GLint top = whole(height_ - where.y);
  bool magnified = where.width >= frameWidth;
  glBlitFramebuffer(0, 0, frameWidth, frameHeight, left, bottom, right, top, GL_COLOR_BUFFER_BIT,
                    magnified ? GL_NEAREST : GL_LINEAR);
  glFramebufferTexture2D(GL_READ_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, 0, 0);
  glBindFramebuffer(GL_READ_FRAMEBUFFER, 0);
}

void ViewCanvas::clearOutside(const PixelRect& area) {
  glBindFramebuffer(GL_DRAW_FRAMEBUFFER, canvasFramebuffer_);
  glViewport(0, 0, width_, height_);
  glEnable(GL_SCISSOR_TEST);
  // The bands left, right, above and below the area, in GL's rows from the bottom.
  const GLint left = whole(area.x), right = whole(area.x + area.width);
  const GLint bottom = whole(height_ - (area.y + area.height)), top = whole(height_ - area.y);
  const GLint bands[4][4] = {{0, 0, left, height_},
                             {right, 0, width_ - right, height_},
                             {left, top, right - left, height_ - top},
                             {left, 0, right - left, bottom}};
  for (const GLint* band : bands) {
    if (band[2] <= 0 || band[3] <= 0) continue;
    glScissor(band[0], band[1], band[2], band[3]);
    glClearBufferfv(GL_COLOR, 0, kBackground);
  }
  glDisable(GL_SCISSOR_TEST);
  glBindFramebuffer(GL_FRAMEBUFFER, 0);
}

void ViewCanvas::present() {
  glDisable(GL_SCISSOR_TEST);
  glBindFramebuffer(GL_READ_FRAMEBUFFER, canvasFramebuffer_);
  glBindFramebuffer(GL_DRAW_FRAMEBUFFER, 0);
  glBlitFramebuffer(0, 0, width_, height_, 0, 0, width_, height_, GL_COLOR_BUFFER_BIT, GL_NEAREST);
  glBindFramebuffer(GL_FRAMEBUFFER, 0);
}

}  // namespace veltrane_viewer
