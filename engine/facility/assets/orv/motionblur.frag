// Composes a sharp picture and the velocities of orv#gen_velocity.sp into a blurred one: fragment stage.
//
// M_SHARP_TEXTURE     the scene as it is
// M_VELOCITY_TEXTURE  coded as gen_velocity.frag says; black is rest. May be smaller than the sharp picture
// A pixel becomes the mean of at most 17 samples along its velocity, centred on itself; samples outside the view are
// left out. Pixels at rest are unchanged, to the bit. STEREO: the left half of both pictures is the left eye's view,
// the right half the right eye's.

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
    vec4 sharp = texture2D(u_m_sharpTexture, v_uv);

    // Both terms fade alike where a smaller picture is interpolated between objects and black.
    vec2 velocity = code.rg - code.b * (127.0 / 255.0);
    if (max(abs(velocity.x), abs(velocity.y)) < 0.25 / 255.0)
    {
        gl_FragColor = sharp;
        return;
    }
    velocity *= 0.25 * 255.0 / 254.0;

    vec2 low = vec2(0.0);
    vec2 high = vec2(1.0);
#ifdef STEREO
    velocity.x *= 0.5;
    low.x = 0.5 * step(0.5, v_uv.x);
    high.x = low.x + 0.5;
#endif
    // Samples end at the centre of the outermost pixels, minus a margin for rounding: filtering would mix in texels
    // beyond the edge. The pixel size follows from this pixel's position.
    vec2 pixel = v_uv / gl_FragCoord.xy;
    low += 0.49 * pixel;
    high -= 0.49 * pixel;

    // Pairs one pixel apart, as far as there are enough.
    vec2 reach = abs(velocity) * 0.5 / pixel;
    float pairs = clamp(ceil(max(reach.x, reach.y)), 1.0, 8.0);
    vec2 stride = velocity * 0.5 / pairs;
    vec4 sum = sharp;
    float count = 1.0;
    for (int i = 1; i <= 8; i++)
    {
        if (float(i) > pairs)
            break;
        vec2 ahead = v_uv + stride * float(i);
        vec2 behind = v_uv - stride * float(i);
        float aheadCounts = float(ahead == clamp(ahead, low, high));
        float behindCounts = float(behind == clamp(behind, low, high));
        sum += texture2D(u_m_sharpTexture, ahead) * aheadCounts + texture2D(u_m_sharpTexture, behind) * behindCounts;
        count += aheadCounts + behindCounts;
    }
    gl_FragColor = sum / count;
}
