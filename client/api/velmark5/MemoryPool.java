package velmark5;

/**
 * Memory of the library that models, fonts and masks live in. Its blocks move together when room is needed; when that
 * is not enough the toolkit's memory pressure listener is called, and then the pool grows.
 */
public interface MemoryPool extends AutoCloseable {
  /** Gives the memory back. Objects that still live in the pool draw nothing from then on and may be closed later. */
  @Override
  void close();

  /**
   * Whether the pool is gone.
   *
   * @return true after {@link #close()}
   */
  boolean isClosed();
}
