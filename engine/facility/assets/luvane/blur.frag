// A picture blurred along one direction: fragment stage. Two passes, one across and one down, make a round blur.
//
// M_DIFFUSE_TEXTURE  the picture
// M_BLUR_STEP        Vector2f: the way from one of the nine samples to the next in texture coordinates, such as one
//                    texel (1 / width, 0); zero leaves the picture sharp

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_uv;

uniform sampler2D u_m_diffuseTexture;
uniform vec2 u_m_blurStep;
uniform float u_m_opacity;

void main()
{
    // Weights of a bell curve, two steps wide; they add up to 1.
    vec4 sum = texture2D(u_m_diffuseTexture, v_uv) * 0.2042;
    sum += texture2D(u_m_diffuseTexture, v_uv + u_m_blurStep) * 0.1802;
    sum += texture2D(u_m_diffuseTexture, v_uv - u_m_blurStep) * 0.1802;
    sum += texture2D(u_m_diffuseTexture, v_uv + u_m_blurStep * 2.0) * 0.1238;
    sum += texture2D(u_m_diffuseTexture, v_uv - u_m_blurStep * 2.0) * 0.1238;
    sum += texture2D(u_m_diffuseTexture, v_uv + u_m_blurStep * 3.0) * 0.0663;
    sum += texture2D(u_m_diffuseTexture, v_uv - u_m_blurStep * 3.0) * 0.0663;
    sum += texture2D(u_m_diffuseTexture, v_uv + u_m_blurStep * 4.0) * 0.0276;
    sum += texture2D(u_m_diffuseTexture, v_uv - u_m_blurStep * 4.0) * 0.0276;
    gl_FragColor = vec4(sum.rgb, sum.a * u_m_opacity);
}
