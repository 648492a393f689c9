#include "orv/shared.h"

namespace orv
{

Shared::~Shared() = default;

} // namespace orv
