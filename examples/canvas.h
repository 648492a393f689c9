#pragma once

#include "headless/headless.h"

#include <orv/orv.h>

#include <memory>

/// Shared by the numbered examples, so that each shows one idea: a GL context that draws to memory, the engine's
/// objects for drawing, and a few solids.
class Canvas
{
public:
    orv::SharedPtr<orv::AssetCachePool> pool;
    orv::SharedPtr<orv::RenderContext> context;
    orv::SharedPtr<orv::SimpleRenderer> renderer;

    int getWidth() const { return m_options.width; } ///< pixels
    int getHeight() const { return m_options.height; }

    /// A node with a light on it.
    orv::SharedPtr<orv::SceneNode> makeScene() const;

    /// @param eye,target  in the world.
    orv::SharedPtr<orv::Camera> addCamera(const orv::SharedPtr<orv::SceneNode>& scene,
                                          const orv::Vector3f& eye, const orv::Vector3f& target) const;

    /// Gives a solid a colour and a position, and attaches it to the scene.
    /// @return the solid; empty if it was.
    orv::SharedPtr<orv::Solid> add(const orv::SharedPtr<orv::Solid>& solid,
                                   const orv::SharedPtr<orv::SceneNode>& scene, const orv::Colour4f& colour,
                                   const orv::Vector3f& position, float size = 1.0f) const;

    /// The whole surface, top row first, 4 bytes a pixel.
    std::vector<uint8_t> readPixels() const { return m_gl->readPixels(); }

    /// Replaces the GL context by a new one without objects, as can happen on a phone at any time.
    /// @return false, with a line on standard error, if there is none.
    bool loseContext();

    /// The main function of an example: makes a canvas, draws, writes what was drawn. Takes "--out FILE.png".
    /// @param name  default name of the file, without its extension.
    /// @param draw  returns false if drawing failed; the log says why.
    /// @return the program's exit code.
    static int run(int argc, char** argv, const char* name, bool (*draw)(Canvas& canvas));

private:
    Canvas() = default;

    headless::Options m_options;
    std::unique_ptr<headless::Context> m_gl;
};
