// Draws velocities on the screen: fragment stage.
//
// A velocity is the movement since the last frame as a fraction of the view's width and height (x right, y up), times
// MOTION_BLUR_FACTOR and DELTA_TIME (which is 1 at 60 frames a second). Its encoding:
//   red, green  0.5 + 4 * velocity: up to an eighth of the view either way, longer ones shortened. The half is meant
//               as 127 / 255, which eight bits hold exactly, so that what rests is not blurred
//   blue        1; in a picture cleared to black, 0 says that nothing was drawn there
//   alpha       1
// motionblur.frag reads it.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

uniform float u_blurFactor;
uniform float u_deltaTime;

varying FINE vec3 v_now;
varying FINE vec3 v_before;

void main()
{
    vec2 velocity = vec2(0.0);
    // A point that was behind the eye has no previous position on the screen.
    if (v_now.z > 0.0 && v_before.z > 0.0)
        velocity = (v_now.xy / v_now.z - v_before.xy / v_before.z) * (0.5 * u_blurFactor * u_deltaTime);

    vec2 code = velocity * 4.0;
    code /= max(1.0, 2.0 * max(abs(code.x), abs(code.y)));
    gl_FragColor = vec4(code * (254.0 / 255.0) + 127.0 / 255.0, 1.0, 1.0);
}
