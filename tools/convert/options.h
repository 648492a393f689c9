#pragma once

#include <set>
#include <string>

namespace convert
{

/// Conversion options.
struct Options
{
    double fps = 30.0;       ///< samples, and at most keys, per second of animations; above 0
    bool sparseKeys = false; ///< keys only where movement bends, for the engine to interpolate between
    double keyError = 0.001; ///< of those: of the model's diagonal, radians, of a scale
    bool animation = true;   ///< false: the model at rest
    std::string up;          ///< the file's up axis: "x", "y", "z", or empty for the file's own
    double scale = 1.0;      ///< of the whole model, above 0
    int maxTextureSize = 0;  ///< pixels of a picture's longer side; 0 for no limit
    bool powerOfTwo = false; ///< all pictures get sides that are powers of two
    std::string linear;      ///< "on", "off": materials use linear light; empty: depends on the format
    bool sky = false;        ///< metals mirror a plain sky
    std::set<std::string> takenNames; ///< file names without extension that no picture may get
};

} // namespace convert
