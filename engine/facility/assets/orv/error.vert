// Replaces a program that could not be built: vertex stage. The mesh is drawn in its place, with the error picture
// upright on it (v points up in meshes and down in pictures).

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;
attribute vec2 a_uv0;

uniform mat4 u_t_modelViewProjection;

varying FINE vec2 v_uv;

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
    v_uv = vec2(a_uv0.x, 1.0 - a_uv0.y);
}
