#pragma once

#include "chunk.h"
#include "findings.h"

#include "orv/detail/glorecords.h"

#include <cstdint>
#include <vector>

namespace inspect
{

/// A scene file, read as far as it can be.
struct ScannedFile
{
    Chunk top;
    orv::detail::glo::GloScene scene;
    orv::detail::glo::FileVersion version; ///< as the engine reads it
    orv::detail::glo::AuthoringTool tool = orv::detail::glo::AuthoringTool::MAX;
    uint64_t size = 0; ///< of the file in bytes
};

/// Reads chunk by chunk by the engine's own field lists. The engine stops at the first fault; this reports it and
/// continues after the damaged chunk.
ScannedFile scanGlo(const std::vector<uint8_t>& bytes, Findings& findings);

} // namespace inspect
