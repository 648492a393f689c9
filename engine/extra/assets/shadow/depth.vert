// Distances from a light, for shadow maps: vertex stage. Distances are linear, in units of the map's range.
//
// Features are switched on by defines that stand in front of this text:
//   SKIN    the vertex follows up to four joints
//   CUTOFF  pixels whose opacity is below M_CUTOFF let light through
//   DIFF    with CUTOFF: the alpha of M_DIFFUSE_TEXTURE counts
//   VCOL    with CUTOFF: the alpha of a_colour counts

attribute vec3 a_position;

uniform mat4 u_s_model;
uniform mat4 u_s_clip;  // from the world
uniform vec4 u_s_depth; // likewise

varying highp float v_depth;

#ifdef SKIN
attribute vec4 a_joints;
attribute vec4 a_weights;

uniform int u_j_count;
uniform mat4 u_j_world[20];
uniform float u_j_weightFilled; // 1 if GL supplies the last weight, since the mesh has fewer than four
#endif

#ifdef CUTOFF
#ifdef DIFF
attribute vec2 a_uv0;

uniform vec4 u_m_uvOffsetScale;

varying highp vec2 v_uv;
#endif
#ifdef VCOL
attribute vec4 a_colour;

varying mediump float v_opacity;
#endif
#endif

#ifdef SKIN
// Takes the vertex to world space: the weighted joints or, without joints, the model transform.
mat4 worldTransform()
{
    if (u_j_count == 0)
        return u_s_model;

    vec4 weights = a_weights;
    weights.w *= 1.0 - u_j_weightFilled;
    float total = weights.x + weights.y + weights.z + weights.w;
    weights = total > 0.0 ? weights / total : vec4(1.0, 0.0, 0.0, 0.0);

    vec4 joints = clamp(a_joints, 0.0, float(u_j_count) - 1.0) + 0.5;
    return u_j_world[int(joints.x)] * weights.x + u_j_world[int(joints.y)] * weights.y +
           u_j_world[int(joints.z)] * weights.z + u_j_world[int(joints.w)] * weights.w;
}
#else
#define worldTransform() u_s_model
#endif

void main()
{
    vec4 world = worldTransform() * vec4(a_position, 1.0);
    gl_Position = u_s_clip * world;
    v_depth = dot(u_s_depth, world);

#ifdef CUTOFF
#ifdef DIFF
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);
#endif
#ifdef VCOL
    v_opacity = a_colour.a;
#endif
#endif
}
