// Triangles drawn by your own GL calls, between two frames of the engine.
//
//   build/default/examples/10-owngl --out owngl.png

#include "canvas.h"

#include <GLES2/gl2.h>

using namespace orv;

/// A program that draws corners coloured by their position.
static GLuint makeProgram()
{
    const char* const sources[] = {
        "attribute vec2 a_corner; varying vec2 v_corner;"
        "void main() { gl_Position = vec4(a_corner, 0.0, 1.0); v_corner = a_corner; }",
        "precision mediump float; varying vec2 v_corner;"
        "void main() { gl_FragColor = vec4(v_corner * 0.5 + 0.5, 0.6, 1.0); }"};
    const GLuint program = glCreateProgram();
    for (int i = 0; i < 2; ++i)
    {
        const GLuint shader = glCreateShader(i == 0 ? GL_VERTEX_SHADER : GL_FRAGMENT_SHADER);
        glShaderSource(shader, 1, &sources[i], nullptr);
        glCompileShader(shader);
        glAttachShader(program, shader);
        glDeleteShader(shader); // with the program
    }
    glBindAttribLocation(program, 0, "a_corner");
    glLinkProgram(program);
    return program;
}

static bool draw(Canvas& canvas)
{
    const auto scene = canvas.makeScene();
    const auto cube = createCube(*canvas.pool, Vector2f(1.0f, 1.0f));
    if (!canvas.add(cube, scene, Colour4f(0.85f, 0.85f, 0.8f, 1.0f), {}))
        return false;
    const auto camera = canvas.addCamera(scene, Vector3f(2.5f, 2.0f, 5.0f), {});
    RenderBlock block(canvas.renderer, scene, camera);
    block.render(); // one frame, which leaves the GL state of its last draw
    const GLuint program = makeProgram();
    const float corners[] = {-0.95f, -0.9f, -0.55f, -0.9f, -0.75f, -0.3f,
                             0.95f,  0.9f,  0.55f,  0.9f,  0.75f,  0.3f};
    // [cookbook
    block.render();
    glUseProgram(program); // bindings need not be restored
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 0, corners);
    glEnableVertexAttribArray(0);
    glDisable(GL_DEPTH_TEST); // render state has to be restored
    glDrawArrays(GL_TRIANGLES, 0, 6);
    glEnable(GL_DEPTH_TEST);
    // cookbook]
    glDeleteProgram(program);
    RenderBlock inset(canvas.renderer, scene, camera); // the engine draws as before
    inset.setViewport(canvas.getWidth() - 130, 10, 120, 70);
    inset.setBackgroundColour(Colour4f(0.3f, 0.35f, 0.45f, 1.0f));
    inset.getBackground().setViewportOnly(true);
    inset.render();
    return glGetError() == GL_NO_ERROR;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "10-owngl", draw);
}
