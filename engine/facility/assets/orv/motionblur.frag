// Composes a sharp picture and the velocities of orv#gen_velocity.sp into a blurred one: fragment stage.
//
// M_SHARP_TEXTURE     the scene as it is
// M_VELOCITY_TEXTURE  coded as gen_velocity.frag says; black is rest
// A pixel becomes the mean of nine along its velocity, with itself in the middle.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

uniform sampler2D u_m_sharpTexture;
uniform sampler2D u_m_velocityTexture;

varying FINE vec2 v_uv;

void main()
{
    vec3 code = texture2D(u_m_velocityTexture, v_uv).rgb;
    vec2 velocity = (code.rg - 127.0 / 255.0) * (255.0 / 254.0) * 0.25 * code.b;

    vec4 sum = vec4(0.0);
    for (int i = -4; i <= 4; i++)
        sum += texture2D(u_m_sharpTexture, v_uv + velocity * (float(i) / 8.0));
    gl_FragColor = sum / 9.0;
}
