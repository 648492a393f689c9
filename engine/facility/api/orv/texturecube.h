#pragma once

#include "orv/detail/resource.h"
#include "orv/detail/texturetarget.h"
#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/texture.h"

namespace orv
{

/// A cube map, made by TextureCubeCache and filled face by face.
///
/// Starts with LINEAR magnification, LINEAR_MIPMAP_NEAREST minification and clamped wraps; the sixth face
/// makes the mipmaps and sends these. After faces were replaced, setParameters() makes the mipmaps again. After its
/// resource was released it binds name 0 and takes no faces.
/// GL thread only. setFace(), setParameters() and enable() leave the cube bound on the active unit.
class ORV_API TextureCube : public Shared
{
public:
    using Ptr = SharedPtr<TextureCube>;

    /// The directions of the faces.
    enum class Face : int32_t
    {
        POSITIVE_X = 0,
        NEGATIVE_X = 1,
        POSITIVE_Y = 2,
        NEGATIVE_Y = 3,
        POSITIVE_Z = 4,
        NEGATIVE_Z = 5
    };

    static constexpr int FACE_COUNT = 6; ///< Of a cube.

    ORV_CLASS_NAME("TextureCube")

    /// Made by a TextureCubeCache.
    TextureCube(unsigned width, unsigned height, Texture::Format format, Texture::Type type,
                const SharedPtr<detail::TextureResource>& resource);
    ~TextureCube() override;

    /// Binds the cube on the active unit.
    virtual void enable();

    /// Uploads one face. Faces must be square (logged otherwise). Each call counts, whatever its face: the
    /// sixth completes the cube. A size that is not a power of two, or a depth format, has no mipmaps and
    /// clamps. Where GL has no memory for one of the six (logged) all six are wanted again.
    /// @param pixels  width x height pixels without padding, top row first; null leaves them undefined.
    void setFace(Face face, const void* pixels);

    /// Whether GL has all six faces; otherwise it draws the cube black.
    bool isComplete() const { return getId() != 0 && m_facesSet >= FACE_COUNT; }

    /// Takes effect when the cube is complete, at once if it is. A magnification other than NEAREST or LINEAR
    /// and values outside their enums are refused (logged) and nothing changes.
    void setParameters(const TextureParameters& parameters);

    /// The GL name, 0 when there is none, and its target.
    unsigned getId() const { return m_resource ? m_resource.get()->getId() : 0; }
    unsigned getTarget() const { return detail::TEXTURE_TARGET_CUBE_MAP; }
    unsigned getWidth() const { return m_width; }   ///< pixels of a face
    unsigned getHeight() const { return m_height; } ///< pixels of a face

private:
    ORV_LOCAL void sendParameters();

    SharedPtr<detail::TextureResource> m_resource;
    unsigned m_width;
    unsigned m_height;
    Texture::Format m_format;
    Texture::Type m_type;
    TextureParameters m_parameters;
    int m_facesSet = 0;
};

namespace detail
{

/// Whether faces of this size are square; logs if they are not.
bool requireSquareFaces(unsigned width, unsigned height);

} // namespace detail

} // namespace orv
