// Row-major 4 x 4 matrix product.
#include "gl/matrix4.h"

namespace veltrane {

void multiplyMatrix4(const float* first, float* out, const float* second) {
  float product[16];
  for (int i = 0; i < 4; ++i) {
    for (int j = 0; j < 4; ++j) {
      float sum = 0.0f;
      for (int k = 0; k < 4; ++k) sum += first[4 * i + k] * second[4 * k + j];
      product[4 * i + j] = sum;
    }
  }
  for (int n = 0; n < 16; ++n) out[n] = product[n];
}

}  // namespace veltrane
