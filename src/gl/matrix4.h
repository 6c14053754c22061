// Product of 4 x 4 float matrices stored row by row, shared by the controls and the layer capture.
#pragma once

namespace veltrane {

// out = first x second, with out[4i + j] = sum over k of first[4i + k] x second[4k + j].
// `out` may be the same array as either factor.
void multiplyMatrix4(const float* first, float* out, const float* second);

}  // namespace veltrane
