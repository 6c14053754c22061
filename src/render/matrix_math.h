// Column-major 4 x 4 matrices as the host hands them (translation in elements 12 to 14), with
// the few operations layer alignment needs.
#pragma once

#include <array>

namespace veltrane {

using Matrix4 = std::array<float, 16>;

Matrix4 identityMatrix4();
Matrix4 translationMatrix4(float x, float y, float z);
// a x b: b is applied first.
Matrix4 multiplyColumnMajor(const Matrix4& a, const Matrix4& b);
// The full inverse by cofactors; the identity when the determinant is exactly 0, so a
// degenerate placement leaves a layer where it is rather than producing NaNs.
Matrix4 inverseMatrix4(const Matrix4& m);
// The upper-left 3 x 3 part applied to a vector.
std::array<float, 3> applyLinear3(const Matrix4& m, const std::array<float, 3>& v);
std::array<float, 4> applyMatrix4(const Matrix4& m, const std::array<float, 4>& v);
void clearTranslation(Matrix4& m);

}  // namespace veltrane
