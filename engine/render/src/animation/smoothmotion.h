#pragma once

#include "mixedplaces.h"

#include "orv/animationcontroller.h"
#include "orv/scenenode.h"

#include <vector>

namespace orv
{

/// State of a controller that interpolates, fades or has a weight.
struct AnimationController::Smooth
{
    /// Goes linearly from 0 to 1.
    struct Ramp
    {
        float value = 1.0f;
        float rate = 0.0f; ///< per second; 0 at the end

        void begin(float seconds);
        void advance(float seconds);
    };

    /// A clip that fades away below the newer ones.
    struct OldClip
    {
        SharedPtr<AnimationController> player; ///< without smooth motion of its own
        Ramp cover;                            ///< of the older clips
        float weight = 0.0f;                   ///< over those, in this update
    };

    static constexpr size_t MOST_OLD_CLIPS = 3;

    void advance(float deltaTime, bool isPaused);
    void findWeights();
    void letGo();

    bool isInterpolated = false;
    bool isWeighted = false; ///< the weight has been set
    SharedPtr<SceneNode> subtree;
    float startWeight = 1.0f; ///< of the fade of the weight
    float endWeight = 1.0f;
    Ramp weightRamp;
    float appliedWeight = 1.0f;    ///< of the last update
    Ramp cover;                    ///< of the old clips by the present one
    float clipWeight = 1.0f;       ///< of the present clip over the old ones, in this update
    std::vector<OldClip> oldClips; ///< oldest first
    detail::MixedPlaces places;

    float getWeight() const { return startWeight + (endWeight - startWeight) * weightRamp.value; }
};

} // namespace orv
