// A windmill from a scene file, with its sails turned.
//
//   build/default/examples/01-model --out model.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    registerSource(*canvas.pool, SCENES_FOLDER, false);
    const auto scene = canvas.makeScene();
    // [cookbook
    const auto model = loadGloFile(*canvas.pool, scene, "windmill.glo");
    if (!model)
        return false; // the log says why
    AnimationController player(model->getAnimationGroup());
    if (const auto turn = model->getAnimation("turn")) // one clip; without these lines, all of them
        setLoopRange(player, turn->getStart(), turn->getEnd());
    player.setInterpolated(true); // between keys

    player.update(1.0f / 3.0f); // each frame: the seconds since the last one
    // cookbook]
    const auto camera = canvas.addCamera(scene, Vector3f(3.5f, 2.6f, 7.0f), Vector3f(0.0f, 1.7f, 0.0f));
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.62f, 0.74f, 0.85f, 1.0f));
    block.render();
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "01-model", draw);
}
