#pragma once

#include "accessors.h"

#include <memory>

namespace convert::gltf
{

/// A primitive compressed with KHR_draco_mesh_compression.
class DracoMesh
{
public:
    /// Throws a Fault if the bytes are damaged.
    /// @param extension  the extension's object in the primitive.
    DracoMesh(const Object& extension, Span packed);
    ~DracoMesh();
    DracoMesh(const DracoMesh&) = delete;
    DracoMesh& operator=(const DracoMesh&) = delete;

    size_t vertexCount() const;
    std::vector<uint32_t> readIndices() const; ///< of triangles; all are below vertexCount
    bool has(const char* attribute) const;
    Column read(const char* attribute, bool normalized) const;

private:
    struct Decoded;
    Object m_attributes;
    std::unique_ptr<Decoded> m_decoded;
};

} // namespace convert::gltf
