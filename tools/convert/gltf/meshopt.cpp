#include "meshopt.h"

#include <meshoptimizer.h>

namespace convert::gltf
{

namespace
{

constexpr size_t LARGEST_STRIDE = 256;
constexpr size_t MOST_PER_BYTE = 512; // more than the format can pack

int decode(const Object& compression, const std::string& mode, Span packed, size_t count, size_t stride,
           Bytes& target)
{
    const bool isIndex = stride == 2 || stride == 4;
    if (mode == "ATTRIBUTES" && stride % 4 == 0)
        return meshopt_decodeVertexBuffer(target.data(), count, stride, packed.data(), packed.size());
    if (mode == "TRIANGLES" && isIndex && count % 3 == 0)
        return meshopt_decodeIndexBuffer(target.data(), count, stride, packed.data(), packed.size());
    if (mode == "INDICES" && isIndex)
        return meshopt_decodeIndexSequence(target.data(), count, stride, packed.data(), packed.size());
    compression.fail("has a mode, count and stride that do not match");
}

void filter(const Object& compression, size_t count, size_t stride, Bytes& target)
{
    const std::string name = compression.text("filter");
    if (name == "OCTAHEDRAL" && (stride == 4 || stride == 8))
        meshopt_decodeFilterOct(target.data(), count, stride);
    else if (name == "QUATERNION" && stride == 8)
        meshopt_decodeFilterQuat(target.data(), count, stride);
    else if (name == "EXPONENTIAL" && stride % 4 == 0)
        meshopt_decodeFilterExp(target.data(), count, stride);
    else if (!name.empty() && name != "NONE")
        compression.fail("filter", "\"" + name + "\" is not known, or not for elements of this size");
}

} // namespace

Bytes decompressMeshopt(const Object& compression, Span packed)
{
    const size_t count = compression.size("count", 0);
    const size_t stride = compression.size("byteStride", 0);
    if (stride == 0 || stride > LARGEST_STRIDE)
        compression.fail("byteStride", "is not from 1 to 256");
    if (count / MOST_PER_BYTE * stride > packed.size())
        compression.fail("count", "is more than the compressed bytes can hold");
    Bytes target(count * stride);
    const std::string mode = compression.text("mode");
    if (count > 0 && decode(compression, mode, packed, count, stride, target) != 0)
        compression.fail("is damaged, or of a version that the library does not know");
    if (mode == "ATTRIBUTES")
        filter(compression, count, stride, target);
    return target;
}

} // namespace convert::gltf
