// The standard material, lit at each vertex: vertex stage.
//
// Features are switched on by defines before this source:
//   DIFF       diffuse light on M_DIFFUSE_COLOUR, and M_SELF_ILLUMINATION as light of the surface's own
//   SPEC       highlights (half-vector model, exponent M_SHININESS)
//   AMBI       M_AMBIENT_COLOUR in the sum of all L_AMBIENT_COLOUR
//   REFL       M_REFLECTION_TEXTURE as a sphere map, seen from the eye
//   CUBE       with REFL: the reflection is a cube map, in world directions
//   EMIS       M_EMISSIVE_COLOUR, whatever the light
//   SKIN       the vertex follows up to four joints
//   VCOL       a_colour multiplies the diffuse and ambient colours, and its alpha the opacity
//   CUTOFF     pixels whose opacity is below M_CUTOFF are left out, all others are opaque
//   BACK       back faces are lit from their own side
//   UNLIT      diffuse light is 1, whatever the lights; no highlights
//   LINEAR     colours and textures are taken from sRGB (2.2) before they are lit, and the sum is given back to it
//   INVSQROOT  a light's fall-off is x * inversesqrt(x), the root, of the usual straight line x: brighter for longer,
//              then a steep end, as the lamps of some authoring tools have it
//
// Lighting is done in world space. The texture is moved and scaled by M_UV_OFFSET_SCALE (offset u, offset v, scale
// u, scale v); v is flipped: it points up in meshes, but GL has a picture's top row at v = 0.
//
// All features together fit into the 128 uniform vectors that every device has, including literals, each of which may
// count as one.

#ifdef UNLIT
#undef SPEC
#undef BACK
#elif defined(DIFF) || defined(SPEC)
#define LIT
#endif
#if defined(LIT) || defined(REFL)
#define SURFACE
#endif
#if defined(DIFF) || defined(SPEC) || defined(AMBI) || defined(EMIS)
#define TEXTURED
#endif

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

#ifdef LINEAR
#define SHARE(colour) pow(colour, vec3(2.2))
#else
#define SHARE(colour) (colour)
#endif
#ifdef VCOL
#define OWN(colour) SHARE(colour * a_colour.rgb)
attribute vec4 a_colour;
varying mediump float v_opacity;
#else
#define OWN(colour) SHARE(colour)
#endif

attribute vec3 a_position;
#ifdef SURFACE
attribute vec3 a_normal;
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

#ifdef SHADOW
varying FINE float v_u; // single ones, which can be packed better than pairs
varying FINE float v_v;
#else // SHADOW
varying FINE vec2 v_uv;
#endif // SHADOW
#endif

#ifdef SHADOW
// One light has shadows. This code is not in liborv but in liborvextra, in the programs shadow#... of ShadowMap. With
// SHEET the surface is visible from both sides.
uniform vec4 u_s_rowX; // from the world to the shadow map
uniform vec4 u_s_rowY;
uniform vec4 u_s_rowDepth;
uniform float u_s_offset; // of lookups along the normal; if negative, for each unit of depth
uniform float u_s_index; // of the light

varying FINE float v_shadowX;
varying FINE float v_shadowY;
varying FINE float v_shadowDepth;
// That light's contribution to the front or, if negative and with BACK, to the back.
#ifdef DIFF
varying mediump vec3 v_shadowDiffuse;
#endif
#ifdef SPEC
varying mediump vec3 v_shadowSpecular;
#endif
#endif // SHADOW

#ifdef SURFACE
uniform vec4 u_t_cameraPosition;
#endif

#if defined(LIT) || defined(AMBI)
const int LIGHTS = 5;

uniform int u_l_count;
#endif

#ifdef LIT
uniform vec4 u_l_position[LIGHTS];      // w 0: directional, xyz points towards the light
uniform vec4 u_l_diffuseColour[LIGHTS]; // highlights have the same colour
uniform float u_l_attenuationNear[LIGHTS];
uniform float u_l_attenuationReciprocal[LIGHTS];
uniform float u_l_spotInnerCos[LIGHTS];
uniform float u_l_spotOuterCos[LIGHTS];
uniform vec3 u_l_spotDirection[LIGHTS]; // points back, from the lit place towards the light
#endif

#ifdef DIFF
uniform vec4 u_m_diffuseColour;
uniform float u_m_selfIllumination;

varying mediump vec3 v_diffuse;
#ifdef BACK
varying mediump vec3 v_diffuseBack;
#endif
#endif

#ifdef SPEC
uniform float u_m_shininess;

varying mediump vec3 v_specular;
#ifdef BACK
varying mediump vec3 v_specularBack;
#endif
#endif

#ifdef AMBI
uniform vec4 u_l_ambientColour[LIGHTS];
uniform vec4 u_m_ambientColour;

varying mediump vec3 v_ambient;
#endif

#ifdef REFL
#ifdef CUBE
varying mediump vec3 v_reflection;
#else
uniform mat4 u_t_view;

varying mediump vec2 v_reflection;
#endif
#endif

// A zero vector, as a mesh with damaged normals has it, stays zero.
vec3 safeNormalize(vec3 v)
{
    float square = dot(v, v);
    return square > 0.0 ? v * inversesqrt(square) : v;
}

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

// The matrix for normals: the inverse transpose of the transform's upper 3x3, up to a positive factor.
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

#ifdef LIT
// 1 up to the light's near distance, then falling to 0 at its far one. A reciprocal of 0 never falls.
float fallOff(float range, float near, float reciprocal)
{
    float x = 1.0 - clamp((range - near) * reciprocal, 0.0, 1.0);
#ifdef INVSQROOT
    x = sqrt(x);
#endif
    return x;
}

// 1 inside the inner cone, 0 outside the outer one. An inner cosine of -1 means a light that shines everywhere.
float cone(float cosine, float inner, float outer)
{
    float x = inner > outer ? smoothstep(outer, inner, cosine) : step(outer, cosine);
    return inner <= -1.0 ? 1.0 : x;
}
#endif

#if defined(REFL) && !defined(CUBE)
// The sphere map coordinates of a direction in eye space.
vec2 sphereMap(vec3 direction)
{
    vec2 middle = safeNormalize(direction + vec3(0.0, 0.0, 1.0)).xy;
    return vec2(middle.x, -middle.y) * 0.5 + 0.5;
}
#endif

void main()
{
#ifdef SKIN
    mat4 transform = worldTransform();
    vec4 world = transform * vec4(a_position, 1.0);
    gl_Position = u_t_viewProjection * world;
#ifdef SURFACE
    vec3 position = world.xyz;
    vec3 normal = safeNormalize(normalTransform(transform) * a_normal);
#endif
#else
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
#ifdef SURFACE
    vec3 position = (u_t_model * vec4(a_position, 1.0)).xyz;
    vec3 normal = safeNormalize(u_t_normalModel * a_normal);
#endif
#endif

#ifdef TEXTURED
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
#ifdef SHADOW
    v_u = uv.x;
    v_v = 1.0 - uv.y;
#else // SHADOW
    v_uv = vec2(uv.x, 1.0 - uv.y);
#endif // SHADOW
#endif

#ifdef SURFACE
    vec3 toEye = safeNormalize(u_t_cameraPosition.xyz - position);
#endif

#ifdef LIT
    vec3 diffuse = vec3(0.0);
    vec3 specular = vec3(0.0);
#ifdef BACK
    vec3 diffuseBack = vec3(0.0);
    vec3 specularBack = vec3(0.0);
#endif
#ifdef SHADOW
    vec3 outside = normal;
    vec3 shadowDiffuse = vec3(0.0);
    vec3 shadowSpecular = vec3(0.0);
#endif // SHADOW
    for (int i = 0; i < LIGHTS; i++)
    {
        if (i >= u_l_count)
            break;

        vec3 toLight = u_l_position[i].xyz;
        float strength = 1.0;
        if (u_l_position[i].w != 0.0)
        {
            toLight -= position;
            float range = length(toLight);
            toLight = safeNormalize(toLight);
            strength = fallOff(range, u_l_attenuationNear[i], u_l_attenuationReciprocal[i]);
        }
        strength *= cone(dot(toLight, u_l_spotDirection[i]), u_l_spotInnerCos[i], u_l_spotOuterCos[i]);

        float facing = dot(normal, toLight);
        vec3 light = u_l_diffuseColour[i].rgb * strength;
#ifdef SPEC
        float shine = dot(normal, safeNormalize(toLight + toEye));
        float shininess = max(u_m_shininess, 0.0);
#endif
#ifdef SHADOW
        if (float(i) == u_s_index)
        {
#ifdef SHEET
            outside *= facing < 0.0 ? -1.0 : 1.0;
#endif
#ifdef BACK
            float side = facing < 0.0 ? -1.0 : 1.0;
#else
            float side = facing > 0.0 ? 1.0 : 0.0;
#endif
            shadowDiffuse = light * abs(facing) * side;
#ifdef SPEC
            if (shine * side > 0.0)
                shadowSpecular = light * pow(abs(shine), shininess) * side;
#endif
            light = vec3(0.0);
        }
#endif // SHADOW
        if (facing > 0.0)
        {
            diffuse += light * facing;
#ifdef SPEC
            if (shine > 0.0)
                specular += light * pow(shine, shininess);
#endif
        }
#ifdef BACK
        if (facing < 0.0)
        {
            diffuseBack -= light * facing;
#ifdef SPEC
            if (shine < 0.0)
                specularBack += light * pow(-shine, shininess);
#endif
        }
#endif
    }
#endif

#ifdef DIFF
    vec3 own = OWN(u_m_diffuseColour.rgb);
#ifdef UNLIT
    v_diffuse = own;
#else
    v_diffuse = own * (diffuse + u_m_selfIllumination);
#ifdef BACK
    v_diffuseBack = own * (diffuseBack + u_m_selfIllumination);
#endif
#endif
#endif
#ifdef SPEC
    v_specular = specular;
#ifdef BACK
    v_specularBack = specularBack;
#endif
#endif
#ifdef VCOL
    v_opacity = a_colour.a;
#endif

#ifdef SHADOW
#ifdef DIFF
    v_shadowDiffuse = own * shadowDiffuse;
#endif
#ifdef SPEC
    v_shadowSpecular = shadowSpecular;
#endif
    float depth = dot(u_s_rowDepth, vec4(position, 1.0));
    vec4 held = vec4(position + outside * (u_s_offset < 0.0 ? -u_s_offset * depth : u_s_offset), 1.0);
    v_shadowX = dot(u_s_rowX, held);
    v_shadowY = dot(u_s_rowY, held);
    v_shadowDepth = dot(u_s_rowDepth, held);
#endif // SHADOW

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

#ifdef REFL
    vec3 reflection = reflect(-toEye, normal);
#ifdef CUBE
    v_reflection = reflection;
#else
    v_reflection = sphereMap((u_t_view * vec4(reflection, 0.0)).xyz);
#endif
#endif
}
