package velmark5;

/** A depth value for each pixel of an image: what a {@link Canvas} has of its own and a {@link Sprite} borrows. */
public interface DepthBuffer extends AutoCloseable {
  /**
   * Columns.
   *
   * @return the width
   */
  int width();

  /**
   * Rows.
   *
   * @return the height
   */
  int height();

  /** Gives the memory back. If the toolkit draws to this buffer, it draws to nothing from then on. */
  @Override
  void close();
}
