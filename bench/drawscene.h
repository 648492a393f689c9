#pragma once

#include "orv/camera.h"
#include "orv/matrix.h"
#include "orv/quaternion.h"
#include "orv/vector.h"

#include <cstdint>
#include <vector>

/// The scene of drawbench: cubes in a block, lit by a directional light, with ten materials of different colour and
/// texture in turn, so that in the order of the scene each draw changes the material.
struct DrawScene
{
    static constexpr int MATERIALS = 10;
    static constexpr int TURNS = 64;
    static constexpr int TEXTURE_SIZE = 4;

    /// What moves from frame to frame, besides the camera.
    enum class Motion
    {
        STILL,
        ONE_IN_100, ///< every hundredth cube turns
        ALL,        ///< every cube turns
        PARENT      ///< the one parent of all cubes turns
    };

    static constexpr Motion MOTIONS[] = {Motion::STILL, Motion::ONE_IN_100, Motion::ALL, Motion::PARENT};
    static constexpr const char* MOTION_NAMES[] = {"still", "1-in-100", "all", "parent"};

    static const char* const VERTEX_SOURCE;
    static const char* const FRAGMENT_SOURCE;

    DrawScene(int count, Motion motion);

    void placeCamera(orv::Camera& camera, int frame) const;

    /// The place in the table of turns of a cube in a frame; in the first it differs from cube to cube.
    int findTurn(size_t cube, int frame) const { return (int(cube) * 7 + frame) % TURNS; }

    /// One cube of this many turns; 0 for none.
    size_t getTurningStep() const;

    /// RGB, TEXTURE_SIZE by TEXTURE_SIZE, of one colour, so that filters have no effect.
    std::vector<uint8_t> makeTexture(int material) const;

    Motion motion;
    std::vector<orv::Vector3f> places;
    orv::Quaternionf turns[TURNS]; ///< rotations about an axis, a small step apart
    orv::Vector4f colours[MATERIALS];
    orv::Vector4f lightDirection; ///< towards the light
    float reach;                  ///< of the block, from its centre
};
