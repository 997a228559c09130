package velmark5;

import java.util.Objects;

/**
 * A shape of one horizontal run of pixels per row, from which a {@link ClippingMask} is made.
 *
 * @param width columns of the shape's box
 * @param height rows of the shape's box, as many as there are runs
 * @param starts for each row the first column of its run, from the left of the box
 * @param lengths for each row the pixels of its run; a row of 0 or less shows nothing
 */
public record Spans(int width, int height, int[] starts, int[] lengths) {
  /**
   * Checks the shape.
   *
   * @param width columns of the shape's box
   * @param height rows of the shape's box
   * @param starts first column of each row's run
   * @param lengths pixels of each row's run
   * @throws IllegalArgumentException if there are not {@code height} starts and lengths, or the width is negative
   */
  public Spans {
    Objects.requireNonNull(starts, "starts");
    Objects.requireNonNull(lengths, "lengths");
    if (width < 0) {
      throw new IllegalArgumentException("width: " + width + " is negative");
    }
    if (starts.length != height || lengths.length != height) {
      throw new IllegalArgumentException(
          "rows: " + starts.length + " starts and " + lengths.length + " lengths for a height of " + height);
    }
  }

  /**
   * The ellipse that fills a box.
   *
   * @param width columns, not negative
   * @param height rows, not negative
   * @return the shape
   */
  public static Spans ellipse(int width, int height) {
    return roundedRectangle(width, height, width / 2.0, height / 2.0);
  }

  /**
   * A rectangle with rounded corners.
   *
   * @param width columns, not negative
   * @param height rows, not negative
   * @param radius radius of the corners in pixels, at most half of the shorter side
   * @return the shape
   */
  public static Spans roundedRectangle(int width, int height, double radius) {
    double r = Math.max(0, Math.min(radius, Math.min(width, height) / 2.0));
    return roundedRectangle(width, height, r, r);
  }

  /** Corners are quarters of an ellipse; a pixel belongs to the shape when its centre does. */
  private static Spans roundedRectangle(int width, int height, double rx, double ry) {
    int[] starts = new int[Math.max(height, 0)];
    int[] lengths = new int[starts.length];
    for (int row = 0; row < starts.length; row++) {
      double outside = Math.max(0, Math.max(ry - (row + 0.5), row + 0.5 - (height - ry)));
      double inset = ry == 0 ? 0 : rx - rx * Math.sqrt(Math.max(0, 1 - outside * outside / (ry * ry)));
      starts[row] = (int) Math.round(inset);
      lengths[row] = width - 2 * starts[row];
    }
    return new Spans(width, height, starts, lengths);
  }
}
