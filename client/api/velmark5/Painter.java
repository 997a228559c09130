package velmark5;

import java.awt.image.BufferedImage;
import java.util.Objects;

/**
 * Two-dimensional drawing on the toolkit's target. Everything is cut to the clip rectangle, except where a method says
 * otherwise; drawing without a target does nothing. Colours are 0xAARRGGBB.
 */
public interface Painter {
  /**
   * Fills the clip rectangle and sets no depth.
   *
   * @param colour the word that each pixel becomes
   */
  void clear(int colour);

  /** Sets every depth inside the clip rectangle to the farthest value. */
  void clearDepth();

  /**
   * Both of {@link #clear(int)} and {@link #clearDepth()} in one call.
   *
   * @param colour the word that each pixel becomes
   */
  void clearAll(int colour);

  /**
   * Fills a shape.
   *
   * @param colour the word that each pixel becomes
   * @param mask the shape
   * @param x left edge of the shape's box
   * @param y top edge of the shape's box
   */
  void fillMask(int colour, ClippingMask mask, int x, int y);

  /**
   * Fills a rectangle.
   *
   * @param x left edge
   * @param y top edge
   * @param width columns
   * @param height rows
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  void fillRect(int x, int y, int width, int height, int colour, BlendMode mode);

  /**
   * Fills a rectangle.
   *
   * @param area the rectangle
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  default void fillRect(Rect area, int colour, BlendMode mode) {
    fillRect(area.x(), area.y(), area.width(), area.height(), colour, mode);
  }

  /**
   * Draws the inner edge of a rectangle, one pixel wide, each pixel once.
   *
   * @param area the rectangle
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  default void drawRect(Rect area, int colour, BlendMode mode) {
    if (area.isEmpty()) {
      return;
    }
    int inner = area.height() - 2;
    horizontalLine(area.x(), area.y(), area.width(), colour, mode);
    if (area.height() > 1) {
      horizontalLine(area.x(), area.bottom() - 1, area.width(), colour, mode);
    }
    if (inner > 0) {
      verticalLine(area.x(), area.y() + 1, inner, colour, mode);
      if (area.width() > 1) {
        verticalLine(area.right() - 1, area.y() + 1, inner, colour, mode);
      }
    }
  }

  /**
   * Draws a line to the right.
   *
   * @param x left end
   * @param y row
   * @param length pixels
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  void horizontalLine(int x, int y, int length, int colour, BlendMode mode);

  /**
   * Draws a line downwards.
   *
   * @param x column
   * @param y upper end
   * @param length pixels
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  void verticalLine(int x, int y, int length, int colour, BlendMode mode);

  /**
   * Draws a line between two pixels, both included.
   *
   * @param x0 column of one end
   * @param y0 row of one end
   * @param x1 column of the other end
   * @param y1 row of the other end
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  void line(int x0, int y0, int x1, int y1, int colour, BlendMode mode);

  /**
   * Draws a line between two pixels inside a shape.
   *
   * @param x0 column of one end
   * @param y0 row of one end
   * @param x1 column of the other end
   * @param y1 row of the other end
   * @param colour the colour
   * @param mode how it combines with the frame
   * @param mask the shape
   * @param maskX left edge of the shape's box
   * @param maskY top edge of the shape's box
   */
  void line(int x0, int y0, int x1, int y1, int colour, BlendMode mode, ClippingMask mask, int maskX, int maskY);

  /**
   * Fills a circle. Where the target has depth, only pixels whose depth is greater than 0 change; a fresh clear is.
   *
   * @param x column of the centre
   * @param y row of the centre
   * @param radius pixels from the centre to the edge; the sign does not count
   * @param colour the colour
   * @param mode how it combines with the frame
   */
  void fillCircle(int x, int y, int radius, int colour, BlendMode mode);

  /**
   * Shifts the whole frame, and its depth, by a number of pixels in memory. Clip does not count. Rows wrap: what leaves
   * at the right comes in at the left one row below. Pixels that nothing moves into keep their old value.
   *
   * @param dx columns to the right
   * @param dy rows down
   */
  void scroll(int dx, int dy);

  /**
   * Reads pixels of the frame. Clip does not count.
   *
   * @param area the part to read, inside the target
   * @return the words, row after row without gaps
   * @throws IllegalArgumentException if the area is not inside the target
   * @throws IllegalStateException if the target has no frame
   */
  int[] readArea(Rect area);

  /**
   * Writes pixels of the frame, alpha included. Clip does not count.
   *
   * @param area the part to write, inside the target
   * @param pixels the words, row after row
   * @param offset index of the first word
   * @param stride words from one row to the next
   * @throws IllegalArgumentException if the area is not inside the target
   * @throws ArrayIndexOutOfBoundsException if the array is too short
   */
  void writeArea(Rect area, int[] pixels, int offset, int stride);

  /**
   * The clip rectangle. It starts as the whole target.
   *
   * @return the rectangle, possibly empty
   */
  Rect clip();

  /**
   * Replaces the clip rectangle.
   *
   * @param area the new rectangle, cut to the target
   */
  void setClip(Rect area);

  /**
   * Makes the clip rectangle smaller.
   *
   * @param area what it is intersected with
   */
  void narrowClip(Rect area);

  /** Makes the clip rectangle the whole target. */
  void resetClip();

  /**
   * Draws with a narrower clip rectangle and puts the old one back, also after an exception.
   *
   * @param area what the clip rectangle is intersected with
   * @param drawing what to do meanwhile
   */
  default void withClip(Rect area, Runnable drawing) {
    Objects.requireNonNull(drawing, "drawing");
    Rect saved = clip();
    narrowClip(area);
    try {
      drawing.run();
    } finally {
      setClip(saved);
    }
  }

  /**
   * Columns of the target.
   *
   * @return the width, 0 without a target
   */
  int targetWidth();

  /**
   * Rows of the target.
   *
   * @return the height, 0 without a target
   */
  int targetHeight();

  /**
   * Copies the whole frame into an image of Java 2D, for instance to save it.
   *
   * @return a new opaque image
   * @throws IllegalStateException if the target has no frame
   */
  default BufferedImage snapshot() {
    int width = targetWidth();
    int height = targetHeight();
    int[] pixels = readArea(new Rect(0, 0, width, height));
    if (pixels.length == 0) {
      throw new IllegalStateException("The target has no pixels");
    }
    BufferedImage image = new BufferedImage(width, height, BufferedImage.TYPE_INT_RGB);
    image.setRGB(0, 0, width, height, pixels, 0, width);
    return image;
  }
}
