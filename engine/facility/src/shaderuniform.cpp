#include "orv/shaderuniform.h"

#include "shaderuniformprivate.h"

#include "orv/detail/bindingepoch.h"
#include "orv/texture2d.h"
#include "orv/texturecube.h"

#include <GLES2/gl2.h>

#include <algorithm>
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

/// The integers 0, 1, 2, ..., one for each texture unit that the GL has.
const std::vector<GLint>& getUnits()
{
    static const std::vector<GLint> units = []
    {
        GLint count = 0;
        glGetIntegerv(GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS, &count);
        std::vector<GLint> numbers(std::size_t(std::max(count, 0)));
        std::iota(numbers.begin(), numbers.end(), 0);
        return numbers;
    }();
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
    send(location, size, ints);
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

template <class T>
ShaderUniform<T>::ShaderUniform(int size)
    : ShaderUniformBase(detail::UniformTypes::indexOf<T>())
    , m_size(size)
    , m_values(&m_single)
{
    if (m_size < 1)
    {
        ORV_LOG_ERROR("Uniform size must be greater than zero; setting to 1");
        m_size = 1;
    }
    if (m_size == 1)
        return;

    if (T* values = new (std::nothrow) T[std::size_t(m_size)]())
    {
        m_values = values;
        return;
    }
    ORV_LOG_ERROR("No memory for a uniform of %d values; setting to 1", m_size);
    m_size = 1;
}

template <class T>
ShaderUniform<T>::~ShaderUniform()
{
    if (m_values != &m_single)
        delete[] m_values;
}

template <class T>
void ShaderUniform<T>::enable(const SharedPtr<ShaderUniformBase>& source, int location, int textureUnit,
                              bool force)
{
    const bool changed = source && copyFrom(*source);
    if (changed || force)
        send(location, textureUnit);
}

template <class T>
bool ShaderUniform<T>::setValue(const T& value, int index)
{
    if (index < 0 || index >= m_size)
    {
        ORV_LOG_ERROR("Uniform value index (%d) out of range [0:%d).", index, m_size);
        return false;
    }
    set(value, index);
    return true;
}

template <class T>
bool ShaderUniform<T>::getValue(T& value, int index) const
{
    if (index < 0 || index >= m_size)
        return false;
    value = m_values[index];
    return true;
}

template <class T>
bool ShaderUniform<T>::copyFrom(const ShaderUniformBase& source)
{
    const ShaderUniformBase* other = &source;
    const int size = m_size;
    ORV_ASSERT(other->getSize() >= size);
    if (!other->holds<T>())
        return false;

    const ShaderUniform& typed = static_cast<const ShaderUniform&>(source);
    const int count = std::min(size, typed.m_size);
    bool changed = false;
    for (int i = 0; i < count; ++i)
    {
        if (m_values[i] == typed.m_values[i])
            continue;
        m_values[i] = typed.m_values[i];
        changed = true;
    }
    if (changed)
        touch();
    return changed;
}

template <class T>
void ShaderUniform<T>::send(int location, int textureUnit) const
{
    ShaderUniformPrivate::setUniform(location, textureUnit, m_size, m_values);
}

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
