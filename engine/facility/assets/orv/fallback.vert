// The plain default material: vertex stage. Ambient, diffuse and specular light of up to five lights at each vertex, in
// world space, and one texture. It has no features to switch; max_pvl does.
//
// The texture is moved and scaled by M_UV_OFFSET_SCALE (offset u, offset v, scale u, scale v); v is flipped: it points
// up in meshes, but GL has a picture's top row at v = 0.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

const int LIGHTS = 5;

attribute vec3 a_position;
attribute vec3 a_normal;
attribute vec2 a_uv0;

uniform mat4 u_t_model;
uniform mat4 u_t_modelViewProjection;
uniform mat3 u_t_normalModel;
uniform vec4 u_t_cameraPosition;

uniform int u_l_count;
uniform vec4 u_l_position[LIGHTS];      // w 0: directional, xyz points towards the light
uniform vec4 u_l_diffuseColour[LIGHTS]; // highlights have the same colour
uniform vec4 u_l_ambientColour[LIGHTS];
uniform float u_l_attenuationNear[LIGHTS];
uniform float u_l_attenuationReciprocal[LIGHTS];
uniform float u_l_spotInnerCos[LIGHTS];
uniform float u_l_spotOuterCos[LIGHTS];
uniform vec3 u_l_spotDirection[LIGHTS]; // points back, from the lit place towards the light

uniform vec4 u_m_uvOffsetScale;
uniform vec4 u_m_ambientColour;
uniform vec4 u_m_diffuseColour;
uniform vec4 u_m_emissiveColour;
uniform vec4 u_m_specularColour;
uniform float u_m_specularLevel;
uniform float u_m_shininess;

varying FINE vec2 v_uv;
varying mediump vec3 v_light;      // multiplied by the texture
varying mediump vec3 v_highlights; // added to it

// A zero vector, as a mesh with damaged normals has it, stays zero.
vec3 safeNormalize(vec3 v)
{
    float square = dot(v, v);
    return square > 0.0 ? v * inversesqrt(square) : v;
}

// 1 inside the inner cone, 0 outside the outer one. An inner cosine of -1 means a light that shines everywhere.
float cone(float cosine, float inner, float outer)
{
    float x = inner > outer ? smoothstep(outer, inner, cosine) : step(outer, cosine);
    return inner <= -1.0 ? 1.0 : x;
}

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);

    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);

    vec3 position = (u_t_model * vec4(a_position, 1.0)).xyz;
    vec3 normal = safeNormalize(u_t_normalModel * a_normal);
    vec3 toEye = safeNormalize(u_t_cameraPosition.xyz - position);

    vec3 ambient = vec3(0.0);
    vec3 diffuse = vec3(0.0);
    vec3 specular = vec3(0.0);
    for (int i = 0; i < LIGHTS; i++)
    {
        if (i >= u_l_count)
            break;

        ambient += u_l_ambientColour[i].rgb;

        vec3 toLight = u_l_position[i].xyz;
        float strength = 1.0;
        if (u_l_position[i].w != 0.0)
        {
            toLight -= position;
            float range = length(toLight);
            toLight = safeNormalize(toLight);
            strength = 1.0 - clamp((range - u_l_attenuationNear[i]) * u_l_attenuationReciprocal[i], 0.0, 1.0);
        }
        strength *= cone(dot(toLight, u_l_spotDirection[i]), u_l_spotInnerCos[i], u_l_spotOuterCos[i]);

        float facing = dot(normal, toLight);
        float shine = dot(normal, safeNormalize(toLight + toEye));
        vec3 light = u_l_diffuseColour[i].rgb * strength;
        if (facing > 0.0)
            diffuse += light * facing;
        if (facing > 0.0 && shine > 0.0)
            specular += light * pow(shine, max(u_m_shininess, 0.0));
    }

    v_light = u_m_emissiveColour.rgb + u_m_ambientColour.rgb * ambient + u_m_diffuseColour.rgb * diffuse;
    v_highlights = u_m_specularColour.rgb * u_m_specularLevel * specular;
}
