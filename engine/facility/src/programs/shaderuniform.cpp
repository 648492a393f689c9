#include "orv/shaderuniform.h"

#include "gl/countedgl.h"
#include "shaderuniformprivate.h"

#include "orv/detail/bindingepoch.h"
#include "orv/texture2d.h"
#include "orv/texturecube.h"

#include <algorithm>
#include <array>
#include <memory>
#include <new>
#include <numeric>
#include <vector>

namespace orv
{

namespace ShaderUniformPrivate
{

namespace
{

// The vectors and matrices go to GL as they lie in memory.
static_assert(sizeof(Vector2<bool>) == 2 && sizeof(Vector3<bool>) == 3 && sizeof(Vector4<bool>) == 4);
static_assert(sizeof(Vector2<int>) == 8 && sizeof(Vector3<int>) == 12 && sizeof(Vector4<int>) == 16);
static_assert(sizeof(Vector2<float>) == 8 && sizeof(Vector3<float>) == 12 && sizeof(Vector4<float>) == 16);
static_assert(sizeof(Matrix2<float>) == 16 && sizeof(Matrix3<float>) == 36 && sizeof(Matrix4<float>) == 64);

/// The integers 0, 1, 2, ..., one for each texture unit. Asks GL again if it did not answer.
const std::vector<GLint>& getUnits()
{
    static std::vector<GLint>& units =
        *new std::vector<GLint>(); // never destroyed: programs may draw until they end
    if (units.empty())
    {
        GLint count = 0;
        glGetIntegerv(GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS, &count);
        units.resize(std::size_t(std::max(count, 0)));
        std::iota(units.begin(), units.end(), 0);
    }
    return units;
}

using SendInts = void (*)(GLint location, GLsizei count, const GLint* values);

/// Sends bytes or booleans as the ints that GL takes for them.
template <class Component>
void sendAsInts(SendInts send, int location, int size, int components, const Component* values)
{
    const int count = size * components;
    GLint block[64] = {};
    std::vector<GLint> large; // an array of more than 16 four-vectors is rare
    GLint* ints = block;
    if (count > int(std::size(block)))
    {
        large.resize(std::size_t(count));
        ints = large.data();
    }
    std::copy(values, values + count, ints);
    ORV_GL(UNIFORM, send(location, size, ints));
}

template <class TextureType>
void sendTextures(int location, int unit, int size, const SharedPtr<TextureType>& first)
{
    for (int i = 0; i < size; ++i)
    {
        glActiveTexture(GLenum(GL_TEXTURE0 + unit + i));
        if (first)
            first->enable(); // on every unit of the array: elements other than the first are never bound
    }
    setSamplerUnits(location, unit, size);
    detail::bindingsChanged();
}

} // namespace

void setSamplerUnits(int location, int unit, int size)
{
    const std::vector<GLint>& units = getUnits();
    if (unit < 0 || std::size_t(unit) + std::size_t(size) > units.size())
    {
        ORV_LOG_ERROR("Sampler needs texture units %d to %d; there are %d.", unit, unit + size - 1,
                      int(units.size()));
        return;
    }
    glUniform1iv(location, size, units.data() + unit);
}

void setUniform(int location, int, int size, const bool* values)
{
    sendAsInts(glUniform1iv, location, size, 1, values);
}

void setUniform(int location, int, int size, const Vector2<bool>* values)
{
    sendAsInts(glUniform2iv, location, size, 2, &values->x);
}

void setUniform(int location, int, int size, const Vector3<bool>* values)
{
    sendAsInts(glUniform3iv, location, size, 3, &values->x);
}

void setUniform(int location, int, int size, const Vector4<bool>* values)
{
    sendAsInts(glUniform4iv, location, size, 4, &values->x);
}

void setUniform(int location, int, int size, const unsigned char* values)
{
    sendAsInts(glUniform1iv, location, size, 1, values);
}

void setUniform(int location, int, int size, const Vector2<unsigned char>* values)
{
    sendAsInts(glUniform2iv, location, size, 2, &values->x);
}

void setUniform(int location, int, int size, const Vector3<unsigned char>* values)
{
    sendAsInts(glUniform3iv, location, size, 3, &values->x);
}

void setUniform(int location, int, int size, const Vector4<unsigned char>* values)
{
    sendAsInts(glUniform4iv, location, size, 4, &values->x);
}

void setUniform(int location, int, int size, const int* values)
{
    glUniform1iv(location, size, values);
}

void setUniform(int location, int, int size, const Vector2<int>* values)
{
    glUniform2iv(location, size, &values->x);
}

void setUniform(int location, int, int size, const Vector3<int>* values)
{
    glUniform3iv(location, size, &values->x);
}

void setUniform(int location, int, int size, const Vector4<int>* values)
{
    glUniform4iv(location, size, &values->x);
}

void setUniform(int location, int, int size, const float* values)
{
    glUniform1fv(location, size, values);
}

void setUniform(int location, int, int size, const Vector2<float>* values)
{
    glUniform2fv(location, size, &values->x);
}

void setUniform(int location, int, int size, const Vector3<float>* values)
{
    glUniform3fv(location, size, &values->x);
}

void setUniform(int location, int, int size, const Vector4<float>* values)
{
    glUniform4fv(location, size, &values->x);
}

void setUniform(int location, int, int size, const Matrix2<float>* values)
{
    glUniformMatrix2fv(location, size, GL_FALSE, values->data());
}

void setUniform(int location, int, int size, const Matrix3<float>* values)
{
    glUniformMatrix3fv(location, size, GL_FALSE, values->data());
}

void setUniform(int location, int, int size, const Matrix4<float>* values)
{
    glUniformMatrix4fv(location, size, GL_FALSE, values->data());
}

void setUniform(int location, int unit, int size, const SharedPtr<Texture2D>* values)
{
    sendTextures(location, unit, size, *values);
}

void setUniform(int location, int unit, int size, const SharedPtr<TextureCube>* values)
{
    sendTextures(location, unit, size, *values);
}

} // namespace ShaderUniformPrivate

namespace
{

using SendValues = void (*)(int location, int unit, int size, const void* values);

template <class T>
void sendAs(int location, int unit, int size, const void* values)
{
    ShaderUniformPrivate::setUniform(location, unit, size, static_cast<const T*>(values));
}

/// One for each type of uniform, in their order.
template <class... Types>
constexpr std::array<SendValues, sizeof...(Types)> makeSenders(detail::TypeList<Types...>)
{
    return {sendAs<Types>...};
}

constexpr auto SENDERS = makeSenders(detail::UniformTypes());

} // namespace

ShaderUniformBase::ShaderUniformBase(int type, int size) : m_type(type), m_size(size)
{
    if (m_size < 1)
    {
        ORV_LOG_ERROR("Uniform size must be greater than zero; setting to 1");
        m_size = 1;
    }
}

void ShaderUniformBase::assertSize(const ShaderUniformBase* other, int size)
{
    ORV_ASSERT(other->getSize() >= size);
}

void ShaderUniformBase::send(int location, int textureUnit) const
{
    SENDERS[std::size_t(m_type)](location, textureUnit, m_size, m_data);
}

void ShaderUniformBase::enable(const SharedPtr<ShaderUniformBase>& source, int location, int textureUnit,
                               bool force)
{
    const bool changed = source && takeOver(*source);
    if (changed || force)
        send(location, textureUnit);
    if (changed)
        touch();
}

} // namespace orv
