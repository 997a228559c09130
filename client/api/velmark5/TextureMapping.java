package velmark5;

import java.util.Objects;

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
      implements TextureMapping {
    /**
     * Checks the height.
     *
     * @param axis the direction
     * @param rotation turn about the axis
     * @param height units of the model that one repeat takes
     * @param repeats repeats around the axis
     * @param quarterTurns turns of the texture
     * @param shift offset along the axis
     * @throws IllegalArgumentException if the height is 0
     */
    public Cylinder {
      Objects.requireNonNull(axis, "axis");
      requireLength("height", height);
    }
  }

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
      implements TextureMapping {
    /**
     * Checks the size.
     *
     * @param axis the direction of the top
     * @param rotation turn about the axis
     * @param size units of the model that one repeat takes
     * @param quarterTurns turns of the texture
     * @param shiftX offset along x
     * @param shiftY offset along y
     * @param shiftZ offset along z
     * @throws IllegalArgumentException if the size is 0
     */
    public Cube {
      Objects.requireNonNull(axis, "axis");
      requireLength("size", size);
    }

    /**
     * Upright and not turned, one repeat for each {@code size} units.
     *
     * @param size units of the model that one repeat takes, not 0
     */
    public Cube(int size) {
      this(Direction.DOWN, 0, size, 0, 0, 0, 0);
    }
  }

  /**
   * All around a point, as on a globe.
   *
   * @param axis the direction of the pole
   * @param rotation turn about the axis, 1/256 of a turn
   * @param quarterTurns turns of the texture
   * @param shift offset from pole to pole, in 1/256 of a repeat
   */
  record Sphere(Direction axis, int rotation, int quarterTurns, int shift) implements TextureMapping {
    /**
     * Checks the axis.
     *
     * @param axis the direction of the pole
     * @param rotation turn about the axis
     * @param quarterTurns turns of the texture
     * @param shift offset from pole to pole
     */
    public Sphere {
      Objects.requireNonNull(axis, "axis");
    }
  }

  private static void requireLength(String name, int units) {
    if (units == 0 || Math.abs((long) units) > Integer.MAX_VALUE / 64) {
      throw new IllegalArgumentException(name + ": no repeat takes " + units + " units");
    }
  }

  /**
   * A direction, of length 32767. {@link #towards} makes one of that length.
   *
   * @param x right, 32767 for 1
   * @param y down
   * @param z away
   */
  record Direction(int x, int y, int z) {
    /** Straight down: y grows downward. */
    public static final Direction DOWN = new Direction(0, 32767, 0);

    private static final int ONE = 32767;

    /**
     * Checks the ranges.
     *
     * @param x right
     * @param y down
     * @param z away
     * @throws IllegalArgumentException if a number is not from -32767 to 32767
     */
    public Direction {
      for (int number : new int[] {x, y, z}) {
        if (Math.abs((long) number) > ONE) {
          throw new IllegalArgumentException("direction: " + number + " is not from -32767 to 32767");
        }
      }
    }

    /**
     * The direction of a vector.
     *
     * @param x right
     * @param y down
     * @param z away
     * @return the direction, whatever the vector's length
     * @throws IllegalArgumentException if all three are 0
     */
    public static Direction towards(double x, double y, double z) {
      double length = Math.sqrt(x * x + y * y + z * z);
      if (!(length > 0)) {
        throw new IllegalArgumentException("direction: no length");
      }
      double scale = ONE / length;
      return new Direction((int) Math.round(x * scale), (int) Math.round(y * scale), (int) Math.round(z * scale));
    }
  }
}
