// Composes a sharp picture and the velocities of orv#gen_velocity.sp into a blurred one: vertex stage.
//
// Draw it with the built-in square (corners at -0.5 and 0.5), which then fills the viewport, wherever camera and solid
// are. Both textures are render targets, which have their bottom row first, so v is not flipped.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;

varying FINE vec2 v_uv;

void main()
{
    gl_Position = vec4(a_position.xy * 2.0, 0.0, 1.0);
    v_uv = a_position.xy + 0.5;
}
