1.0
vertex_source_file orv#base.vert
fragment_source_file orv#base.frag

uniform u_t_modelViewProjection T_MODEL_VIEW_PROJECTION
