package velmark5;

/**
 * The light that comes from everywhere in one direction.
 *
 * @param colour 0xRRGGBB
 * @param front strength on faces that turn to the sun
 * @param back strength on faces that turn away
 * @param x direction towards the sun; its length does not count
 * @param y direction, down; not 0
 * @param z direction
 */
public record Sun(int colour, float front, float back, float x, float y, float z) {
  /**
   * Checks the direction.
   *
   * @param colour 0xRRGGBB
   * @param front strength on faces that turn to the sun
   * @param back strength on faces that turn away
   * @param x direction
   * @param y direction, down
   * @param z direction
   * @throws IllegalArgumentException if y is 0, for shadows would have no end
   */
  public Sun {
    if (y == 0 || Float.isNaN(y)) {
      throw new IllegalArgumentException("y: a level sun casts endless shadows");
    }
  }
}
