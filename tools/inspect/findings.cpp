#include "findings.h"

#include <algorithm>

namespace inspect
{

namespace
{

using enum Severity;

/// By Kind.
const std::vector<KindInfo> INFO = {
    {Kind::NOT_GLO, "not-glo", ERROR, "the file does not begin with a GLO3 chunk"},
    {Kind::HEADER_CUT, "header-cut", ERROR, "the file ends inside a chunk header"},
    {Kind::CHUNK_SIZE, "chunk-size", ERROR, "a chunk is longer or shorter than its contents"},
    {Kind::CHUNK_CUT, "chunk-cut", ERROR, "a chunk reaches beyond its parent chunk"},
    {Kind::UNEXPECTED_CHUNK, "unexpected-chunk", ERROR,
     "a chunk of another kind is in place of a required one"},
    {Kind::MISSING_CHUNK, "missing-chunk", ERROR, "a required chunk is missing"},
    {Kind::SKIPPED_CHUNK, "skipped-chunk", NOTE, "an unknown chunk, which the engine skips"},
    {Kind::FIELD_CUT, "field-cut", ERROR, "a chunk ends before or inside a field"},
    {Kind::BAD_TEXT, "bad-text", ERROR, "a text has a length of 0, one above 1024, or no final NUL"},
    {Kind::TRAILING_BYTES, "trailing-bytes", NOTE, "up to three bytes follow the last chunk"},
    {Kind::TOO_DEEP, "too-deep", ERROR, "chunks lie more than 512 deep"},
    {Kind::LIST_SHORT, "list-short", WARNING, "the file ends before a list holds what it counts"},
    {Kind::NO_INFO, "no-info", WARNING, "without INFO the file is read as one of the oldest version"},
    {Kind::LATE_INFO, "late-info", WARNING, "chunks before INFO are read as those of the oldest version"},
    {Kind::BAD_VERSION, "bad-version", ERROR, "the file version is not three numbers"},
    {Kind::NEW_VERSION, "new-version", ERROR, "the file version is newer than the engine"},
    {Kind::UNKNOWN_TOOL, "unknown-tool", ERROR, "the authoring tool is not one that the engine knows"},
    {Kind::SECOND_SCENE, "second-scene", ERROR, "there is more than one scene"},
    {Kind::NO_SCENE, "no-scene", WARNING, "there is no scene, so nothing will be seen"},
    {Kind::NOTHING_DRAWN, "nothing-drawn", NOTE, "no node of the scene draws anything"},
    {Kind::UP_AXIS, "up-axis", ERROR, "the up-axis option is none of 0, 1, 2"},
    {Kind::INDEX_BUFFERS, "index-buffers", ERROR, "a primitive set has more than one index buffer"},
    {Kind::INDEX_TYPE, "index-type", ERROR, "indices are not unsigned 16-bit numbers"},
    {Kind::ODD_INDICES, "odd-indices", NOTE, "an odd byte follows the last index"},
    {Kind::KEY_TYPE, "key-type", ERROR, "the type of animation keys is unknown"},
    {Kind::KEYS_CUT, "keys-cut", ERROR, "animation keys reach beyond their chunk"},
    {Kind::ATTRIBUTE_BOUNDS, "attribute-bounds", ERROR, "a vertex attribute lies outside of the vertex data"},
    {Kind::ATTRIBUTE_TYPE, "attribute-type", WARNING, "an attribute's type is read as another one"},
    {Kind::NO_VERTEX_DATA, "no-vertex-data", ERROR, "there is less than a byte for each vertex"},
    {Kind::INDEX_BOUNDS, "index-bounds", ERROR, "an index refers to a missing vertex"},
    {Kind::BAD_NUMBER, "bad-number", WARNING,
     "vertices, matrices or keys have values that are not finite numbers"},
    {Kind::NO_POSITIONS, "no-positions", WARNING,
     "a geometry has no a_position, so nothing of it will be seen"},
    {Kind::PRIMITIVE_TYPE, "primitive-type", WARNING, "an unknown primitive type is drawn as a triangle fan"},
    {Kind::DEGENERATE, "degenerate", NOTE, "triangles use a vertex twice and are never seen"},
    {Kind::WEIGHT_SUM, "weight-sum", WARNING, "the joint weights of vertices do not add up to 1"},
    {Kind::JOINT_NUMBER, "joint-number", WARNING, "vertices name joints that the skin lacks"},
    {Kind::MANY_JOINTS, "many-joints", WARNING, "a skin has more joints than shaders support"},
    {Kind::JOINT_MISSING, "joint-missing", WARNING, "a joint's node is missing from the scene"},
    {Kind::JOINTS_PER_VERTEX, "joints-per-vertex", WARNING, "a skin's joints per vertex is not 1 to 4"},
    {Kind::UNKNOWN_GEOMETRY, "unknown-geometry", ERROR, "a reference names a missing geometry"},
    {Kind::UNKNOWN_SKIN, "unknown-skin", ERROR, "a reference names a missing skin"},
    {Kind::UNKNOWN_LIGHT, "unknown-light", ERROR, "a reference names a missing light"},
    {Kind::UNKNOWN_CAMERA, "unknown-camera", ERROR, "a reference names a missing camera"},
    {Kind::LIGHT_TYPE, "light-type", ERROR, "a light that is used has an unknown type"},
    {Kind::AMBIENT_LIGHT, "ambient-light", WARNING, "an ambient light becomes a point light"},
    {Kind::CAMERA_TYPE, "camera-type", ERROR, "a camera that is used has an unknown projection"},
    {Kind::NO_MATERIAL, "no-material", WARNING, "a geometry is drawn with the default material"},
    {Kind::NO_TECHNIQUE, "no-technique", WARNING, "a material without a technique counts as missing"},
    {Kind::BLACK_TEXTURED, "black-textured", WARNING, "a texture is multiplied with black"},
    {Kind::SURFACE, "surface", WARNING, "an additional feature of a material has no effect"},
    {Kind::SAMPLER_TYPE, "sampler-type", WARNING, "a sampler is neither 2D nor cube"},
    {Kind::IMAGE_MISSING, "image-missing", WARNING, "a texture's file is not found beside the scene"},
    {Kind::IMAGE_UNREADABLE, "image-unreadable", WARNING, "a texture's file cannot be decoded"},
    {Kind::NEVER_REPEATS, "never-repeats", WARNING,
     "sizes that are no powers of two cannot repeat or have mipmaps"},
    {Kind::DUPLICATE_NAME, "duplicate-name", WARNING, "two things of one kind have the same name"},
    {Kind::UNUSED, "unused", NOTE, "nothing refers to a definition"},
    {Kind::TRANSFORMS_DIFFER, "transforms-differ", WARNING, "a node's matrix and its components disagree"},
    {Kind::CHANNEL_TARGET, "channel-target", ERROR, "a channel's target is missing"},
    {Kind::CHANNEL_PROPERTY, "channel-property", WARNING,
     "a channel is ignored: its target is of an unknown kind"},
    {Kind::COEFFICIENTS, "coefficients", ERROR, "a channel's keys have the wrong number of coefficients"},
    {Kind::KEY_TIME, "key-time", ERROR, "the time of a key is not a number"},
    {Kind::KEY_ORDER, "key-order", NOTE, "keys are not in the order of their times"},
    {Kind::LOOP_RANGE, "loop-range", WARNING, "a loop range ends before it begins"},
    {Kind::REFERENCES, "references", ERROR, "references make more than a file of its size may have"},
    {Kind::TEXT_EMPTY, "text-empty", ERROR, "a material or program file is empty"},
    {Kind::TEXT_VERSION, "text-version", ERROR, "a material or program file does not begin with 1.0"},
    {Kind::TEXT_TAG, "text-tag", ERROR, "an unknown statement, which ends the reading"},
    {Kind::TEXT_WORD, "text-word", WARNING, "an unknown word, which the engine replaces"},
    {Kind::TEXT_ARGUMENT, "text-argument", WARNING, "a missing argument or one that is no number"},
    {Kind::SOURCE_MISSING, "source-missing", ERROR, "a program's shader source is not named or not found"},
    {Kind::PROGRAM_MISSING, "program-missing", WARNING, "a material's program file is not found"},
    {Kind::UNIFORM_UNBOUND, "uniform-unbound", WARNING, "a uniform of the shaders is bound to no property"},
    {Kind::UNIFORM_ABSENT, "uniform-absent", NOTE, "the shaders have no such uniform"},
};

} // namespace

std::string counted(uint64_t count, const char* one, const char* many)
{
    return std::to_string(count) + " " + (count == 1 ? one : many);
}

const KindInfo& getInfo(Kind kind)
{
    return INFO[size_t(kind)];
}

const std::vector<KindInfo>& getAllInfo()
{
    return INFO;
}

const char* getName(Severity severity)
{
    return severity == ERROR ? "error" : severity == WARNING ? "warning" : "note";
}

void Findings::add(Kind kind, uint64_t offset, const std::string& path, const std::string& sentence)
{
    m_findings.push_back({kind, offset, path, sentence});
}

Severity Findings::getWorst() const
{
    return count(ERROR) > 0 ? ERROR : count(WARNING) > 0 ? WARNING : NOTE;
}

int Findings::count(Severity severity) const
{
    return int(std::count_if(m_findings.begin(), m_findings.end(),
                             [severity](const Finding& finding)
                             { return getInfo(finding.kind).severity == severity; }));
}

std::vector<Finding> Findings::getSorted() const
{
    std::vector<Finding> sorted = m_findings;
    std::stable_sort(sorted.begin(), sorted.end(),
                     [](const Finding& a, const Finding& b) { return a.offset < b.offset; });
    return sorted;
}

} // namespace inspect
