package velmark5;

/** A shape that limits drawing to one run of pixels per row, on top of the clip rectangle. It lives in a pool. */
public interface ClippingMask extends AutoCloseable {
  /**
   * Columns of the shape's box.
   *
   * @return the width that it was made with
   */
  int width();

  /**
   * Rows of the shape.
   *
   * @return the height that it was made with
   */
  int height();

  /** Gives the memory back to the pool. */
  @Override
  void close();
}
