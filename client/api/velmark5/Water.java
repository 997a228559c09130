package velmark5;

/**
 * What the world looks like under water: everything below a height fades to a colour.
 *
 * @param height the water's surface, in units of the world, down
 * @param colour 0xRRGGBB that things fade to
 * @param range depth at which nothing else is seen, not 0
 */
public record Water(int height, int colour, int range) {
  /**
   * Checks the range.
   *
   * @param height the water's surface
   * @param colour 0xRRGGBB that things fade to
   * @param range depth at which nothing else is seen
   * @throws IllegalArgumentException if the range is 0
   */
  public Water {
    if (range == 0) {
      throw new IllegalArgumentException("range: 0 has no depth to fade over");
    }
  }
}
