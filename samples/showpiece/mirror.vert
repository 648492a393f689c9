// A planar mirror: passes on the clip position, with which the fragment stage looks up the mirror image.

attribute vec3 a_position;

uniform mat4 u_t_modelViewProjection;

varying vec3 v_clip;

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
    v_clip = gl_Position.xyw;
}
