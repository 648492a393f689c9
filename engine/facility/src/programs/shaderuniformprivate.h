#pragma once

#include "orv/shaderuniform.h"

namespace orv::ShaderUniformPrivate
{

/// Tells the current program that its sampler reads the units from unit on, one for each array element. Units that
/// the GL does not have are left out (logged).
void setSamplerUnits(int location, int unit, int size);

/// Sends a number of values to the current program. There is one of these for each type of uniform.
/// @param textureUnit  the first of a sampler's.
void setUniform(int location, int textureUnit, int size, const Vector4<float>* values);
void setUniform(int location, int textureUnit, int size, const Matrix3<float>* values);
void setUniform(int location, int textureUnit, int size, const Matrix4<float>* values);

} // namespace orv::ShaderUniformPrivate

// Instantiated once, in shaderuniformtypes.cpp.
namespace orv
{

extern template class ShaderUniform<bool>;
extern template class ShaderUniform<Vector2<bool>>;
extern template class ShaderUniform<Vector3<bool>>;
extern template class ShaderUniform<Vector4<bool>>;
extern template class ShaderUniform<unsigned char>;
extern template class ShaderUniform<Vector2<unsigned char>>;
extern template class ShaderUniform<Vector3<unsigned char>>;
extern template class ShaderUniform<Vector4<unsigned char>>;
extern template class ShaderUniform<int>;
extern template class ShaderUniform<Vector2<int>>;
extern template class ShaderUniform<Vector3<int>>;
extern template class ShaderUniform<Vector4<int>>;
extern template class ShaderUniform<float>;
extern template class ShaderUniform<Vector2<float>>;
extern template class ShaderUniform<Vector3<float>>;
extern template class ShaderUniform<Vector4<float>>;
extern template class ShaderUniform<Matrix2<float>>;
extern template class ShaderUniform<Matrix3<float>>;
extern template class ShaderUniform<Matrix4<float>>;
extern template class ShaderUniform<SharedPtr<Texture2D>>;
extern template class ShaderUniform<SharedPtr<TextureCube>>;

} // namespace orv
