1.0
vertex_source_file orv#base.vert
fragment_source_file orv#base.frag
