package tolvi3.graphics2;

/** A failure inside the native library that has no better class. */
public class NativeError extends RuntimeException {
  private static final long serialVersionUID = 1L;

  /**
   * Called by the native library.
   *
   * @param message what happened
   */
  public NativeError(String message) {
    super(message);
  }
}
