#pragma once

#include "orv/detail/revision.h"
#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/sharedptr.h"
#include "orv/texture.h"
#include "orv/vector.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <new>
#include <type_traits>

namespace orv
{

class ShaderProgram;

namespace detail
{

template <class... Types>
struct TypeList
{
    static constexpr int COUNT = sizeof...(Types);

    /// Position of T in the list, COUNT when it is not there.
    template <class T>
    static constexpr int indexOf()
    {
        const bool matches[] = {std::is_same_v<T, Types>...};
        int index = 0;
        while (index < COUNT && !matches[index])
            ++index;
        return index;
    }
};

/// The value types that a uniform can have, in the order of the typed operations of ShaderUniformBase.
using UniformTypes =
    TypeList<bool, Vector2<bool>, Vector3<bool>, Vector4<bool>, unsigned char, Vector2<unsigned char>,
             Vector3<unsigned char>, Vector4<unsigned char>, int, Vector2<int>, Vector3<int>, Vector4<int>,
             float, Vector2<float>, Vector3<float>, Vector4<float>, Matrix2<float>, Matrix3<float>,
             Matrix4<float>, SharedPtr<Texture2D>, SharedPtr<TextureCube>>;

/// What a renderer works out for each draw, and sends without a look at the property that has it.
enum class DrawTransform : uint32_t
{
    NONE,
    MODEL,
    MODEL_VIEW,
    MODEL_VIEW_PROJECTION,
    OLD_MODEL_VIEW_PROJECTION,
    NORMAL_MODEL ///< a Matrix3f; the others are Matrix4f
};

inline constexpr int DRAW_TRANSFORM_COUNT = 6;

} // namespace detail

/// An array of values of one type that feeds shader uniforms: an appearance's property, a global property of a
/// render context, or a program's memory of what it sent last.
///
/// The class is closed: ShaderUniform<T> is its only implementation. GL thread only.
class ORV_API ShaderUniformBase : public Shared
{
public:
    ORV_CLASS_NAME("ShaderUniformBase")

    /// Takes over what differs in source and sends all own values to the current GL program when anything did,
    /// or when force is set. A null source changes nothing. A source of another type is ignored; of a shorter
    /// one (an assertion is logged) the values that it has are taken.
    ///
    /// This is the plain form, which calls GL without telling a render context beforehand; programs that are
    /// enabled through a context do not come through here.
    /// @param location     uniform location in the current program.
    /// @param textureUnit  first unit of a sampler; unused by other types.
    virtual void enable(const SharedPtr<ShaderUniformBase>& source, int location, int textureUnit,
                        bool force);

    /// One setter for each value type. @return false when the holder has another type, which is not logged, or
    /// index is not in [0, getSize()), which is; nothing changes then.
    virtual bool setValue(const bool&, int) { return false; }
    virtual bool setValue(const Vector2<bool>&, int) { return false; }
    virtual bool setValue(const Vector3<bool>&, int) { return false; }
    virtual bool setValue(const Vector4<bool>&, int) { return false; }
    virtual bool setValue(const unsigned char&, int) { return false; }
    virtual bool setValue(const Vector2<unsigned char>&, int) { return false; }
    virtual bool setValue(const Vector3<unsigned char>&, int) { return false; }
    virtual bool setValue(const Vector4<unsigned char>&, int) { return false; }
    virtual bool setValue(const int&, int) { return false; }
    virtual bool setValue(const Vector2<int>&, int) { return false; }
    virtual bool setValue(const Vector3<int>&, int) { return false; }
    virtual bool setValue(const Vector4<int>&, int) { return false; }
    virtual bool setValue(const float&, int) { return false; }
    virtual bool setValue(const Vector2<float>&, int) { return false; }
    virtual bool setValue(const Vector3<float>&, int) { return false; }
    virtual bool setValue(const Vector4<float>&, int) { return false; }
    virtual bool setValue(const Matrix2<float>&, int) { return false; }
    virtual bool setValue(const Matrix3<float>&, int) { return false; }
    virtual bool setValue(const Matrix4<float>&, int) { return false; }
    virtual bool setValue(const SharedPtr<Texture2D>&, int) { return false; }
    virtual bool setValue(const SharedPtr<TextureCube>&, int) { return false; }

    /// One getter for each value type. @return false, quietly and with the output untouched, when the holder
    /// has another type or index is not in [0, getSize()).
    virtual bool getValue(bool&, int) const { return false; }
    virtual bool getValue(Vector2<bool>&, int) const { return false; }
    virtual bool getValue(Vector3<bool>&, int) const { return false; }
    virtual bool getValue(Vector4<bool>&, int) const { return false; }
    virtual bool getValue(unsigned char&, int) const { return false; }
    virtual bool getValue(Vector2<unsigned char>&, int) const { return false; }
    virtual bool getValue(Vector3<unsigned char>&, int) const { return false; }
    virtual bool getValue(Vector4<unsigned char>&, int) const { return false; }
    virtual bool getValue(int&, int) const { return false; }
    virtual bool getValue(Vector2<int>&, int) const { return false; }
    virtual bool getValue(Vector3<int>&, int) const { return false; }
    virtual bool getValue(Vector4<int>&, int) const { return false; }
    virtual bool getValue(float&, int) const { return false; }
    virtual bool getValue(Vector2<float>&, int) const { return false; }
    virtual bool getValue(Vector3<float>&, int) const { return false; }
    virtual bool getValue(Vector4<float>&, int) const { return false; }
    virtual bool getValue(Matrix2<float>&, int) const { return false; }
    virtual bool getValue(Matrix3<float>&, int) const { return false; }
    virtual bool getValue(Matrix4<float>&, int) const { return false; }
    virtual bool getValue(SharedPtr<Texture2D>&, int) const { return false; }
    virtual bool getValue(SharedPtr<TextureCube>&, int) const { return false; }

    /// Count of values, at least 1.
    virtual int getSize() const { return m_size; }

    /// Changes whenever a value changes and is never the same for two holders.
    uint64_t getRevision() const { return m_revision; }

    /// The renderer's: which transform of the solids that it draws this property is to have.
    detail::DrawTransform getDrawTransform() const { return m_drawTransform; }
    void setDrawTransform(detail::DrawTransform transform) { m_drawTransform = transform; }

    /// Whether this is a ShaderUniform<T>; a static_cast is then safe.
    template <class T>
    bool holds() const
    {
        return m_type == detail::UniformTypes::indexOf<T>();
    }

protected:
    /// @param size  below 1 is an error and counts as 1.
    ShaderUniformBase(int type, int size);

    /// For those that copy: both have to be of one size.
    static void assertSize(const ShaderUniformBase* other, int size);

    void becomeSingle() { m_size = 1; } ///< For derived classes: one element from now on.
    /// For derived classes: marks the value as changed.
    void touch() { m_revision = detail::nextRevision(); }

    void* m_data = nullptr; ///< the values: the derived class's own one, or an array when there are more

private:
    friend class ShaderProgram;
    template <class T>
    friend class ShaderUniform;

    /// Takes over the source's values, without a new revision. @return whether any of the own ones changed.
    virtual bool takeOver(const ShaderUniformBase& source) = 0;

    /// Sends all own values to the current program.
    ORV_LOCAL void send(int location, int textureUnit) const;

    uint64_t m_revision = detail::nextRevision();
    int m_type;
    int m_size;
    detail::DrawTransform m_drawTransform = detail::DrawTransform::NONE;
};

/// The value holder for one of the 21 types of detail::UniformTypes. Values start zeroed (null for textures).
///
/// set() and get() are the short way for code that has the typed pointer; they take no virtual call.
///
/// All of it stands here, so that a program makes the few types that it uses itself and the library need not offer
/// every member of all 21.
template <class T>
class ShaderUniform final : public ShaderUniformBase
{
    static_assert(detail::UniformTypes::indexOf<T>() < detail::UniformTypes::COUNT,
                  "not a type of shader uniform");

public:
    using Ptr = SharedPtr<ShaderUniform<T>>;

    /// @param size  count of values; below 1 is an error and counts as 1.
    explicit ShaderUniform(int size) : ShaderUniformBase(detail::UniformTypes::indexOf<T>(), size)
    {
        m_data = &m_single;
        if (getSize() == 1)
            return;

        if (T* values = new (std::nothrow) T[std::size_t(getSize())]())
        {
            m_data = values;
            return;
        }
        ORV_LOG_ERROR("No memory for a uniform of %d values; setting to 1", getSize());
        becomeSingle();
    }

    ~ShaderUniform() override
    {
        if (m_data != &m_single)
            delete[] values();
    }

    using ShaderUniformBase::getValue;
    using ShaderUniformBase::setValue;

    /// Elements are counted from 0. @return false, and nothing is stored, beyond the size (logged when it is set).
    bool setValue(const T& value, int index) override
    {
        if (index < 0 || index >= getSize())
        {
            ORV_LOG_ERROR("Uniform value index (%d) out of range [0:%d).", index, getSize());
            return false;
        }
        set(value, index);
        return true;
    }

    /// See setValue().
    bool getValue(T& value, int index) const override
    {
        if (index < 0 || index >= getSize())
            return false;
        value = values()[index];
        return true;
    }

    /// @param index  in [0, getSize()); not checked.
    const T& get(int index = 0) const { return values()[index]; }

    /// Stores the value; an equal one (components compared with ==) changes nothing.
    /// @param index  in [0, getSize()); not checked.
    void set(const T& value, int index = 0)
    {
        if (values()[index] == value)
            return;
        values()[index] = value;
        touch();
    }

private:
    friend class ShaderProgram;

    bool takeOver(const ShaderUniformBase& source) override
    {
        if (!source.holds<T>() || source.m_size < m_size) [[unlikely]]
            assertSize(&source, m_size);
        if (!source.holds<T>())
            return false;
        bool changed = false;
        const T* from = static_cast<const ShaderUniform&>(source).values();
        for (T *to = values(), *const end = to + std::min(m_size, source.m_size); to != end; ++to, ++from)
        {
            if (*to == *from)
                continue;
            *to = *from;
            changed = true;
        }
        return changed;
    }

    T* values() { return static_cast<T*>(m_data); }
    const T* values() const { return static_cast<const T*>(m_data); }

    T m_single{};
};

} // namespace orv
