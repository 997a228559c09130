import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertDoesNotThrow;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.awt.Canvas;
import java.awt.Component;
import java.awt.Dimension;
import java.awt.EventQueue;
import java.awt.Frame;
import java.awt.Point;
import java.awt.Rectangle;
import java.awt.Robot;
import java.io.IOException;
import java.nio.file.Files;
import java.nio.file.Path;
import java.util.Arrays;
import java.util.List;
import java.util.Random;
import java.util.stream.Collectors;
import javax.swing.JPanel;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import velmark5.Rect;
import velmark5.Toolkit;

/** Frames in a real window, read back from the screen, with and without shared memory. */
@Tag("window")
class CanvasWindowTest {
  private static final int W = 203;
  private static final int H = 117;

  /** Whether the display is one that shares memory. */
  private final boolean shared = Boolean.getBoolean("velmark5.test.shm");

  private final Random random = new Random(20);
  private Robot robot;
  private Frame window;
  private Canvas component;
  private Toolkit toolkit;
  private za canvas;

  @BeforeEach
  void open() throws Exception {
    robot = new Robot();
    window = new Frame();
    window.setUndecorated(true);
    component = new Canvas();
    component.setIgnoreRepaint(true);
    component.setPreferredSize(new Dimension(W, H));
    window.add(component);
    window.pack();
    window.setLocation(40, 30);
    window.setVisible(true);
    settle();
    toolkit = Toolkit.create();
    canvas = (za) toolkit.createCanvas(component, W, H);
    toolkit.drawTo(canvas);
  }

  @AfterEach
  void close() throws Exception {
    toolkit.close();
    EventQueue.invokeAndWait(window::dispose);
    assertSegments(0);
  }

  /** Lets the window appear, and be painted by AWT for the last time. */
  private void settle() throws Exception {
    robot.waitForIdle();
    java.awt.Toolkit.getDefaultToolkit().sync();
    Thread.sleep(150);
  }

  private int[] noise(int width, int height) {
    return random.ints((long) width * height, 0, 1 << 24).toArray();
  }

  private void draw(int[] pixels, int width, int height) {
    toolkit.writeArea(new Rect(0, 0, width, height), pixels, 0, width);
  }

  private int[] backBuffer() {
    return toolkit.readArea(new Rect(0, 0, W, H));
  }

  private int[] screen(int width, int height) {
    java.awt.Toolkit.getDefaultToolkit().sync();
    Point at = component.getLocationOnScreen();
    int[] seen =
        robot.createScreenCapture(new Rectangle(at.x, at.y, width, height)).getRGB(0, 0, width, height, null, 0, width);
    return Arrays.stream(seen).map(pixel -> pixel & 0xFFFFFF).toArray();
  }

  /** The segments that canvases of this process hold, as lines of permissions in octal; 1000 marks for removal. */
  private static List<String> segments() throws IOException {
    String pid = Long.toString(ProcessHandle.current().pid());
    return Files.readAllLines(Path.of("/proc/sysvipc/shm")).stream()
        .map(line -> line.trim().split(" +"))
        .filter(columns -> columns[4].equals(pid) && columns[2].endsWith("777"))
        .map(columns -> columns[2])
        .collect(Collectors.toList());
  }

  private static void assertSegments(int count) throws Exception {
    for (int attempt = 0; segments().size() != count && attempt < 50; ++attempt) {
      Thread.sleep(20); // the display server lets go of its side when it gets to it
    }
    assertEquals(count, segments().size(), "shared segments");
  }

  @Test
  void framesReachTheScreenPixelByPixel() throws Exception {
    assertArrayEquals(new int[W * H], backBuffer(), "a canvas that becomes the target is black");
    int[] older = noise(W, H);
    int[] newer = noise(W, H);
    draw(older, W, H);
    canvas.present();
    assertArrayEquals(older, screen(W, H));
    draw(newer, W, H);
    canvas.present();
    assertArrayEquals(newer, screen(W, H));

    // Two images in turn, or the only one.
    assertArrayEquals(shared ? older : newer, backBuffer());
    canvas.present();
    assertArrayEquals(shared ? older : newer, screen(W, H));
    assertArrayEquals(newer, backBuffer());
  }

  @Test
  void partsOfAFrameShowAtTheTopLeft() {
    draw(new int[W * H], W, H);
    canvas.present();
    int[] frame = noise(W, H);
    draw(frame, W, H);
    int[] expected = new int[W * H];
    for (int row = 0; row < 50; ++row) {
      System.arraycopy(frame, (60 + row) * W + 100, expected, row * W, 103);
    }
    canvas.present(new Rect(100, 60, 103, 50));
    assertArrayEquals(expected, screen(W, H));
    draw(frame, W, H);
    canvas.CA(0, 0, W, H, 0, 0);
    assertArrayEquals(expected, screen(W, H), "dirty rectangles show nothing");
    assertArrayEquals(frame, backBuffer(), "and change no buffer");
    assertThrows(IllegalArgumentException.class, () -> canvas.H(1, 0, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.H(0, 0, -1, 1));
    assertArrayEquals(frame, backBuffer());
  }

  @Test
  void resizingMovesToNewBuffers() throws Exception {
    EventQueue.invokeAndWait(
        () -> {
          component.setPreferredSize(new Dimension(300, 60));
          window.pack();
        });
    settle();
    canvas.resize(300, 60);
    assertSegments(shared ? 2 : 0);
    int[] frame = noise(300, 60);
    draw(frame, 300, 60);
    canvas.present();
    assertArrayEquals(frame, screen(300, 60));

    // Through the peer alone the old target is gone, and drawing without a new one harms nobody. Its size
    // is still there.
    canvas.wa(component, 10, 10);
    toolkit.clearAll(-1);
    if (shared) {
      assertThrows(IllegalStateException.class, () -> canvas.H(0, 0, 10, 10));
    }
    toolkit.clearAll(-1);
  }

  @Test
  void segmentsGoWithTheirCanvasAndEvenWithAKilledProcess() throws Exception {
    assertSegments(shared ? 2 : 0);
    assertTrue(segments().stream().allMatch("1777"::equals), "marked for removal from the start: " + segments());
    canvas.close();
    assertSegments(0);
    assertEquals(0, canvas.nativeid);
    assertDoesNotThrow(canvas::ma);
    toolkit.clearAll(-1);
  }

  @Test
  void componentsWithoutAWindowAreRefused() throws Exception {
    long before = canvas.nativeid;
    JPanel lightweight = new JPanel();
    EventQueue.invokeAndWait(
        () -> {
          window.add(lightweight);
          window.validate();
        });
    Component hidden = new Canvas();
    assertThrows(IllegalArgumentException.class, () -> canvas.n(0, lightweight, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.n(0, "text", W, H));
    assertThrows(NullPointerException.class, () -> canvas.n(0, null, W, H));
    assertThrows(IllegalStateException.class, () -> canvas.n(0, hidden, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.n(0, component, 0, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.wa(component, 60000, 60000));
    assertThrows(IllegalStateException.class, () -> canvas.wa(hidden, W, H));
    assertEquals(before, canvas.nativeid);
    assertSegments(shared ? 2 : 0);
    assertDoesNotThrow(() -> canvas.present());
  }

  @Test
  void aWindowThatIsGoneShowsNothingQuietly() throws Exception {
    EventQueue.invokeAndWait(window::dispose);
    int[] frame = noise(W, H);
    draw(frame, W, H);
    assertDoesNotThrow(() -> canvas.present());
    assertArrayEquals(frame, backBuffer());
    assertDoesNotThrow(() -> canvas.CA(0, 0, 1, 1, 0, 0));
    assertFalse(component.isDisplayable());
  }
}
