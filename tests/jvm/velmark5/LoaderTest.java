package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.io.IOException;
import java.nio.file.Files;
import java.nio.file.Path;
import java.util.ArrayList;
import java.util.List;
import java.util.concurrent.TimeUnit;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.io.TempDir;

/** Where the library comes from, in fresh processes. */
@Tag("headless")
class LoaderTest {
  private static final String RESOURCE = NativeLibrary.resourceName("Linux", System.getProperty("os.arch"));
  private static final String CLASSES = System.getProperty("java.class.path");

  @Test
  void theJarHasOneLibraryPerArchitecture() {
    assertEquals("/natives/linux-x86_64/libvelmark5.so", NativeLibrary.resourceName("Linux", "amd64"));
    assertEquals("/natives/linux-x86/libvelmark5.so", NativeLibrary.resourceName("Linux", "i386"));
    assertThrows(UnsatisfiedLinkError.class, () -> NativeLibrary.resourceName("Linux", "riscv64"));
    assertThrows(UnsatisfiedLinkError.class, () -> NativeLibrary.resourceName("Other", "amd64"));
  }

  @Test
  void aHeadlessProcessNeverLoadsTheDisplaysLibraries() throws Exception {
    String path = System.getProperty(NativeLibrary.PATH_PROPERTY);
    List<String> maps = run("-cp", CLASSES, path == null ? "-Dnone" : "-D" + NativeLibrary.PATH_PROPERTY + "=" + path);
    assertTrue(maps.stream().anyMatch(line -> line.contains("velmark5")), maps::toString);
    assertEquals(List.of(), maps.stream().filter(line -> line.matches(".*/lib(X11|Xext|jawt|awt_xawt).*")).toList());
  }

  @Test
  void theUnpackedLibraryLeavesNoFile(@TempDir Path folder) throws Exception {
    Path library = folder.resolve("classes" + RESOURCE);
    Path temporary = Files.createDirectory(folder.resolve("tmp"));
    Files.createDirectories(library.getParent());
    copyOwnLibrary(library);
    List<String> maps = run("-Djava.io.tmpdir=" + temporary, "-cp", folder.resolve("classes") + ":" + CLASSES);
    assertTrue(maps.stream().anyMatch(line -> line.startsWith(temporary.toString())), maps::toString);
    try (var left = Files.list(temporary)) {
      assertEquals(List.of(), left.filter(file -> file.toString().contains("velmark5-")).toList());
    }
  }

  /** Copies the library that this process runs, which may come from the jar. */
  private static void copyOwnLibrary(Path to) throws IOException {
    String path = System.getProperty(NativeLibrary.PATH_PROPERTY);
    if (path == null) {
      try (var in = LoaderTest.class.getResourceAsStream(RESOURCE)) {
        Files.copy(in, to);
      }
    } else {
      Files.copy(Files.isDirectory(Path.of(path)) ? Path.of(path, "libvelmark5.so") : Path.of(path), to);
    }
  }

  /** Runs {@link Probe} in a headless runtime of the same kind and returns what it prints. */
  private static List<String> run(String... options) throws Exception {
    List<String> command = new ArrayList<>();
    command.add(System.getProperty("velmark5.java", System.getProperty("java.home") + "/bin/java"));
    command.add("-Djava.awt.headless=true");
    command.addAll(List.of(options));
    command.add(Probe.class.getName());
    Process process = new ProcessBuilder(command).redirectErrorStream(true).start();
    List<String> lines = new String(process.getInputStream().readAllBytes()).lines().toList();
    assertTrue(process.waitFor(60, TimeUnit.SECONDS));
    assertEquals(0, process.exitValue(), lines::toString);
    assertTrue(lines.contains("drawn ff00ff00"), lines::toString);
    return lines;
  }

  /** Draws offscreen and prints a pixel and the files that are mapped. */
  static final class Probe {
    public static void main(String[] args) throws IOException {
      try (Toolkit toolkit = Toolkit.create();
          Sprite sprite = toolkit.createSprite(4, 4)) {
        toolkit.drawTo(sprite, null);
        toolkit.clear(0xFF00FF00);
        System.out.println("drawn " + Integer.toHexString(toolkit.readArea(new Rect(3, 3, 1, 1))[0]));
        Files.readAllLines(Path.of("/proc/self/maps")).stream()
            .filter(line -> line.indexOf('/') > 0)
            .map(line -> line.substring(line.indexOf('/')))
            .distinct()
            .forEach(System.out::println);
      }
    }
  }
}
