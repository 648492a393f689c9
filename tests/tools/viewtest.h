#pragma once

#include "render/gloscenes.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

/// A folder with a few scenes to look at.
class ViewTest : public testing::Test
{
protected:
    void SetUp() override
    {
        std::vector<uint8_t> file = write(makeScene());
        m_folder.write("scene.glo", file);
        file.resize(file.size() / 2);
        m_folder.write("damaged.glo", file);
    }

    support::Picture picture(const std::string& name) const { return support::readPng(m_folder.path(name)); }

    static std::vector<uint8_t> write(const glo::GloScene& scene)
    {
        std::vector<uint8_t> file;
        std::string error;
        EXPECT_TRUE(glo::writeGlo(scene, file, error)) << error;
        return file;
    }

    /// A square that jumps from the left to the right after half of its 2 seconds, and a camera that looks at where
    /// it lands. The second half is a clip of its own, "rest". No light.
    static glo::GloScene makeScene(const orv::Vector4f& colour = orv::Vector4f(1, 0, 0, 1))
    {
        glo::GloScene scene;
        scene.geometries = {makeSquareGeometry("square")};
        scene.materials = {makeMaterial("paint", colour)};
        glo::CameraDefinition lens;
        lens.name = "lens";
        scene.cameras.push_back(lens);

        glo::NodeData square = makeSolidNode("square node", "square", "paint");
        glo::NodeData eye = makeNode("eye", &glo::NodeData::camera, glo::CameraReference{"lens"});
        moveTo(eye, orv::Vector3f(3.0f, 0.0f, 2.0f));
        scene.scene = glo::SceneData{"scene", makeNode("top", {square, eye, makeNode("clips")})};

        glo::Channel move = makeChannel("node", "node-square node", "translation", {-3, 0, 0}, 0.0f);
        glo::addKey(move, 1.0f, {3, 0, 0});
        glo::addKey(move, 2.0f, {3, 0, 0});
        glo::Channel rest = makeChannel("node", "node-clips", "translation", {0, 0, 0}, 1.0f);
        glo::addKey(rest, 2.0f, {0, 0, 0});
        scene.animations.resize(2);
        scene.animations[0].name = "rest";
        scene.animations[0].channels = {rest};
        scene.animations[1].name = "jump";
        scene.animations[1].channels = {move};
        return scene;
    }

    static bool isRed(const support::Rgba& colour)
    {
        return colour.r > 150 && colour.g < 60 && colour.b < 60 && colour.a == 255;
    }

    static bool isBackground(const support::Rgba& colour) { return isNear(colour, {214, 219, 227, 255}, 2); }

    /// How many pixels in some columns are of the square.
    static int countRed(const support::Picture& picture, int left, int right)
    {
        int count = 0;
        for (int y = 0; y < picture.height; ++y)
        {
            for (int x = left; x < right; ++x)
                count += isRed(picture.pixel(x, y));
        }
        return count;
    }

    support::TempDir m_folder;
};
