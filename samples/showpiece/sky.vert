// The sky: a sphere around the scene that shows the cube map in each direction.

attribute vec3 a_position;

uniform mat4 u_t_modelViewProjection;

varying vec3 v_direction;

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
    v_direction = a_position;
}
