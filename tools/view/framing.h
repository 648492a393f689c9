#pragma once

#include <vector>

class Stage;

/// Looks at the whole scene from the front, a little from the right and above, so that it fills a viewport of
/// that size at all of the times together. Draws a few frames to see where the scene is.
void frameScene(Stage& stage, const std::vector<float>& times, int width, int height);
