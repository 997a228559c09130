package velmark5;

/**
 * How the corners of faces get their place on a texture. A mapping is shared by the faces that it wraps: cylinders,
 * cubes and spheres stand about the middle of the box around those faces.
 *
 * <p>A direction is the axis of the mapping, in 1/32767 of its length; a rotation turns about it, in 1/256 of a turn.
 * Quarter turns, 0 to 3, turn the texture on its face.
 */
public sealed interface TextureMapping {
  /**
   * A plane through three vertices.
   *
   * @param origin the vertex at the texture's corner
   * @param right the vertex one repeat to the right of it
   * @param down the vertex one repeat below it
   */
  record Plane(int origin, int right, int down) implements TextureMapping {}

  /**
   * Around an axis.
   *
   * @param axis the direction
   * @param rotation turn about the axis, 1/256 of a turn
   * @param height units of the model that one repeat along the axis takes, not 0
   * @param repeats repeats around the axis, in 1/1024
   * @param quarterTurns turns of the texture
   * @param shift offset along the axis, in 1/256 of a repeat
   */
  record Cylinder(Direction axis, int rotation, int height, int repeats, int quarterTurns, int shift)
      implements TextureMapping {}

  /**
   * From six sides.
   *
   * @param axis the direction of the top
   * @param rotation turn about the axis, 1/256 of a turn
   * @param size units of the model that one repeat takes, not 0
   * @param quarterTurns turns of the texture
   * @param shiftX offset along x, in 1/256 of a repeat
   * @param shiftY offset along y
   * @param shiftZ offset along z
   */
  record Cube(Direction axis, int rotation, int size, int quarterTurns, int shiftX, int shiftY, int shiftZ)
      implements TextureMapping {}

  /**
   * All around a point, as on a globe.
   *
   * @param axis the direction of the pole
   * @param rotation turn about the axis, 1/256 of a turn
   * @param quarterTurns turns of the texture
   * @param shift offset from pole to pole, in 1/256 of a repeat
   */
  record Sphere(Direction axis, int rotation, int quarterTurns, int shift) implements TextureMapping {}

  /**
   * A direction.
   *
   * @param x right, 32767 for 1
   * @param y down
   * @param z away
   */
  record Direction(int x, int y, int z) {
    /** Straight down: y grows downward. */
    public static final Direction DOWN = new Direction(0, 32767, 0);
  }
}
