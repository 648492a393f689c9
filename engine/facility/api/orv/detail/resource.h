#pragma once

#include "orv/sharedptr.h"

#include <cstdint>
#include <list>

namespace orv::detail
{

/// Something that lives in the GL context and dies with it.
class Resource : public Shared
{
public:
    ORV_CLASS_NAME("Resource")

    enum class State : int32_t
    {
        UNALLOCATED = 0, ///< No GL object yet; the only state that allocate() starts from.
        ALLOCATED = 1,   ///< Holds a live GL object.
        DEALLOCATED = 2, ///< The GL object was deleted.
        RELEASED = 3     ///< Allocation failed, or the context was lost; never allocated again.
    };

    using enum State;

    ~Resource() override;

    /// Deletes the GL object. @return false if there is none.
    virtual bool deallocate() = 0;

    /// Forgets the GL object without a GL call, as after a lost context. @return false after deallocate().
    virtual bool release() = 0;

    virtual State getState() const = 0;
};

/// Owner of one GL object name.
///
/// The destructor makes no GL call: an object that is still ALLOCATED then is leaked, and logged as an assertion.
/// ResourceCache::flush() deletes in time. Threads: all but the reference count belongs to the GL thread.
class GlResource : public Resource
{
public:
    GlResource() = default;

    /// Takes over a GL object that exists already.
    explicit GlResource(unsigned int name);

    ~GlResource() override;

    /// @return false if GL gave no object (the state is RELEASED then), or with an error if it was called before.
    bool allocate();

    bool deallocate() override;
    bool release() override;
    State getState() const override { return m_state; }

    /// The GL object name, 0 unless ALLOCATED.
    unsigned int getId() const { return m_name; }

protected:
    virtual unsigned int doAllocate() = 0;
    virtual void doDeallocate(unsigned int name) = 0;

private:
    State m_state = UNALLOCATED;
    unsigned int m_name = 0;
};

class BufferResource : public GlResource
{
public:
    ~BufferResource() override;

protected:
    unsigned int doAllocate() override;
    void doDeallocate(unsigned int name) override;
};

class ProgramResource : public GlResource
{
public:
    ~ProgramResource() override;

protected:
    unsigned int doAllocate() override;
    void doDeallocate(unsigned int name) override;
};

class ShaderResource : public GlResource
{
public:
    enum class Kind : uint32_t
    {
        VERTEX = 0,
        FRAGMENT = 1
    };

    explicit ShaderResource(Kind kind) : m_kind(kind) {}
    ~ShaderResource() override;

    /// GL_INVALID_ENUM, which GL then refuses, for a kind that is neither.
    unsigned int getGlShaderType() const;

protected:
    unsigned int doAllocate() override;
    void doDeallocate(unsigned int name) override;

private:
    Kind m_kind;
};

class TextureResource : public GlResource
{
public:
    TextureResource() = default;

    /// Takes over a texture that exists already.
    explicit TextureResource(unsigned int name) : GlResource(name) {}
    ~TextureResource() override;

protected:
    unsigned int doAllocate() override;
    void doDeallocate(unsigned int name) override;
};

/// The GL objects of one asset cache, in the order added.
///
/// A resource is added before it is allocated, so that it is tracked even where that fails. Dropping the cache
/// makes no GL calls; the first of the GL objects that are left behind by that is logged, and the number of the others.
class ResourceCache : public Shared
{
public:
    ORV_CLASS_NAME("ResourceCache")

    ResourceCache() = default;
    ~ResourceCache() override;

    void add(const SharedPtr<Resource>& resource);

    /// Releases every resource, then forgets them all.
    void release();

    /// Deletes the GL objects of resources that only this cache holds, and forgets those and the dead ones.
    void flush();

private:
    std::list<SharedPtr<Resource>> m_resources;
};

} // namespace orv::detail
