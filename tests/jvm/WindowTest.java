import static org.junit.jupiter.api.Assertions.*;

import java.awt.Component;
import java.awt.Dimension;
import java.awt.EventQueue;
import java.awt.Frame;
import java.awt.Point;
import java.awt.Rectangle;
import java.awt.Robot;
import java.awt.event.WindowEvent;
import java.nio.file.Files;
import java.nio.file.Path;
import java.util.Arrays;
import java.util.List;
import java.util.Random;
import java.util.concurrent.CompletableFuture;
import java.util.concurrent.TimeUnit;
import javax.imageio.ImageIO;
import javax.swing.JPanel;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import velmark5.*;
import velmark5.demo.Demo;

/** Frames in a real window, read back from the screen, with and without shared memory. */
@Tag("window")
class WindowTest {
  private static final int W = 203;
  private static final int H = 117;

  /** How many segments a canvas has: none on a display that shares no memory. */
  private final int each = Boolean.getBoolean("velmark5.test.shm") ? 2 : 0;

  private final Random random = new Random(20);
  private Robot robot;
  private Frame window;
  private java.awt.Canvas component;
  private Toolkit toolkit;
  private za canvas;

  @BeforeEach
  void open() throws Exception {
    robot = new Robot();
    component = new java.awt.Canvas();
    component.setIgnoreRepaint(true);
    component.setPreferredSize(new Dimension(W, H));
    window = new Frame();
    window.setUndecorated(true);
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

  /** Draws noise, from the top left of the target, and returns it. */
  private int[] draw(int width, int height) {
    int[] noise = random.ints((long) width * height, 0, 1 << 24).toArray();
    toolkit.writeArea(new Rect(0, 0, width, height), noise, 0, width);
    return noise;
  }

  private int[] backBuffer() {
    return toolkit.readArea(new Rect(0, 0, W, H));
  }

  private int[] screen(int width, int height) {
    java.awt.Toolkit.getDefaultToolkit().sync();
    Point at = component.getLocationOnScreen();
    var seen = robot.createScreenCapture(new Rectangle(at.x, at.y, width, height));
    return Arrays.stream(seen.getRGB(0, 0, width, height, null, 0, width)).map(pixel -> pixel & 0xFFFFFF).toArray();
  }

  /** The segments that canvases of this process hold, as permissions in octal; 1000 marks for removal. */
  private static List<String> segments() throws Exception {
    String pid = Long.toString(ProcessHandle.current().pid());
    return Files.readAllLines(Path.of("/proc/sysvipc/shm")).stream()
        .map(line -> line.trim().split(" +"))
        .filter(columns -> columns[4].equals(pid) && columns[2].endsWith("777"))
        .map(columns -> columns[2])
        .toList();
  }

  private static void assertSegments(int count) throws Exception {
    for (int attempt = 0; segments().size() != count && attempt < 50; ++attempt) {
      Thread.sleep(20); // the display server lets go of its side when it gets to it
    }
    assertEquals(count, segments().size(), "shared segments");
  }

  @Test
  void framesReachTheScreenPixelByPixel() {
    assertArrayEquals(new int[W * H], backBuffer(), "a canvas that becomes the target is black");
    int[] older = draw(W, H);
    canvas.present();
    assertArrayEquals(older, screen(W, H));
    int[] newer = draw(W, H);
    canvas.present();
    assertArrayEquals(newer, screen(W, H));

    // Two images in turn, or the only one.
    int[] next = each == 2 ? older : newer;
    assertArrayEquals(next, backBuffer());
    canvas.present();
    assertArrayEquals(next, screen(W, H));
    assertArrayEquals(newer, backBuffer());
  }

  @Test
  void partsOfAFrameShowAtTheTopLeft() {
    canvas.present();
    int[] frame = draw(W, H);
    int[] expected = new int[W * H];
    for (int row = 0; row < 50; ++row) {
      System.arraycopy(frame, (60 + row) * W + 100, expected, row * W, 103);
    }
    canvas.present(new Rect(100, 60, 103, 50));
    canvas.present(new Rect(5, 5, 0, 9));
    assertArrayEquals(expected, screen(W, H));
    frame = draw(W, H);
    canvas.CA(0, 0, W, H, 0, 0);
    assertArrayEquals(expected, screen(W, H), "dirty rectangles show nothing");
    assertThrows(IllegalArgumentException.class, () -> canvas.present(new Rect(1, 0, W, H)));
    assertThrows(IllegalArgumentException.class, () -> canvas.H(0, 0, -1, 1));
    assertArrayEquals(frame, backBuffer(), "and change no buffer");
  }

  @Test
  void resizingMovesToNewBuffers() throws Exception {
    EventQueue.invokeAndWait(
        () -> {
          component.setPreferredSize(new Dimension(300, 60));
          window.pack();
        });
    settle();
    toolkit.setClip(new Rect(1, 1, 1, 1));
    canvas.resize(300, 60);
    assertSegments(each);
    assertEquals(300, canvas.width());
    assertEquals(new Rect(0, 0, 300, 60), toolkit.clip());
    assertEquals(new Rect(0, 0, 300, 60), toolkit.viewport());
    int[] frame = draw(300, 60);
    canvas.present();
    assertArrayEquals(frame, screen(300, 60));

    Sprite sprite = toolkit.createSprite(4, 4);
    toolkit.drawTo(sprite, null);
    canvas.resize(50, 50);
    assertEquals(4, toolkit.targetWidth(), "another target stays");
    // Through the peer alone the old target is gone, and drawing without a new one harms nobody. Its size stays.
    toolkit.drawTo(canvas);
    canvas.wa(component, 10, 10);
    toolkit.clearAll(-1);
    if (each == 2) {
      assertThrows(IllegalStateException.class, () -> canvas.H(0, 0, 10, 10));
    }
  }

  @Test
  void segmentsGoWithTheirCanvasAndEvenWithAKilledProcess() throws Exception {
    assertSegments(each);
    assertTrue(segments().stream().allMatch("1777"::equals), "marked for removal from the start: " + segments());
    canvas.close();
    canvas.close();
    assertSegments(0);
    assertEquals(0, canvas.nativeid);
    canvas.ma();
    assertThrows(IllegalStateException.class, canvas::present);
    assertThrows(IllegalStateException.class, () -> toolkit.drawTo(canvas));
    toolkit.clearAll(-1);
    assertEquals(0, toolkit.targetWidth());
  }

  @Test
  void componentsWithoutAWindowAndWrongSizesAreRefused() throws Exception {
    long before = canvas.nativeid;
    JPanel lightweight = new JPanel();
    EventQueue.invokeAndWait(
        () -> {
          window.add(lightweight);
          window.validate();
        });
    Component hidden = new java.awt.Canvas();
    assertThrows(IllegalArgumentException.class, () -> canvas.n(0, lightweight, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.n(0, "text", W, H));
    assertThrows(NullPointerException.class, () -> canvas.n(0, null, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.wa(component, 60000, 60000));
    assertThrows(IllegalStateException.class, () -> canvas.wa(hidden, W, H));
    assertThrows(IllegalStateException.class, () -> toolkit.createCanvas((java.awt.Canvas) hidden, W, H));
    assertThrows(IllegalArgumentException.class, () -> toolkit.createCanvas(component, 0, H));
    assertThrows(NullPointerException.class, () -> toolkit.createCanvas(null, W, H));
    assertThrows(IllegalArgumentException.class, () -> canvas.resize(10, -1));
    assertEquals(before, canvas.nativeid);
    assertSegments(each);
    canvas.present();
    toolkit.drawToNothing();
    assertThrows(IllegalStateException.class, canvas::present, "it is not the target");
  }

  @Test
  void aWindowThatIsGoneShowsNothingQuietly() throws Exception {
    EventQueue.invokeAndWait(window::dispose);
    int[] frame = draw(W, H);
    canvas.present();
    canvas.CA(0, 0, 1, 1, 0, 0);
    assertArrayEquals(frame, backBuffer());
  }

  /** The demo, resized and closed as a person would: it ends by itself, and leaves a picture and nothing else. */
  @Test
  void theDemoEndsWithItsWindow() throws Exception {
    toolkit.close();
    Path png = Files.createTempFile("velmark5-demo", ".png");
    try {
      var demo = CompletableFuture.supplyAsync(() -> {
        try {
          Demo.main(new String[] {"--size", "320x200", "--png", png.toString()});
          return true;
        } catch (Exception e) {
          throw new IllegalStateException(e);
        }
      });
      Frame shown = null;
      while (shown == null && !demo.isDone()) {
        Thread.sleep(50);
        shown = Arrays.stream(Frame.getFrames()).filter(f -> f.isShowing() && f != window).findAny().orElse(null);
      }
      Thread.sleep(300);
      shown.setSize(400, 260);
      Thread.sleep(300);
      assertFalse(demo.isDone());
      shown.dispatchEvent(new WindowEvent(shown, WindowEvent.WINDOW_CLOSING));
      assertTrue(demo.get(20, TimeUnit.SECONDS));
      assertFalse(shown.isDisplayable());
      int width = ImageIO.read(png.toFile()).getWidth();
      assertTrue(width > 380, "the picture has the new size: " + width);
    } finally {
      Files.delete(png);
    }
  }
}
