#pragma once

#include "orv/detail/resource.h"
#include "orv/detail/texturetarget.h"
#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/texture.h"

namespace orv
{

/// A two-dimensional GL texture, made by Texture2DCache.
///
/// After its resource was released the texture has no GL name: it binds name 0, its setters do nothing and
/// its getters give the modes of value 0.
/// GL thread only. Setters, getters and enable() leave the texture bound on the active unit.
class ORV_API Texture2D : public Shared
{
public:
    using Ptr = SharedPtr<Texture2D>;
    using FilterMode = TextureParameters::FilterMode; ///< See TextureParameters.
    using WrapMode = TextureParameters::WrapMode;

    ORV_CLASS_NAME("Texture2D")

    /// @param bytesPerPixel  a value between 0 and 1 marks a compressed texture.
    /// @param external       an external image: width and height are 0.
    /// @param depth          a depth texture, which cannot have mipmaps.
    Texture2D(unsigned width, unsigned height, float bytesPerPixel, bool hasMipmaps,
              const SharedPtr<detail::TextureResource>& resource, bool external, bool depth = false);
    ~Texture2D() override;

    /// Binds the texture to its target on the active unit.
    virtual void enable();

    /// A mipmap mode makes the mipmaps if there are none. Where the texture cannot have them (compressed
    /// without its own, external, depth, or a size that is not a power of two) the mode is refused (logged)
    /// and the old one stays: GL would draw such a texture black.
    void setMinFilter(FilterMode mode);
    /// NEAREST or LINEAR; anything else is refused (logged).
    void setMagFilter(FilterMode mode);
    /// REPEAT and MIRRORED_REPEAT are refused (logged) for external textures and sizes that are not powers
    /// of two: GL would draw those black.
    void setHorizontalWrap(WrapMode mode);
    void setVerticalWrap(WrapMode mode);
    /// All four at once, each by its own rules.
    void setParameters(const TextureParameters& parameters);

    /// Read back from GL.
    FilterMode getMinFilter();
    FilterMode getMagFilter();
    WrapMode getHorizontalWrap();
    WrapMode getVerticalWrap();

    /// The GL name, 0 when there is none.
    unsigned getId() const { return m_resource ? m_resource.get()->getId() : 0; }
    /// GL_TEXTURE_EXTERNAL_OES or GL_TEXTURE_2D.
    unsigned getTarget() const
    {
        return m_external ? detail::TEXTURE_TARGET_EXTERNAL : detail::TEXTURE_TARGET_2D;
    }
    unsigned getWidth() const { return m_width; }   ///< pixels
    unsigned getHeight() const { return m_height; } ///< pixels
    bool hasMipmaps() const { return m_hasMipmaps; }
    bool isExternal() const { return m_external; }
    /// Deletes the GL texture at once, not at a flush after the last share has gone; it is black from then on.
    void discard();
    /// Of the largest level alone.
    unsigned getSizeInBytes() const { return m_sizeInBytes; }

private:
    ORV_LOCAL bool canHaveMipmaps() const;
    ORV_LOCAL void setWrap(unsigned parameter, WrapMode mode);
    ORV_LOCAL FilterMode getFilter(unsigned parameter);
    ORV_LOCAL WrapMode getWrap(unsigned parameter);
    ORV_LOCAL int readParameter(unsigned parameter);

    SharedPtr<detail::TextureResource> m_resource;
    unsigned m_width;
    unsigned m_height;
    bool m_hasMipmaps;
    unsigned m_sizeInBytes;
    bool m_external;
    bool m_depth;
    bool m_compressed;
};

} // namespace orv
