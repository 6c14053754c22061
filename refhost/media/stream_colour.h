// The colour description of a video stream as its decoder reports it, with the guesses players
// make for what is not tagged; whether the host can show it; and what the pixel formats
// themselves say about colour (RGB, or the "J" formats' full range).
#pragma once

extern "C" {
#include <libavcodec/avcodec.h>
}

#include <string>

#include "refhost/media/colour.h"

namespace refhost {

// What the stream's pictures are, as tagged, with the usual guesses for what is not: the
// height's matrix, primaries and transfer, and limited range. RGB pictures have no matrix and
// use every code value, whatever a tag says.
ColourDescription colourOf(const AVCodecContext* codec);

// The one line that refuses a stream the host would show with wrong colours: it renders SDR
// BT.709/BT.601 and has no tone or gamut mapping. Empty for a stream it shows.
std::string colourRefusal(const ColourDescription& colour);

// The scaler's table (SWS_CS_*) for a matrix; those it has no table for (YCgCo) get its
// default, BT.601.
int scalerMatrix(int32_t matrix);

// The plain twin of each JPEG-style pixel format, whose name alone says "full range": the
// scaler is told the range explicitly instead.
AVPixelFormat withoutJpegRange(AVPixelFormat format);

bool isRgb(AVPixelFormat format);

}  // namespace refhost
