#pragma once

#include "glcalls/glcalls.h"

/// Makes the driver behave like one of the weakest devices that OpenGL ES 2.0 allows.
namespace glcalls
{

/// The features of a device. Missing features of the driver stay missing.
struct Device
{
    const char* name = "";
    int vertexUniformVectors = 0; ///< 0: as many as the driver has
    int textureUnits = 0;        ///< of fragments and in all, none of them in vertex shaders; 0: the driver's
    bool hasNpotTextures = true; ///< sizes that are no power of two with mipmaps and repetition
    bool hasEtc1 = true;
    bool hasPackedDepthStencil = true;
    bool hasDepthTextures = true;
    bool hasProgramBinaries = true;
    bool hasFragmentHighp = true;
};

/// Devices that lack one feature each, and one that lacks all; with the fewest texture units and vertex uniform vectors
/// that OpenGL ES 2.0 allows.
extern const Device WEAK_DEVICES[9];

/// Until reset(), the driver answers questions as this device would, and refuses what the device lacks:
/// programs of too many uniform vectors (packed as the shading language's appendix A says) or samplers fail to
/// link, fragment shaders that say highp fail to compile, textures that the device calls incomplete are black,
/// and everything else ends in the GL error that the standard names for it. What the device has works as
/// before; mediump has the precision that the driver gives it. Begin before the first GL object is made.
void emulate(const Device& device);

} // namespace glcalls
