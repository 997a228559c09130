package velmark5;

import java.util.Set;

/**
 * A mesh in a pool, ready to be drawn with {@link ThreadResource#draw}. Drawing works out what is missing (bounds,
 * normals, colours), so one model is drawn by one thread at a time.
 */
public interface Model extends AutoCloseable {
  /**
   * What may still be done to it.
   *
   * @return a new set
   */
  Set<ModelFunction> functions();

  /**
   * Takes functions away. Without {@link ModelFunction#SHARE_LIGHT} hidden faces become smooth ones.
   *
   * @param left those that stay
   * @throws IllegalArgumentException if the set holds a function that the model lacks
   */
  void restrictFunctions(Set<ModelFunction> left);

  /**
   * Whether some face may be translucent, so that drawing takes two passes.
   *
   * @return true also when only its texture may be
   */
  boolean isTranslucent();

  /**
   * Whether some texture on it scrolls.
   *
   * @return true if so
   */
  boolean isAnimated();

  /**
   * The ambient level.
   *
   * @return 128 for 1
   */
  int ambient();

  /**
   * Sets the ambient level. It shows when the model is next lit; colours that are worked out already stay.
   *
   * @param level 128 for 1
   */
  void setAmbient(int level);

  /**
   * The divisor of the sun's light.
   *
   * @return the smaller, the stronger
   */
  int contrast();

  /**
   * Sets the divisor of the sun's light, from the next frame on.
   *
   * @param divisor not 0
   * @throws IllegalArgumentException if it is 0
   */
  void setContrast(int divisor);

  /**
   * How far the model reaches.
   *
   * @return the bounds of its faces' vertices
   */
  ModelBounds bounds();

  /**
   * Whether the model is gone.
   *
   * @return true after {@link #close()}
   */
  boolean isClosed();

  /** Gives the memory back to the pool. */
  @Override
  void close();
}
