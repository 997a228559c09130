// What the client promises of a mesh: counts within their limits, arrays as long as their counts, and every number in
// them (vertices, faces, labels, mappings, textures) one that exists. Faces that are not drawn keep the promise too:
// their vertices and textures are looked at. What no model is made of is not: mappings where no face keeps its texture,
// the reference points of planes that no textured face lies on, points that are not counted, labels that no function
// asks for.
#pragma once

struct mesh_views;
class model;
class toolkit;

namespace mesh_contract {

// Raises for the first broken promise, naming the argument.
void check(const mesh_views& mesh, const toolkit& scene);

// Raises for a model whose pool is gone.
void has_storage(const model& mesh);

}  // namespace mesh_contract
