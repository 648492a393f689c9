#include "shaderuniformprivate.h"

#include "orv/texture2d.h"
#include "orv/texturecube.h"

namespace orv
{

template class ShaderUniform<bool>;
template class ShaderUniform<Vector2<bool>>;
template class ShaderUniform<Vector3<bool>>;
template class ShaderUniform<Vector4<bool>>;
template class ShaderUniform<unsigned char>;
template class ShaderUniform<Vector2<unsigned char>>;
template class ShaderUniform<Vector3<unsigned char>>;
template class ShaderUniform<Vector4<unsigned char>>;
template class ShaderUniform<int>;
template class ShaderUniform<Vector2<int>>;
template class ShaderUniform<Vector3<int>>;
template class ShaderUniform<Vector4<int>>;
template class ShaderUniform<float>;
template class ShaderUniform<Vector2<float>>;
template class ShaderUniform<Vector3<float>>;
template class ShaderUniform<Vector4<float>>;
template class ShaderUniform<Matrix2<float>>;
template class ShaderUniform<Matrix3<float>>;
template class ShaderUniform<Matrix4<float>>;
template class ShaderUniform<SharedPtr<Texture2D>>;
template class ShaderUniform<SharedPtr<TextureCube>>;

} // namespace orv
