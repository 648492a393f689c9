// Falling snow or rain over a flat shape: fragment stage. Three layers of flakes, the nearer the larger and faster, on a
// transparent ground.
//
// M_DIFFUSE_TEXTURE  a flake, upright; its alpha counts (white gives soft discs)
// M_DIFFUSE_COLOUR   the colour of the flakes, M_OPACITY their opacity; straight, not premultiplied
// M_WEATHER_FALL     Vector2f: flake distances a second, to the right and down; zero is gentle snow. Multiples of 0.2
//                    pass TIME's new start every 60 seconds without a jump
// M_WEATHER_STRETCH  float: how many times longer than wide a flake is, for rain; below 1 is 1

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_uv;

uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;
uniform vec2 u_m_weatherFall;
uniform float u_m_weatherStretch;
uniform float u_time;

const float PERIOD = 12.0; // cells after which a layer repeats

// Two numbers from 0 to 1 for a cell, steady from frame to frame.
vec2 scatter(vec2 cell)
{
    vec2 p = mod(cell, PERIOD) + 1.0;
    return fract(vec2(p.x * 0.7548 + p.y * p.x * 0.3137, p.y * 0.5698 + p.x * p.y * 0.1873));
}

// What a layer of so many flakes a unit covers at this place.
float layer(float cells)
{
    vec2 fall = u_m_weatherFall == vec2(0.0) ? vec2(0.2, 0.6) : u_m_weatherFall;
    float stretch = max(u_m_weatherStretch, 1.0);

    vec2 place = v_uv * vec2(cells, cells / stretch) + mod(vec2(-fall.x, fall.y) * u_time, PERIOD);
    place.y += 0.618 * mod(floor(place.x), PERIOD); // no rows
    vec2 cell = floor(place);
    vec2 middle = 0.25 + 0.5 * scatter(cell + cells);
    vec2 across = (place - cell - middle) * vec2(stretch, 1.0) * 4.0; // -1 to 1 in the flake
    float disc = 1.0 - smoothstep(0.4, 1.0, length(across));
    return disc * texture2D(u_m_diffuseTexture, vec2(0.5) + vec2(0.5, -0.5) * across).a;
}

void main()
{
    float cover = max(layer(6.0), max(0.75 * layer(11.0), 0.5 * layer(19.0)));
    gl_FragColor = vec4(u_m_diffuseColour.rgb, cover * u_m_opacity);
}
