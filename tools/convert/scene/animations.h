#pragma once

#include "convert/names.h"
#include "convert/options.h"
#include "convert/report.h"
#include "glo/glowriter.h"

#include <map>
#include <string>
#include <vector>

struct aiNode;
struct aiScene;

namespace convert
{

/// One of a model's animations on the scene's time line, in seconds.
struct ModelClip
{
    std::string name;
    float start = 0.0f;
    float end = 0.0f;
};

/// A scene's animations.
struct Motion
{
    std::vector<ModelClip> clips;
    std::vector<glo::AnimationData> animations;
    bool usesClipNode = false; ///< see convertAnimations
};

/// Names of the model's nodes in the scene.
using NodeNames = std::map<const aiNode*, std::string>;

/// Samples the movement of nodes to stepped keys, or chooses keys to interpolate between; the clips one after the other with
/// a sample's time between.
///
/// A single clip is an animation of its name. Of several, all movement is in one animation "all clips", since of
/// several channels for one node the last would always win. Before it comes an animation for each clip, with the clip's
/// name, start and end, that moves only a special node.
/// @param clipNode  the name of that empty node.
Motion convertAnimations(const aiScene& scene, const NodeNames& nodeNames, const std::string& clipNode,
                         const Options& options, Report& report);

} // namespace convert
