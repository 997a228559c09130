package velmark5;

/**
 * An image of 0xAARRGGBB pixels: something to draw, and a target to draw to. Its full size is the stored pixels plus
 * the {@linkplain #margins() margins} that were trimmed.
 */
public interface Sprite extends AutoCloseable {
  /**
   * Stored columns.
   *
   * @return the width without margins
   */
  int width();

  /**
   * Stored rows.
   *
   * @return the height without margins
   */
  int height();

  /**
   * Columns of the whole image.
   *
   * @return the width with margins
   */
  int fullWidth();

  /**
   * Rows of the whole image.
   *
   * @return the height with margins
   */
  int fullHeight();

  /**
   * The margins, none at first.
   *
   * @return how much was trimmed at each edge
   */
  Margins margins();

  /**
   * Sets the margins. The stored pixels stay.
   *
   * @param margins how much was trimmed at each edge
   */
  void setMargins(Margins margins);

  /**
   * Replaces pixels, alpha included.
   *
   * @param area the part of the stored pixels to replace, inside them
   * @param pixels the new words, row after row
   * @param offset index of the first word
   * @param stride words from one row to the next
   * @throws IllegalArgumentException if the area is not inside the stored pixels
   * @throws ArrayIndexOutOfBoundsException if the array is too short
   */
  void write(Rect area, int[] pixels, int offset, int stride);

  /**
   * Takes pixels from the frame that the toolkit draws to. Words of 0 stay 0, all others become opaque.
   *
   * @param area the part of the stored pixels to replace, inside them
   * @param frameX left edge of the part of the frame, which must lie inside it
   * @param frameY top edge of the part of the frame
   * @throws IllegalArgumentException if a rectangle is outside the sprite or the frame
   * @throws IllegalStateException if the toolkit draws to no frame
   */
  void capture(Rect area, int frameX, int frameY);

  /**
   * Takes the alpha of all stored pixels from the frame that the toolkit draws to; red, green and blue stay.
   *
   * @param frameX left edge of the part of the frame, of the sprite's size
   * @param frameY top edge of the part of the frame
   * @param channel which byte becomes the alpha
   * @throws IllegalArgumentException if the part is outside the frame
   * @throws IllegalStateException if the toolkit draws to no frame
   */
  void captureAlpha(int frameX, int frameY, Channel channel);

  /**
   * Draws the sprite as it is, by its alpha.
   *
   * @param x left edge of the full image
   * @param y top edge of the full image
   */
  default void draw(int x, int y) {
    draw(x, y, Tint.NONE, BlendMode.ALPHA);
  }

  /**
   * Draws the sprite. Like all drawing of sprites this is cut to the toolkit's clip rectangle, and does nothing without
   * a frame. Where a sprite is drawn onto its own pixels, while it is the target, they become undefined.
   *
   * @param x left edge of the full image
   * @param y top edge of the full image
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   */
  void draw(int x, int y, Tint tint, BlendMode mode);

  /**
   * Draws the sprite stretched or shrunk, nearest pixels without a filter.
   *
   * @param box where the full image goes
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   */
  void drawScaled(Rect box, Tint tint, BlendMode mode);

  /**
   * Draws the sprite stretched or shrunk, only where it is not behind what is there; depths stay. Without a depth
   * buffer every pixel is drawn.
   *
   * @param box where the full image goes
   * @param depth the sprite's depth in the units of {@link Toolkit#setDepthRange}: it is drawn where the stored depth is
   *     not smaller. A range of 0 to 1 leaves only 0, in front of everything; a wider one gives whole numbers a meaning
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   */
  void drawScaled(Rect box, int depth, Tint tint, BlendMode mode);

  /**
   * Draws the sprite by its alpha inside a shape.
   *
   * @param x left edge of the full image
   * @param y top edge of the full image
   * @param mask the shape
   * @param maskX left edge of the shape's box
   * @param maskY top edge of the shape's box
   */
  void draw(int x, int y, ClippingMask mask, int maskX, int maskY);

  /**
   * Draws the sprite turned, sheared and stretched at will, nearest pixels without a filter. Without area, or with 2^19
   * or more stored columns or rows, nothing is drawn.
   *
   * @param x0 where the full image's top left corner goes
   * @param y0 where the full image's top left corner goes
   * @param x1 where its top right corner goes
   * @param y1 where its top right corner goes
   * @param x2 where its bottom left corner goes
   * @param y2 where its bottom left corner goes
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   */
  void drawAcross(float x0, float y0, float x1, float y1, float x2, float y2, Tint tint, BlendMode mode);

  /**
   * Draws the sprite turned, sheared and stretched at will, inside a shape. Without area, or with 2^19 or more stored
   * columns or rows, nothing is drawn.
   *
   * @param x0 where the full image's top left corner goes
   * @param y0 where the full image's top left corner goes
   * @param x1 where its top right corner goes
   * @param y1 where its top right corner goes
   * @param x2 where its bottom left corner goes
   * @param y2 where its bottom left corner goes
   * @param mask the shape
   * @param maskX left edge of the shape's box
   * @param maskY top edge of the shape's box
   * @param mode {@link BlendMode#REPLACE} or {@link BlendMode#ALPHA}
   * @throws IllegalArgumentException for {@link BlendMode#ADD}
   */
  void drawAcross(
      float x0,
      float y0,
      float x1,
      float y1,
      float x2,
      float y2,
      ClippingMask mask,
      int maskX,
      int maskY,
      BlendMode mode);

  /**
   * Draws the sprite turned around its middle.
   *
   * @param x column of the middle
   * @param y row of the middle
   * @param angle radians, with the clock
   * @param scale 1 for its own size
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   */
  default void drawRotated(double x, double y, double angle, double scale, Tint tint, BlendMode mode) {
    double c = Math.cos(angle) * scale;
    double s = Math.sin(angle) * scale;
    double w = fullWidth();
    double h = fullHeight();
    double x0 = x - (w * c - h * s) / 2;
    double y0 = y - (w * s + h * c) / 2;
    drawAcross(
        (float) x0,
        (float) y0,
        (float) (x0 + w * c),
        (float) (y0 + w * s),
        (float) (x0 - h * s),
        (float) (y0 + h * c),
        tint,
        mode);
  }

  /**
   * Fills a rectangle with copies of the sprite, side by side from its top left corner.
   *
   * @param area the rectangle
   * @param tint a change of colours on the way
   * @param mode how the result combines with the frame
   * @throws IllegalArgumentException if the sprite's full size is 0 by 0 or the like
   */
  void drawTiled(Rect area, Tint tint, BlendMode mode);

  /** Gives the pixels back. If the sprite is the target, the toolkit draws to nothing from then on. */
  @Override
  void close();
}
