// Reading a stream's colour description from its decoder, and the refusal of HDR and wide gamut.
#include "refhost/media/stream_colour.h"

extern "C" {
#include <libavutil/pixdesc.h>
#include <libswscale/swscale.h>
}

namespace refhost {

// The host numbers colour descriptions as FFmpeg does, by H.273.
constexpr bool sameNumber(int32_t ours, int theirs) { return ours == theirs; }
static_assert(sameNumber(ColourDescription::kMatrixRgb, AVCOL_SPC_RGB) &&
              sameNumber(ColourDescription::kMatrixFcc, AVCOL_SPC_FCC) &&
              sameNumber(ColourDescription::kMatrixSmpte240m, AVCOL_SPC_SMPTE240M) &&
              sameNumber(ColourDescription::kMatrixBt2020Constant, AVCOL_SPC_BT2020_CL) &&
              sameNumber(ColourDescription::kPrimariesBt2020, AVCOL_PRI_BT2020) &&
              sameNumber(ColourDescription::kTransferSrgb, AVCOL_TRC_IEC61966_2_1) &&
              sameNumber(ColourDescription::kTransferPq, AVCOL_TRC_SMPTE2084) &&
              sameNumber(ColourDescription::kTransferHlg, AVCOL_TRC_ARIB_STD_B67));

AVPixelFormat withoutJpegRange(AVPixelFormat format) {
  switch (format) {
    case AV_PIX_FMT_YUVJ420P:
      return AV_PIX_FMT_YUV420P;
    case AV_PIX_FMT_YUVJ422P:
      return AV_PIX_FMT_YUV422P;
    case AV_PIX_FMT_YUVJ444P:
      return AV_PIX_FMT_YUV444P;
    case AV_PIX_FMT_YUVJ440P:
      return AV_PIX_FMT_YUV440P;
    case AV_PIX_FMT_YUVJ411P:
      return AV_PIX_FMT_YUV411P;
    default:
      return format;
  }
}

bool isRgb(AVPixelFormat format) {
  const AVPixFmtDescriptor* descriptor = av_pix_fmt_desc_get(format);
  return descriptor && (descriptor->flags & AV_PIX_FMT_FLAG_RGB);
}

ColourDescription colourOf(const AVCodecContext* codec) {
  const AVPixelFormat format = codec->pix_fmt;
  ColourDescription colour =
      isRgb(format) ? ColourDescription::bt709() : ColourDescription::guessedFor(codec->height);
  if (codec->colorspace != AVCOL_SPC_UNSPECIFIED && codec->colorspace != AVCOL_SPC_RESERVED)
    colour.matrix = codec->colorspace;
  if (codec->color_primaries != AVCOL_PRI_UNSPECIFIED &&
      codec->color_primaries != AVCOL_PRI_RESERVED && codec->color_primaries != AVCOL_PRI_RESERVED0)
    colour.primaries = codec->color_primaries;
  if (codec->color_trc != AVCOL_TRC_UNSPECIFIED && codec->color_trc != AVCOL_TRC_RESERVED &&
      codec->color_trc != AVCOL_TRC_RESERVED0)
    colour.transfer = codec->color_trc;
  colour.fullRange = codec->color_range == AVCOL_RANGE_JPEG || withoutJpegRange(format) != format;
  if (isRgb(format)) {
    colour.matrix = ColourDescription::kMatrixRgb;
    colour.fullRange = true;
  }
  return colour;
}

int scalerMatrix(int32_t matrix) {
  switch (matrix) {
    case ColourDescription::kMatrixBt709:
      return SWS_CS_ITU709;
    case ColourDescription::kMatrixFcc:
      return SWS_CS_FCC;
    case ColourDescription::kMatrixSmpte240m:
      return SWS_CS_SMPTE240M;
    case ColourDescription::kMatrixBt2020:
    case ColourDescription::kMatrixBt2020Constant:
      return SWS_CS_BT2020;
    default:
      return SWS_CS_ITU601;
  }
}

std::string colourRefusal(const ColourDescription& colour) {
  if (!colour.isHdr() && !colour.isWideGamut()) return "";
  std::string carried;
  auto add = [&](const std::string& what) { carried += (carried.empty() ? "" : ", ") + what; };
  if (colour.isHdr()) add("transfer " + transferName(colour.transfer));
  if (colour.primaries == ColourDescription::kPrimariesBt2020)
    add("primaries " + primariesName(colour.primaries));
  if (colour.matrix == ColourDescription::kMatrixBt2020 ||
      colour.matrix == ColourDescription::kMatrixBt2020Constant)
    add("matrix " + matrixName(colour.matrix));
  return (colour.isHdr() ? "HDR video (" : "wide-gamut video (") + carried +
         ") is not shown by this host: it renders in SDR BT.709/BT.601; convert it first (for "
         "example with ffmpeg's zscale" +
         (colour.isHdr() ? " and tonemap filters)" : " filter)");
}

}  // namespace refhost
