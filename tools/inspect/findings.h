#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace inspect
{

enum class Severity
{
    ERROR,   ///< the engine refuses the file
    WARNING, ///< the engine substitutes something, or the result probably looks wrong
    NOTE     ///< harmless, but probably not intended
};

/// Everything that can be found. The codes are for scripts and do not change.
enum class Kind
{
    NOT_GLO,
    HEADER_CUT,
    CHUNK_SIZE,
    CHUNK_CUT,
    UNEXPECTED_CHUNK,
    MISSING_CHUNK,
    SKIPPED_CHUNK,
    FIELD_CUT,
    BAD_TEXT,
    TRAILING_BYTES,
    TOO_DEEP,
    LIST_SHORT,
    NO_INFO,
    LATE_INFO,
    BAD_VERSION,
    NEW_VERSION,
    UNKNOWN_TOOL,
    SECOND_SCENE,
    NO_SCENE,
    NOTHING_DRAWN,
    UP_AXIS,
    INDEX_BUFFERS,
    INDEX_TYPE,
    ODD_INDICES,
    KEY_TYPE,
    KEYS_CUT,
    ATTRIBUTE_BOUNDS,
    ATTRIBUTE_TYPE,
    NO_VERTEX_DATA,
    INDEX_BOUNDS,
    BAD_NUMBER,
    NO_POSITIONS,
    PRIMITIVE_TYPE,
    DEGENERATE,
    WEIGHT_SUM,
    JOINT_NUMBER,
    MANY_JOINTS,
    JOINT_MISSING,
    JOINTS_PER_VERTEX,
    UNKNOWN_GEOMETRY,
    UNKNOWN_SKIN,
    UNKNOWN_LIGHT,
    UNKNOWN_CAMERA,
    LIGHT_TYPE,
    AMBIENT_LIGHT,
    CAMERA_TYPE,
    NO_MATERIAL,
    NO_TECHNIQUE,
    BLACK_TEXTURED,
    SURFACE,
    SAMPLER_TYPE,
    IMAGE_MISSING,
    IMAGE_UNREADABLE,
    NEVER_REPEATS,
    DUPLICATE_NAME,
    UNUSED,
    TRANSFORMS_DIFFER,
    CHANNEL_TARGET,
    CHANNEL_PROPERTY,
    COEFFICIENTS,
    KEY_TIME,
    KEY_ORDER,
    LOOP_RANGE,
    REFERENCES,
    TEXT_EMPTY,
    TEXT_VERSION,
    TEXT_TAG,
    TEXT_WORD,
    TEXT_ARGUMENT,
    SOURCE_MISSING,
    PROGRAM_MISSING,
    UNIFORM_UNBOUND,
    UNIFORM_ABSENT,
};

struct KindInfo
{
    Kind kind;
    const char* code;
    Severity severity;
    const char* meaning; ///< for the list that --codes prints
};

/// A count with a noun: "1 node", "2 nodes".
std::string counted(uint64_t count, const char* one, const char* many);

const KindInfo& getInfo(Kind kind);
const std::vector<KindInfo>& getAllInfo();
const char* getName(Severity severity);

struct Finding
{
    Kind kind;
    uint64_t offset;      ///< bytes from the start of the file
    std::string path;     ///< chunks from the outermost in: "GLO3/LGEO/GEOM[2]"; "line 7" in a text file
    std::string sentence; ///< for a person
};

/// The findings so far, in the order of reading.
class Findings
{
public:
    void add(Kind kind, uint64_t offset, const std::string& path, const std::string& sentence);

    /// The worst severity; NOTE without findings.
    Severity getWorst() const;

    int count(Severity severity) const;

    /// Sorted by offset; at the same offset in the order of reading.
    std::vector<Finding> getSorted() const;

private:
    std::vector<Finding> m_findings;
};

} // namespace inspect
