1.0
vertex_source_file orv#fog.vert
fragment_source_file orv#fog.frag
