package velmark5;

import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.io.IOException;
import java.nio.file.Files;
import java.nio.file.Path;
import java.util.ArrayList;
import java.util.List;
import java.util.concurrent.TimeUnit;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;

/** Where the library comes from, in fresh processes. */
@Tag("headless")
class LoaderTest {
  @Test
  void theJarHasOneLibraryPerArchitecture() {
    assertEquals("/natives/linux-x86_64/libvelmark5.so", NativeLibrary.resourceName("Linux", "amd64"));
    assertEquals("/natives/linux-x86/libvelmark5.so", NativeLibrary.resourceName("Linux", "i386"));
    assertThrows(UnsatisfiedLinkError.class, () -> NativeLibrary.resourceName("Linux", "riscv64"));
    assertThrows(UnsatisfiedLinkError.class, () -> NativeLibrary.resourceName("Other", "amd64"));
  }

  @Test
  void aHeadlessProcessNeverLoadsTheDisplaysLibraries() throws Exception {
    List<String> maps = run("-Djava.awt.headless=true");
    assertTrue(maps.contains("drawn ff00ff00"), maps::toString);
    assertTrue(maps.stream().anyMatch(line -> line.contains("velmark5")), maps::toString);
    assertEquals(List.of(), maps.stream().filter(line -> line.matches(".*/lib(X11|Xext|jawt|awt_xawt).*")).toList());
  }

  @Test
  void theUnpackedLibraryLeavesNoFile() throws Exception {
    Path folder = Files.createTempDirectory("velmark5-test");
    Path resources = Files.createDirectories(folder.resolve("classes/natives"));
    Path library = Files.createDirectories(folder.resolve("classes" + NativeLibrary.resourceName("Linux",
        System.getProperty("os.arch"))).getParent());
    Path temporary = Files.createDirectory(folder.resolve("tmp"));
    try {
      Files.copy(mappedLibrary(), library.resolve("libvelmark5.so"));
      List<String> maps = run("-Djava.awt.headless=true", "-Djava.io.tmpdir=" + temporary, "-cp",
          folder.resolve("classes") + ":" + System.getProperty("java.class.path"));
      assertTrue(maps.contains("drawn ff00ff00"), maps::toString);
      assertTrue(maps.stream().anyMatch(line -> line.startsWith(temporary.toString())), maps::toString);
      try (var left = Files.list(temporary)) {
        assertEquals(List.of(), left.filter(file -> file.toString().contains("velmark5-")).toList());
      }
    } finally {
      try (var files = Files.walk(folder)) {
        files.sorted(java.util.Comparator.reverseOrder()).forEach(file -> file.toFile().delete());
      }
    }
    assertTrue(Files.notExists(resources));
  }

  /** The library that this process runs, unpacked from the jar or not. */
  private static Path mappedLibrary() throws IOException {
    String path = System.getProperty(NativeLibrary.PATH_PROPERTY);
    if (path != null) {
      return Files.isDirectory(Path.of(path)) ? Path.of(path, "libvelmark5.so") : Path.of(path);
    }
    Path copy = Files.createTempFile("velmark5-test", ".so");
    copy.toFile().deleteOnExit();
    try (var in = LoaderTest.class.getResourceAsStream(
            NativeLibrary.resourceName("Linux", System.getProperty("os.arch")));
        var out = Files.newOutputStream(copy)) {
      in.transferTo(out);
    }
    return copy;
  }

  /** Runs {@link Probe} in a runtime of the same kind and returns what it prints. */
  private static List<String> run(String... options) throws Exception {
    List<String> command = new ArrayList<>();
    command.add(System.getProperty("velmark5.java", System.getProperty("java.home") + "/bin/java"));
    String path = System.getProperty(NativeLibrary.PATH_PROPERTY);
    if (path != null && !List.of(options).contains("-cp")) {
      command.add("-D" + NativeLibrary.PATH_PROPERTY + "=" + path);
    }
    if (!List.of(options).contains("-cp")) {
      command.addAll(List.of("-cp", System.getProperty("java.class.path")));
    }
    command.addAll(List.of(options));
    command.add(Probe.class.getName());
    Process process = new ProcessBuilder(command).redirectErrorStream(true).start();
    List<String> lines = new String(process.getInputStream().readAllBytes()).lines().toList();
    assertTrue(process.waitFor(60, TimeUnit.SECONDS));
    assertEquals(0, process.exitValue(), lines::toString);
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
