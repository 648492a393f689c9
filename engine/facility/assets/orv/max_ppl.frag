// The standard material, lit at each pixel: fragment stage.
//
//   colour  = M_DIFFUSE_COLOUR * (diffuse light + M_SELF_ILLUMINATION) * M_DIFFUSE_TEXTURE        (DIFF)
//           + M_AMBIENT_COLOUR * ambient light * M_AMBIENT_TEXTURE * M_DIFFUSE_TEXTURE where DIFF (AMBI)
//           + highlights * gloss                                                                  (SPEC)
//           + M_REFLECTION_TEXTURE * gloss, or all of it without SPEC                             (REFL)
//           + M_EMISSIVE_COLOUR * M_EMISSIVE_TEXTURE                                              (EMIS)
//   gloss   = M_SPECULAR_COLOUR * M_SPECULAR_LEVEL * M_SPECULAR_LEVEL_TEXTURE * M_SPECULAR_TEXTURE
//   opacity = M_OPACITY * alpha of M_DIFFUSE_TEXTURE where DIFF
// The exponent of the highlights is M_SHININESS * M_GLOSS_TEXTURE; the red channel of this and of the level texture is
// used, so they need three or four channels. The alphas of the colours are ignored. Colour and opacity are straight,
// not premultiplied. Back faces are lit from their own side.
//
// A device with the minimum of 16 uniform vectors has room for two lights here; with 32, as nearly all devices have,
// there are five.

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

precision FINE float;

#ifdef LINEAR
#define SHARE(colour) pow(colour, vec3(2.2))
#else
#define SHARE(colour) (colour)
#endif

#ifdef TEXTURED
varying FINE vec2 v_uv;
#endif

#ifdef SURFACE
uniform vec4 u_t_cameraPosition;

varying FINE vec3 v_position;
varying FINE vec3 v_normal;
#ifdef BUMP
uniform sampler2D u_m_bumpTexture;

varying mediump vec3 v_tangent;
varying mediump vec3 v_binormal;
#endif
#endif

#ifdef LIT
const int LIGHTS = gl_MaxFragmentUniformVectors < 32 ? 2 : 5;

uniform mediump int u_l_count;
uniform vec4 u_l_position[LIGHTS];      // w 0: directional, xyz points towards the light
uniform vec4 u_l_diffuseColour[LIGHTS]; // highlights have the same colour
uniform float u_l_attenuationNear[LIGHTS];
uniform float u_l_attenuationReciprocal[LIGHTS];
uniform float u_l_spotInnerCos[LIGHTS];
uniform float u_l_spotOuterCos[LIGHTS];
uniform vec3 u_l_spotDirection[LIGHTS]; // points back, from the lit place towards the light
#endif

#ifdef SHADOW
uniform sampler2D u_s_depths;
// The reach of a soft edge in texels, 1.5; 1 / the map's side in texels; 1 / 255, negative for a directional light; the
// light's index.
uniform vec4 u_s_map;

varying FINE float v_shadowX;
varying FINE float v_shadowY;
varying FINE float v_shadowDepth;
#endif // SHADOW

uniform float u_m_opacity;
#ifdef CUTOFF
uniform float u_m_cutoff;
#endif
#ifdef VCOL
#define TINT * vec3(v_redGreen, v_blue)
varying mediump vec2 v_redGreen;
varying mediump float v_blue;
varying mediump float v_opacity;
#else
#define TINT
#endif

#ifdef DIFF
uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_selfIllumination;
#endif

#ifdef SPEC
uniform sampler2D u_m_specularTexture;
uniform sampler2D u_m_specularLevelTexture;
uniform sampler2D u_m_glossTexture;
uniform vec4 u_m_specularColour;
uniform float u_m_specularLevel;
uniform float u_m_shininess;
#endif

#ifdef AMBI
uniform sampler2D u_m_ambientTexture;

varying mediump vec3 v_ambient;
#endif

#ifdef EMIS
uniform sampler2D u_m_emissiveTexture;
uniform vec4 u_m_emissiveColour;
#endif

#ifdef REFL
#ifdef CUBE
uniform samplerCube u_m_reflectionTexture;
#else
uniform sampler2D u_m_reflectionTexture;

varying mediump vec3 v_eyeRight;
varying mediump vec3 v_eyeUp;
#endif
#endif

#ifdef SURFACE
// A zero vector stays zero.
vec3 safeNormalize(vec3 v)
{
    float square = dot(v, v);
    return square > 0.0 ? v * inversesqrt(square) : v;
}

vec3 surfaceNormal()
{
    vec3 normal = safeNormalize(v_normal);
#ifdef BUMP
    vec3 bump = texture2D(u_m_bumpTexture, v_uv).xyz - 0.5; // half of a normal
#ifdef INVY
    bump.y = -bump.y;
#endif
    normal = safeNormalize(v_tangent * bump.x + v_binormal * bump.y + normal * bump.z);
#endif
    return gl_FrontFacing ? normal : -normal;
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

#ifdef SHADOW
// The unshadowed share of the shadowed light: a weighted mean over nine texels of the map, which holds distances in
// red, green and blue.
float arrivingShare()
{
    float k = abs(u_s_map.z);
    float depth = u_s_map.z > 0.0 ? v_shadowDepth : 1.0;
    vec2 place = vec2(v_shadowX, v_shadowY);
    if (!all(greaterThan(place, vec2(0.0))) || !all(lessThan(place, vec2(depth))))
        return 1.0; // outside of the map; also avoids NaN at depth 0
    place /= u_s_map.y * depth;
    vec2 middle = floor(place) + 0.5;
    float share = 0.0;
    for (int y = -1; y <= 1; y++)
    {
        for (int x = -1; x <= 1; x++)
        {
            vec2 texel = middle + vec2(x, y);
            vec2 off = u_s_map.x - abs(texel - place);
            vec2 near = max(off - 1.0, 0.0);
            vec2 weight = 0.5 * off * off - u_s_map.x * near * near;
            vec3 met = texture2D(u_s_depths, texel * u_s_map.y).rgb;
            share += weight.x * weight.y * step(min(v_shadowDepth, 1.0), (met.b * k + met.g) * k + met.r);
        }
    }
    return share;
}
#endif // SHADOW

#ifdef REFL
vec3 reflectedColour(vec3 normal, vec3 toEye)
{
    vec3 direction = reflect(-toEye, normal);
#ifdef CUBE
    return textureCube(u_m_reflectionTexture, direction).rgb;
#else
    // The third axis is the one that points from the scene to the eye, in mirror images too.
    vec3 eyeBack = cross(v_eyeRight, v_eyeUp);
    eyeBack *= dot(eyeBack, toEye) < 0.0 ? -1.0 : 1.0;
    vec3 middle = safeNormalize(direction + eyeBack);
    vec2 uv = vec2(dot(middle, v_eyeRight), -dot(middle, v_eyeUp)) * 0.5 + 0.5;
    return texture2D(u_m_reflectionTexture, uv).rgb;
#endif
}
#endif

void main()
{
    vec3 colour = vec3(0.0);
    float opacity = u_m_opacity;

#ifdef SURFACE
    vec3 normal = surfaceNormal();
    vec3 toEye = safeNormalize(u_t_cameraPosition.xyz - v_position);
#endif

#ifdef SPEC
    vec3 gloss = SHARE(u_m_specularColour.rgb) * SHARE(texture2D(u_m_specularTexture, v_uv).rgb) *
                 (u_m_specularLevel * texture2D(u_m_specularLevelTexture, v_uv).r);
    float shininess = max(u_m_shininess * texture2D(u_m_glossTexture, v_uv).r, 0.0);
#endif

#ifdef LIT
    vec3 diffuse = vec3(0.0);
    vec3 specular = vec3(0.0);
    for (int i = 0; i < LIGHTS; i++)
    {
        if (i >= u_l_count)
            break;

        vec3 toLight = u_l_position[i].xyz;
        float strength = 1.0;
        if (u_l_position[i].w != 0.0)
        {
            toLight -= v_position;
            float range = length(toLight);
            toLight = safeNormalize(toLight);
            strength = fallOff(range, u_l_attenuationNear[i], u_l_attenuationReciprocal[i]);
        }
        strength *= cone(dot(toLight, u_l_spotDirection[i]), u_l_spotInnerCos[i], u_l_spotOuterCos[i]);
#ifdef SHADOW
        if (float(i) == u_s_map.w)
            strength *= arrivingShare();
#endif // SHADOW

        float facing = dot(normal, toLight);
        if (facing > 0.0)
        {
            vec3 light = u_l_diffuseColour[i].rgb * strength;
            diffuse += light * facing;
#ifdef SPEC
            float shine = dot(normal, safeNormalize(toLight + toEye));
            if (shine > 0.0)
                specular += light * pow(shine, shininess);
#endif
        }
    }
#endif

#ifdef DIFF
    vec4 base = texture2D(u_m_diffuseTexture, v_uv);
    base.rgb = SHARE(base.rgb);
    colour += SHARE(u_m_diffuseColour.rgb TINT) * (diffuse + u_m_selfIllumination) * base.rgb;
    opacity *= base.a;
#endif
#ifdef VCOL
    opacity *= v_opacity;
#endif

#ifdef AMBI
    vec3 ambient = v_ambient * SHARE(texture2D(u_m_ambientTexture, v_uv).rgb);
#ifdef DIFF
    ambient *= base.rgb;
#endif
    colour += ambient;
#endif

#ifdef SPEC
    colour += specular * gloss;
#endif

#ifdef REFL
    vec3 mirrored = SHARE(reflectedColour(normal, toEye));
#ifdef SPEC
    mirrored *= min(gloss, 1.0);
#endif
    colour += mirrored;
#endif

#ifdef EMIS
    colour += SHARE(u_m_emissiveColour.rgb) * SHARE(texture2D(u_m_emissiveTexture, v_uv).rgb);
#endif

#ifdef LINEAR
    colour = pow(max(colour, 0.0), vec3(1.0 / 2.2));
#endif
#ifdef CUTOFF
    if (opacity < u_m_cutoff)
        discard;
    opacity = 1.0;
#endif
    gl_FragColor = vec4(colour, opacity);
}
