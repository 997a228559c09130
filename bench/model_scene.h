// Models as both renderers draw them: triangles with positions, normals and texture coordinates per vertex, each model
// with its own place in the world.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace model_scene {

inline constexpr int width = 1280, height = 720;

struct vertex {
  std::array<float, 3> position;  // model units
  std::array<float, 3> normal;
  std::array<float, 2> texture;  // 1 to a repeat
  auto operator<=>(const vertex&) const = default;
};

struct piece {
  std::size_t first_index, index_count;
  std::array<float, 16> transform;  // model to clip coordinates, for row vectors, row by row
};

// The whole scene. Fronts are clockwise when y points up; positive y is at the end of the frame's memory.
struct scene {
  std::vector<vertex> vertices;
  std::vector<std::uint32_t> indices;
  std::vector<piece> models;
  std::array<float, 3> colour;  // of all models in sunlight of strength 1
  std::array<float, 3> sun;     // direction
  float ambient, front, back;   // strength: ambient + cosine * (front, or back where the cosine is negative)
};

}  // namespace model_scene
