#include "draco.h"

#include <draco/compression/decode.h>

namespace convert::gltf
{

struct DracoMesh::Decoded
{
    std::unique_ptr<draco::Mesh> mesh;
};

namespace
{

std::optional<Component> toComponent(draco::DataType type)
{
    switch (type)
    {
    case draco::DT_INT8: return Component::INT8;
    case draco::DT_UINT8: return Component::UINT8;
    case draco::DT_INT16: return Component::INT16;
    case draco::DT_UINT16: return Component::UINT16;
    case draco::DT_UINT32: return Component::UINT32;
    case draco::DT_FLOAT32: return Component::FLOAT;
    default: return std::nullopt;
    }
}

} // namespace

DracoMesh::DracoMesh(const Object& extension, Span packed)
    : m_attributes(extension.object("attributes"))
    , m_decoded(std::make_unique<Decoded>())
{
    draco::DecoderBuffer buffer;
    buffer.Init(reinterpret_cast<const char*>(packed.data()), packed.size());
    draco::Decoder decoder;
    auto decoded = decoder.DecodeMeshFromBuffer(&buffer);
    if (!decoded.ok())
        extension.fail("is damaged (" + decoded.status().error_msg_string() + ")");
    m_decoded->mesh = std::move(decoded).value();
    for (const uint32_t index : readIndices())
    {
        if (index >= vertexCount())
            extension.fail("has an index beyond its vertices");
    }
}

DracoMesh::~DracoMesh() = default;

size_t DracoMesh::vertexCount() const
{
    return m_decoded->mesh->num_points();
}

std::vector<uint32_t> DracoMesh::readIndices() const
{
    const draco::Mesh& mesh = *m_decoded->mesh;
    std::vector<uint32_t> indices;
    indices.reserve(size_t(mesh.num_faces()) * 3);
    for (uint32_t i = 0; i < mesh.num_faces(); ++i)
    {
        for (const draco::PointIndex& corner : mesh.face(draco::FaceIndex(i)))
            indices.push_back(corner.value());
    }
    return indices;
}

bool DracoMesh::has(const char* attribute) const
{
    return m_attributes.has(attribute);
}

Column DracoMesh::read(const char* attribute, bool normalized) const
{
    const size_t id = m_attributes.size(attribute, 0);
    const draco::PointAttribute* found =
        id <= UINT32_MAX ? m_decoded->mesh->GetAttributeByUniqueId(uint32_t(id)) : nullptr;
    const std::optional<Component> component = found ? toComponent(found->data_type()) : std::nullopt;
    if (!component)
        m_attributes.fail(attribute, "is missing from the compressed mesh");
    const unsigned components = unsigned(found->num_components());
    const int64_t stride = found->byte_stride();
    const size_t stored = found->size();
    Column column{components, std::vector<float>(vertexCount() * components)};
    for (uint32_t i = 0; i < vertexCount(); ++i)
    {
        const draco::AttributeValueIndex value = found->mapped_index(draco::PointIndex(i));
        if (value.value() >= stored)
            m_attributes.fail(attribute, "has fewer values than there are vertices");
        decode(found->GetAddress(value), size_t(stride), 1, components, {*component, normalized},
               column.values.data() + size_t(i) * components);
    }
    return column;
}

} // namespace convert::gltf
