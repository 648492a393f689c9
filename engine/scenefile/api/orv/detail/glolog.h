#pragma once

#include "orv/log.h"

/// All sources of the scene file loader log under one name.
#define ORV_GLO_LOG(entryPoint, ...) entryPoint("engine/render/src/glofile", __func__, __LINE__, __VA_ARGS__)
#define ORV_GLO_ERROR(...) ORV_GLO_LOG(::orv::detail::logError, __VA_ARGS__)
#define ORV_GLO_WARN(...) ORV_GLO_LOG(::orv::detail::logWarn, __VA_ARGS__)
