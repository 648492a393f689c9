// Waves that run outwards from the middle of a surface: lifts its vertices.

attribute vec3 a_position;
attribute vec2 a_uv0;

uniform mat4 u_t_modelViewProjection;
uniform mediump float u_time; // both stages use it, in one precision

varying vec2 v_uv0;

void main()
{
    float height = 0.025 * sin(60.0 * distance(a_uv0, vec2(0.5)) - 6.0 * u_time);
    gl_Position = u_t_modelViewProjection * vec4(a_position * (1.0 + height), 1.0);
    v_uv0 = a_uv0;
}
