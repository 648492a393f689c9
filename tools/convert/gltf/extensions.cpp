#include "extensions.h"

#include <algorithm>
#include <iterator>

namespace convert::gltf
{

namespace
{

/// Extensions that are read, or reported where they are used.
const char* const KNOWN[] = {
    "EXT_mesh_gpu_instancing",
    "EXT_meshopt_compression",
    "EXT_texture_webp",
    "KHR_draco_mesh_compression",
    "KHR_lights_punctual",
    "KHR_materials_anisotropy",
    "KHR_materials_clearcoat",
    "KHR_materials_diffuse_transmission",
    "KHR_materials_dispersion",
    "KHR_materials_emissive_strength",
    "KHR_materials_ior",
    "KHR_materials_iridescence",
    "KHR_materials_pbrSpecularGlossiness",
    "KHR_materials_sheen",
    "KHR_materials_specular",
    "KHR_materials_transmission",
    "KHR_materials_unlit",
    "KHR_materials_volume",
    "KHR_mesh_quantization",
    "KHR_meshopt_compression",
    "KHR_node_visibility",
    "KHR_texture_basisu",
    "KHR_texture_transform",
    // Invisible: polygons of triangles, notes about the file.
    "FB_ngon_encoding",
    "KHR_xmp",
    "KHR_xmp_json_ld",
};

bool isKnown(const std::string& name)
{
    return std::find(std::begin(KNOWN), std::end(KNOWN), name) != std::end(KNOWN);
}

} // namespace

void checkExtensions(Source& source)
{
    const Object root = source.document.root();
    std::string missing;
    for (const std::string& name : root.texts("extensionsRequired"))
    {
        if (!isKnown(name))
            missing += (missing.empty() ? "" : ", ") + name.substr(0, 100);
    }
    if (!missing.empty())
        throw Fault("requires unknown extensions: " + missing);
    for (const std::string& name : root.texts("extensionsUsed"))
    {
        if (!isKnown(name))
            source.report.lose("extension",
                               "what the extension " + name.substr(0, 100) + " adds, which is not known");
    }
}

} // namespace convert::gltf
