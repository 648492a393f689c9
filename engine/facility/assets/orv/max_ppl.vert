// The standard material, lit at each pixel: vertex stage. It transforms the surface to world space; the fragment stage
// lights it.
//
// Features are switched on by defines before this source:
//   DIFF SPEC AMBI REFL CUBE EMIS SKIN INVSQROOT VCOL CUTOFF LINEAR  as in max_pvl; BACK is always so, UNLIT not here
//   BUMP  normals from M_BUMP_TEXTURE, in the space of a_tangent (along u), a_binormal (along v) and a_normal
//   INVY  with BUMP: green points down in the picture, not up
//
// The texture is moved and scaled by M_UV_OFFSET_SCALE (offset u, offset v, scale u, scale v); v is flipped: it points
// up in meshes, but GL has a picture's top row at v = 0.

#if defined(DIFF) || defined(SPEC)
#define LIT
#endif
#if defined(LIT) || defined(REFL)
#define SURFACE
#endif
#if defined(DIFF) || defined(SPEC) || defined(AMBI) || defined(EMIS) || (defined(BUMP) && defined(SURFACE))
#define TEXTURED
#endif

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;
#ifdef LINEAR
#define SHARE(colour) pow(colour, vec3(2.2))
#else
#define SHARE(colour) (colour)
#endif
#ifdef VCOL
#define OWN(colour) SHARE(colour * a_colour.rgb)
attribute vec4 a_colour;
varying mediump vec2 v_redGreen; // in halves, so that eight varyings hold everything
varying mediump float v_blue;
varying mediump float v_opacity;
#else
#define OWN(colour) SHARE(colour)
#endif
#ifdef SURFACE
attribute vec3 a_normal;
#ifdef BUMP
attribute vec3 a_tangent;
attribute vec3 a_binormal;
#endif
#endif
#ifdef TEXTURED
attribute vec2 a_uv0;
#endif

#ifdef SKIN
attribute vec4 a_joints;
attribute vec4 a_weights;

uniform int u_j_count;
uniform mat4 u_j_world[20];
uniform float u_j_weightFilled; // 1 if GL supplies the last weight, since the mesh has fewer than four
uniform mat4 u_t_model;
uniform mat4 u_t_viewProjection;
#else
uniform mat4 u_t_modelViewProjection;
#ifdef SURFACE
uniform mat4 u_t_model;
uniform mat3 u_t_normalModel;
#endif
#endif

#ifdef TEXTURED
uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;
#endif

#ifdef SURFACE
varying FINE vec3 v_position;
varying FINE vec3 v_normal;
#ifdef BUMP
varying mediump vec3 v_tangent;
varying mediump vec3 v_binormal;
#endif
#endif

#ifdef SHADOW
// One light has shadows; see max_pvl.
uniform vec4 u_s_rowX; // from the world to the shadow map
uniform vec4 u_s_rowY;
uniform vec4 u_s_rowDepth;
uniform vec4 u_s_light; // w 0: directional, xyz points towards the light
uniform float u_s_offset; // of lookups along the normal; if negative, for each unit of depth

varying FINE float v_shadowX; // single ones, which can be packed better than pairs
varying FINE float v_shadowY;
varying FINE float v_shadowDepth;
#endif // SHADOW

#ifdef AMBI
const int LIGHTS = 5;

uniform mediump int u_l_count;
uniform vec4 u_l_ambientColour[LIGHTS];
uniform vec4 u_m_ambientColour;

varying mediump vec3 v_ambient;
#endif

#if defined(REFL) && !defined(CUBE)
uniform mat4 u_t_view;

// The eye's axes in the world, the same for all vertices: uniforms of the fragment stage are scarcer than varyings.
varying mediump vec3 v_eyeRight;
varying mediump vec3 v_eyeUp;
#endif

#ifdef SURFACE
// A zero vector, as a mesh with damaged normals has it, stays zero.
vec3 safeNormalize(vec3 v)
{
    float square = dot(v, v);
    return square > 0.0 ? v * inversesqrt(square) : v;
}
#endif

#ifdef SKIN
// Takes the vertex to world space: the weighted joints or, without joints, the model transform.
mat4 worldTransform()
{
    if (u_j_count == 0)
        return u_t_model;

    vec4 weights = a_weights;
    weights.w *= 1.0 - u_j_weightFilled;
    float total = weights.x + weights.y + weights.z + weights.w;
    weights = total > 0.0 ? weights / total : vec4(1.0, 0.0, 0.0, 0.0);

    vec4 joints = clamp(a_joints, 0.0, float(u_j_count) - 1.0) + 0.5;
    return u_j_world[int(joints.x)] * weights.x + u_j_world[int(joints.y)] * weights.y +
           u_j_world[int(joints.z)] * weights.z + u_j_world[int(joints.w)] * weights.w;
}

#ifdef SURFACE
// What a normal is multiplied by: the inverse transpose of the transform's upper 3x3, but for a positive factor.
mat3 normalTransform(mat4 transform)
{
    vec3 x = (transform * vec4(1.0, 0.0, 0.0, 0.0)).xyz;
    vec3 y = (transform * vec4(0.0, 1.0, 0.0, 0.0)).xyz;
    vec3 z = (transform * vec4(0.0, 0.0, 1.0, 0.0)).xyz;
    vec3 yz = cross(y, z);
    float side = dot(x, yz) < 0.0 ? -1.0 : 1.0;
    return mat3(yz * side, cross(z, x) * side, cross(x, y) * side);
}
#endif
#endif

void main()
{
#ifdef VCOL
    v_redGreen = a_colour.rg;
    v_blue = a_colour.b;
    v_opacity = a_colour.a;
#endif
#ifdef SKIN
    mat4 transform = worldTransform();
    vec4 world = transform * vec4(a_position, 1.0);
    gl_Position = u_t_viewProjection * world;
#ifdef SURFACE
    v_position = world.xyz;
    v_normal = safeNormalize(normalTransform(transform) * a_normal);
#endif
#else
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
#ifdef SURFACE
    mat4 transform = u_t_model;
    v_position = (transform * vec4(a_position, 1.0)).xyz;
    v_normal = safeNormalize(u_t_normalModel * a_normal);
#endif
#endif

#ifdef SHADOW
    vec3 outside = v_normal;
#ifdef SHEET
    outside *= dot(v_normal, u_s_light.xyz - v_position * u_s_light.w) < 0.0 ? -1.0 : 1.0;
#endif
    float depth = dot(u_s_rowDepth, vec4(v_position, 1.0));
    vec4 held = vec4(v_position + outside * (u_s_offset < 0.0 ? -u_s_offset * depth : u_s_offset), 1.0);
    v_shadowX = dot(u_s_rowX, held);
    v_shadowY = dot(u_s_rowY, held);
    v_shadowDepth = dot(u_s_rowDepth, held);
#endif // SHADOW

#if defined(BUMP) && defined(SURFACE)
    vec3 tangent = safeNormalize((transform * vec4(a_tangent, 0.0)).xyz);
    vec3 binormal = safeNormalize((transform * vec4(a_binormal, 0.0)).xyz);
    // A mesh without tangents has the same constant for both: its surface stays smooth.
    float usable = step(0.001, length(cross(tangent, binormal)));
    v_tangent = tangent * usable;
    v_binormal = binormal * usable;
#endif

#ifdef TEXTURED
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);
#endif

#ifdef AMBI
    vec3 ambient = vec3(0.0);
    for (int i = 0; i < LIGHTS; i++)
    {
        if (i >= u_l_count)
            break;
        ambient += u_l_ambientColour[i].rgb;
    }
    v_ambient = OWN(u_m_ambientColour.rgb) * ambient;
#endif

#if defined(REFL) && !defined(CUBE)
    v_eyeRight = vec3(u_t_view[0].x, u_t_view[1].x, u_t_view[2].x);
    v_eyeUp = vec3(u_t_view[0].y, u_t_view[1].y, u_t_view[2].y);
#endif
}
