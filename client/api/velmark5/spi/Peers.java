package velmark5.spi;

import velmark5.TextureSource;
import velmark5.Toolkit;

/**
 * Makes the objects behind the API. The implementation stands in the default package, beside the classes that the
 * native library knows by name, and is found by that name once.
 */
public interface Peers {
  /**
   * Loads the native library if that has not happened yet and makes the process's toolkit.
   *
   * @param textures where textures come from, or null for none
   * @param count how many there are
   * @return the new toolkit
   * @throws IllegalStateException if a toolkit is open already
   */
  Toolkit createToolkit(TextureSource textures, int count);

  /**
   * The implementation.
   *
   * @return the one instance
   * @throws IllegalStateException if the classes of the default package are not on the class path
   */
  static Peers instance() {
    return Holder.INSTANCE;
  }

  /** Loads the implementation at first use. */
  final class Holder {
    private static final Peers INSTANCE = load();

    private Holder() {}

    private static Peers load() {
      try {
        var constructor = Class.forName("Velmark5Peers").getDeclaredConstructor();
        constructor.setAccessible(true);
        return (Peers) constructor.newInstance();
      } catch (ReflectiveOperationException e) {
        throw new IllegalStateException("The peer classes of velmark5 are not on the class path", e);
      }
    }
  }
}
