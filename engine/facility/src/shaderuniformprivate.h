#pragma once

namespace orv::ShaderUniformPrivate
{

/// Tells the current program that its sampler reads the units from unit on, one for each array element. Units that
/// the GL does not have are left out (logged).
void setSamplerUnits(int location, int unit, int size);

} // namespace orv::ShaderUniformPrivate
