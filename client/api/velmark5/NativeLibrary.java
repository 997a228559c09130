package velmark5;

import java.awt.GraphicsEnvironment;
import java.awt.HeadlessException;
import java.io.IOException;
import java.io.InputStream;
import java.io.OutputStream;
import java.io.UncheckedIOException;
import java.nio.file.Files;
import java.nio.file.Path;

/**
 * Finds and loads the native library. {@link Toolkit#create()} does it by itself.
 *
 * <p>If the system property {@value #PATH_PROPERTY} is set, it names the library's file or the folder that holds it.
 * Otherwise the library comes from the jar, by the machine's architecture; it is copied into a temporary file that only
 * the user can read and that is gone as soon as the library is loaded.
 */
public final class NativeLibrary {
  /** The system property that says where the library is. */
  public static final String PATH_PROPERTY = "velmark5.library.path";

  private static final String FILE_NAME = "libvelmark5.so";
  private static boolean loaded;
  private static boolean awtReady;

  private NativeLibrary() {}

  /**
   * Loads the library; later calls do nothing. Touches neither AWT nor the display.
   *
   * @throws UnsatisfiedLinkError if there is no library for this machine or it does not load
   */
  public static synchronized void load() {
    if (loaded) {
      return;
    }
    String path = System.getProperty(PATH_PROPERTY);
    if (path != null) {
      Path given = Path.of(path).toAbsolutePath();
      System.load((Files.isDirectory(given) ? given.resolve(FILE_NAME) : given).toString());
    } else {
      loadFromJar(resourceName(System.getProperty("os.name"), System.getProperty("os.arch")));
    }
    loaded = true;
  }

  /**
   * Loads AWT's own native libraries, which a canvas needs to reach the display; later calls do nothing.
   *
   * @throws HeadlessException if there is no display
   */
  public static synchronized void prepareDisplay() {
    if (awtReady) {
      return;
    }
    if (GraphicsEnvironment.isHeadless()) {
      throw new HeadlessException("A canvas needs a display; draw to a sprite instead");
    }
    java.awt.Toolkit.getDefaultToolkit();
    System.loadLibrary("jawt");
    awtReady = true;
  }

  /** Where in the jar the library for a system stands. */
  static String resourceName(String system, String architecture) {
    String width =
        switch (architecture) {
          case "amd64", "x86_64" -> "x86_64";
          case "i386", "i486", "i586", "i686", "x86" -> "x86";
          default -> null;
        };
    if (width == null || !system.equals("Linux")) {
      throw new UnsatisfiedLinkError("There is no velmark5 library for " + system + " on " + architecture);
    }
    return "/natives/linux-" + width + "/" + FILE_NAME;
  }

  private static void loadFromJar(String resource) {
    try (InputStream in = NativeLibrary.class.getResourceAsStream(resource)) {
      if (in == null) {
        throw new UnsatisfiedLinkError(
            "The jar has no " + resource + "; set the system property " + PATH_PROPERTY + " to the library's folder");
      }
      // A temporary file is created for its owner alone. The loaded library stays mapped when its name is gone.
      Path file = Files.createTempFile("velmark5-", ".so");
      try {
        try (OutputStream out = Files.newOutputStream(file)) {
          in.transferTo(out);
        }
        System.load(file.toString());
      } finally {
        Files.deleteIfExists(file);
      }
    } catch (IOException e) {
      throw new UncheckedIOException("The velmark5 library could not be unpacked", e);
    }
  }
}
