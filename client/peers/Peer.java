/**
 * What everything made by a toolkit shares: a living handle or IllegalStateException, and an end that comes once. Each
 * subclass declares the field {@code nativeid}, which the library sets when it makes the native object and clears when
 * that is gone.
 */
abstract class Peer {
  final ja toolkit;

  Peer(ja toolkit) {
    this.toolkit = toolkit;
  }

  /** The handle as it stands, 0 when there is no native object. */
  abstract long id();

  /** Ends the native object, which is there, and clears the handle. */
  abstract void destroy();

  /** The readable name of the class, for messages. */
  abstract String name();

  /** The handle, for a native that would follow it. */
  final long handle() {
    if (id() == 0) {
      throw new IllegalStateException("This " + name() + " is closed");
    }
    return id();
  }

  public void close() {
    if (id() != 0) {
      toolkit.forget(this);
      destroy();
    }
  }

  public final boolean isClosed() {
    return id() == 0;
  }

  @Override
  public String toString() {
    return name() + (isClosed() ? " (closed)" : "");
  }

  /** The library raises a plain Exception when a native needs a frame and there is none. */
  static RuntimeException translated(Exception failure) {
    return failure instanceof RuntimeException unchecked
        ? unchecked
        : new IllegalStateException(failure.getMessage(), failure);
  }
}
