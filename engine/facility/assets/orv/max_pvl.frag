// The standard material, lit at each vertex: fragment stage. The vertex stage documents the features.
//
// The vertices' light is multiplied by the textures:
//   colour  = diffuse light * M_DIFFUSE_TEXTURE                                    (DIFF)
//           + ambient light * M_AMBIENT_TEXTURE * M_DIFFUSE_TEXTURE where DIFF     (AMBI)
//           + highlights * gloss                                                   (SPEC)
//           + M_REFLECTION_TEXTURE * gloss, or all of it without SPEC              (REFL)
//           + M_EMISSIVE_COLOUR * M_EMISSIVE_TEXTURE                               (EMIS)
//   gloss   = M_SPECULAR_COLOUR * M_SPECULAR_LEVEL * M_SPECULAR_TEXTURE
//   opacity = M_OPACITY * alpha of M_DIFFUSE_TEXTURE where DIFF
// The alphas of the colours are ignored. Colour and opacity are straight, not premultiplied.

precision mediump float;

#ifdef UNLIT
#undef SPEC
#undef BACK
#endif
#ifdef BACK
#define SIDE(front, back) (gl_FrontFacing ? front : back)
#else
#define SIDE(front, back) front
#endif
#ifdef LINEAR
#define SHARE(colour) pow(colour, vec3(2.2))
#else
#define SHARE(colour) (colour)
#endif

#if defined(DIFF) || defined(SPEC) || defined(AMBI) || defined(EMIS)
#ifdef SHADOW
varying highp float v_u;
varying highp float v_v;
#define v_uv vec2(v_u, v_v)
#else // SHADOW
#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif
#endif // SHADOW
#endif

#ifdef SHADOW
uniform sampler2D u_s_depths;
// The reach of a soft edge in texels, 1.5; 1 / the map's side in texels; 1 / 255, negative for a directional light; the
// light's index.
uniform highp vec4 u_s_map;

varying highp float v_shadowX;
varying highp float v_shadowY;
varying highp float v_shadowDepth;
#ifdef DIFF
varying mediump vec3 v_shadowDiffuse;
#endif
#ifdef SPEC
varying mediump vec3 v_shadowSpecular;
#endif
#endif // SHADOW

uniform float u_m_opacity;
#ifdef CUTOFF
uniform float u_m_cutoff;
#endif
#ifdef VCOL
varying mediump float v_opacity;
#endif

#ifdef DIFF
uniform sampler2D u_m_diffuseTexture;

varying mediump vec3 v_diffuse;
#ifdef BACK
varying mediump vec3 v_diffuseBack;
#endif
#endif

#ifdef SPEC
uniform sampler2D u_m_specularTexture;
uniform vec4 u_m_specularColour;
uniform float u_m_specularLevel;

varying mediump vec3 v_specular;
#ifdef BACK
varying mediump vec3 v_specularBack;
#endif
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

varying mediump vec3 v_reflection;
#else
uniform sampler2D u_m_reflectionTexture;

varying mediump vec2 v_reflection;
#endif
#endif

#ifdef SHADOW
// The unshadowed share of the shadowed light: a weighted mean over nine texels of the map, which holds distances in
// red, green and blue.
float arrivingShare()
{
    highp float k = abs(u_s_map.z);
    highp float depth = u_s_map.z > 0.0 ? v_shadowDepth : 1.0;
    highp vec2 place = vec2(v_shadowX, v_shadowY);
    if (!all(greaterThan(place, vec2(0.0))) || !all(lessThan(place, vec2(depth))))
        return 1.0; // outside of the map; also avoids NaN at depth 0
    place /= u_s_map.y * depth;
    highp vec2 middle = floor(place) + 0.5;
    float share = 0.0;
    for (int y = -1; y <= 1; y++)
    {
        for (int x = -1; x <= 1; x++)
        {
            highp vec2 texel = middle + vec2(x, y);
            vec2 off = u_s_map.x - abs(texel - place);
            vec2 near = max(off - 1.0, 0.0);
            vec2 weight = 0.5 * off * off - u_s_map.x * near * near;
            highp vec3 met = texture2D(u_s_depths, texel * u_s_map.y).rgb;
            share += weight.x * weight.y * step(min(v_shadowDepth, 1.0), (met.b * k + met.g) * k + met.r);
        }
    }
    return share;
}
#endif // SHADOW

void main()
{
    vec3 colour = vec3(0.0);
    float opacity = u_m_opacity;

#ifdef SHADOW
    float arriving = u_s_map.w < 0.0 ? 1.0 : arrivingShare();
#endif // SHADOW

#ifdef DIFF
    vec4 base = texture2D(u_m_diffuseTexture, v_uv);
    base.rgb = SHARE(base.rgb);
    colour += SIDE(v_diffuse, v_diffuseBack) * base.rgb;
#ifdef SHADOW
    colour += max(SIDE(v_shadowDiffuse, -v_shadowDiffuse), 0.0) * arriving * base.rgb;
#endif // SHADOW
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
    vec3 gloss = SHARE(u_m_specularColour.rgb) * u_m_specularLevel *
                 SHARE(texture2D(u_m_specularTexture, v_uv).rgb);
    colour += SIDE(v_specular, v_specularBack) * gloss;
#ifdef SHADOW
    colour += max(SIDE(v_shadowSpecular, -v_shadowSpecular), 0.0) * arriving * gloss;
#endif // SHADOW
#endif

#ifdef REFL
#ifdef CUBE
    vec3 mirrored = textureCube(u_m_reflectionTexture, v_reflection).rgb;
#else
    vec3 mirrored = texture2D(u_m_reflectionTexture, v_reflection).rgb;
#endif
    mirrored = SHARE(mirrored);
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
