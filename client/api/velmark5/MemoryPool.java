package velmark5;

/**
 * Memory of the library that models, fonts and masks live in. Its blocks move together when room is needed; when that
 * is not enough the toolkit's memory pressure listener is called, and then the pool grows.
 */
public interface MemoryPool extends AutoCloseable {
  /**
   * Gives the memory back. What still lives in the pool may be closed later; until then fonts and masks draw nothing,
   * and to draw a model is an {@link IllegalStateException}.
   *
   * @throws IllegalStateException inside a memory pressure listener
   */
  @Override
  void close();

  /**
   * Whether the pool is gone.
   *
   * @return true after {@link #close()}
   */
  boolean isClosed();
}
