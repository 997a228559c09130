package velmark5;

/**
 * A rectangle of pixels. Its right and bottom edges are exclusive; one whose width or height is not positive is empty.
 *
 * @param x left edge
 * @param y top edge
 * @param width columns
 * @param height rows
 */
public record Rect(int x, int y, int width, int height) {
  /**
   * The rectangle between two corners.
   *
   * @param left left edge
   * @param top top edge
   * @param right right edge, exclusive
   * @param bottom bottom edge, exclusive
   * @return the rectangle; empty when the edges are crossed
   */
  public static Rect between(int left, int top, int right, int bottom) {
    return new Rect(left, top, right - left, bottom - top);
  }

  /**
   * The right edge.
   *
   * @return x + width, the first column outside, at most {@link Integer#MAX_VALUE}
   */
  public int right() {
    return (int) Math.min((long) x + width, Integer.MAX_VALUE);
  }

  /**
   * The bottom edge.
   *
   * @return y + height, the first row outside, at most {@link Integer#MAX_VALUE}
   */
  public int bottom() {
    return (int) Math.min((long) y + height, Integer.MAX_VALUE);
  }

  /**
   * Whether there is no pixel inside.
   *
   * @return true when the width or the height is not positive
   */
  public boolean isEmpty() {
    return width <= 0 || height <= 0;
  }

  /**
   * Whether a pixel lies inside.
   *
   * @param px column
   * @param py row
   * @return true when it does
   */
  public boolean contains(int px, int py) {
    return px >= x && px < right() && py >= y && py < bottom();
  }

  /**
   * The pixels that two rectangles share.
   *
   * @param other the other rectangle
   * @return the common part, empty when there is none
   */
  public Rect intersect(Rect other) {
    return between(
        Math.max(x, other.x),
        Math.max(y, other.y),
        Math.min(right(), other.right()),
        Math.min(bottom(), other.bottom()));
  }
}
