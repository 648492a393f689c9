// Draws velocities on the screen: vertex stage. It passes on the vertex's position in this frame and in the last one;
// gen_velocity.frag describes the picture.
//
// With SKIN and joints the mesh is drawn in its pose, but the velocity is that of the whole solid: the joints' last
// positions are not known here. Without joints SKIN has no effect.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;

uniform mat4 u_t_modelViewProjection;
uniform mat4 u_t_oldModelViewProjection;

#ifdef SKIN
attribute vec4 a_joints;
attribute vec4 a_weights;

uniform mat4 u_t_viewProjection;
uniform int u_j_count;
uniform mat4 u_j_world[20];
uniform float u_j_weightFilled; // 1 if GL supplies the last weight, since the mesh has fewer than four
#endif

// Clip coordinates x, y and w, divided for each pixel: divided here they would interpolate wrongly.
varying FINE vec3 v_now;
varying FINE vec3 v_before;

#ifdef SKIN
// The vertex in the world, in the pose of its joints.
vec4 posedPosition()
{
    vec4 weights = a_weights;
    weights.w *= 1.0 - u_j_weightFilled;
    float total = weights.x + weights.y + weights.z + weights.w;
    weights = total > 0.0 ? weights / total : vec4(1.0, 0.0, 0.0, 0.0);

    vec4 joints = clamp(a_joints, 0.0, float(u_j_count) - 1.0) + 0.5;
    mat4 transform = u_j_world[int(joints.x)] * weights.x + u_j_world[int(joints.y)] * weights.y +
                     u_j_world[int(joints.z)] * weights.z + u_j_world[int(joints.w)] * weights.w;
    return transform * vec4(a_position, 1.0);
}
#endif

void main()
{
    vec4 now = u_t_modelViewProjection * vec4(a_position, 1.0);
    vec4 before = u_t_oldModelViewProjection * vec4(a_position, 1.0);
    v_now = now.xyw;
    v_before = before.xyw;

    gl_Position = now;
#ifdef SKIN
    if (u_j_count > 0)
        gl_Position = u_t_viewProjection * posedPosition();
#endif
}
