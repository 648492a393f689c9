1.0
vertex_source_file orv#ripple.vert
fragment_source_file orv#ripple.frag
