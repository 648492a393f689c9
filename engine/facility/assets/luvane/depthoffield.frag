// A sharp and a blurred picture of a scene mixed by depth: fragment stage.
//
// M_DIFFUSE_TEXTURE   the sharp picture
// M_BLURRED_TEXTURE   the same, blurred (luvane#blur.sp)
// M_DEPTH_TEXTURE     the depth texture of the target that the sharp picture was drawn into
// M_DEPTH_RANGE       Vector2f: near and far of the camera, which turn depth into a distance; zero takes it as it is
// M_FOCUS             Vector2f: the distance that is sharp, and the distance from there to fully blurred; a second
//                     value of zero leaves everything sharp

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_uv;

uniform sampler2D u_m_diffuseTexture;
uniform sampler2D u_m_blurredTexture;
uniform FINE sampler2D u_m_depthTexture;
uniform vec2 u_m_depthRange;
uniform vec2 u_m_focus;
uniform float u_m_opacity;

void main()
{
    float range = texture2D(u_m_depthTexture, v_uv).r;
    if (u_m_depthRange.x > 0.0 && u_m_depthRange.y > u_m_depthRange.x)
        range = u_m_depthRange.x * u_m_depthRange.y / mix(u_m_depthRange.y, u_m_depthRange.x, range);

    float blurred = 0.0;
    if (u_m_focus.y > 0.0)
        blurred = clamp(abs(range - u_m_focus.x) / u_m_focus.y, 0.0, 1.0);

    vec4 colour = mix(texture2D(u_m_diffuseTexture, v_uv), texture2D(u_m_blurredTexture, v_uv), blurred);
    gl_FragColor = vec4(colour.rgb, colour.a * u_m_opacity);
}
