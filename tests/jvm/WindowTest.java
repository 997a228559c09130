import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.awt.Dimension;
import java.awt.Frame;
import java.awt.Point;
import java.awt.Rectangle;
import java.awt.Robot;
import java.awt.event.WindowEvent;
import java.awt.image.BufferedImage;
import java.nio.file.Files;
import java.nio.file.Path;
import java.util.Random;
import java.util.concurrent.CompletableFuture;
import java.util.concurrent.TimeUnit;
import javax.imageio.ImageIO;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import velmark5.BlendMode;
import velmark5.Canvas;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;
import velmark5.demo.Demo;

/** Canvases in a real window; what arrived on the screen is read back. */
@Tag("window")
class WindowTest {
  private static final int WIDTH = 93;
  private static final int HEIGHT = 61;
  private static final int RGB = 0xFFFFFF;

  private Toolkit toolkit;
  private Frame window;
  private java.awt.Canvas component;
  private long ownOfAwt;

  @BeforeEach
  void open() throws Exception {
    toolkit = Toolkit.create();
    component = new java.awt.Canvas();
    component.setIgnoreRepaint(true);
    component.setPreferredSize(new Dimension(300, 200));
    window = new Frame();
    window.setUndecorated(true);
    window.add(component);
    window.pack();
    window.setVisible(true);
    // Reading the screen makes AWT share memory with the display too, and keep it.
    screen(1, 1);
    ownOfAwt = segments();
  }

  @AfterEach
  void close() throws Exception {
    toolkit.close();
    window.dispose();
    assertSegments(0);
  }

  /** Segments of shared memory that this process made. */
  private static long segments() throws Exception {
    try (var lines = Files.lines(Path.of("/proc/sysvipc/shm"))) {
      long self = ProcessHandle.current().pid();
      return lines.skip(1).filter(line -> Long.parseLong(line.trim().split("\\s+")[4]) == self).count();
    }
  }

  /** How many segments there are besides AWT's own; the display may let go of one a little later. */
  private void assertSegments(long expected) throws Exception {
    for (int i = 0; i < 100 && segments() - ownOfAwt != expected; i++) {
      Thread.sleep(20);
    }
    assertEquals(expected, segments() - ownOfAwt, "shared memory segments of this process");
  }

  private int[] screen(int width, int height) throws Exception {
    Point at = component.getLocationOnScreen();
    BufferedImage image = new Robot().createScreenCapture(new Rectangle(at.x, at.y, width, height));
    return rgb(image.getRGB(0, 0, width, height, null, 0, width));
  }

  private static int[] rgb(int[] words) {
    int[] result = words.clone();
    for (int i = 0; i < result.length; i++) {
      result[i] &= RGB;
    }
    return result;
  }

  /** The first present may meet a window that is not yet on the screen, so it is repeated until it shows. */
  private void assertShows(int[] expected, int width, int height, Runnable draw) throws Exception {
    int[] seen = {};
    for (int i = 0; i < 50; i++) {
      draw.run();
      seen = screen(width, height);
      if (java.util.Arrays.equals(expected, seen)) {
        return;
      }
      Thread.sleep(20);
    }
    assertArrayEquals(expected, seen);
  }

  @Test
  void framesArriveOnTheScreen() throws Exception {
    Canvas canvas = toolkit.createCanvas(component, WIDTH, HEIGHT);
    toolkit.drawTo(canvas);
    Rect all = new Rect(0, 0, WIDTH, HEIGHT);
    assertArrayEquals(new int[WIDTH * HEIGHT], toolkit.readArea(all));
    for (int seed = 0; seed < 4; seed++) {
      int[] picture = new Random(seed).ints(WIDTH * HEIGHT).toArray();
      assertShows(rgb(picture), WIDTH, HEIGHT, () -> {
        toolkit.writeArea(all, picture, 0, WIDTH);
        canvas.present();
      });
    }
  }

  @Test
  void aPartIsShownAtTheTopLeft() throws Exception {
    Canvas canvas = toolkit.createCanvas(component, WIDTH, HEIGHT);
    Rect part = new Rect(40, 20, 30, 25);
    assertShows(new int[] {0x112233}, 1, 1, () -> {
      toolkit.drawTo(canvas);
      toolkit.clear(0x112233);
      canvas.present();
      toolkit.clear(0x445566);
      toolkit.fillRect(part, 0x778899, BlendMode.REPLACE);
      ((za) canvas).CA(1, 2, 3, 4, 5, 6);
    });
    int[] expected = new int[WIDTH * HEIGHT];
    for (int i = 0; i < expected.length; i++) {
      expected[i] = i % WIDTH < 30 && i / WIDTH < 25 ? 0x778899 : 0x112233;
    }
    canvas.present(part);
    assertShows(expected, WIDTH, HEIGHT, () -> {});
    canvas.present(new Rect(5, 5, 0, 9));
    assertThrows(IllegalArgumentException.class, () -> canvas.present(new Rect(64, 0, 30, 1)));
  }

  @Test
  void resizingKeepsTheTarget() throws Exception {
    Canvas canvas = toolkit.createCanvas(component, WIDTH, HEIGHT);
    toolkit.drawTo(canvas);
    toolkit.clear(-1);
    toolkit.setClip(new Rect(1, 1, 1, 1));
    canvas.resize(200, 31);
    assertEquals(new Rect(0, 0, 200, 31), toolkit.clip());
    assertEquals(new Rect(0, 0, 200, 31), toolkit.viewport());
    assertEquals(200, canvas.width());
    int[] expected = new int[200 * 31];
    java.util.Arrays.fill(expected, 0x00AB1234);
    assertShows(expected, 200, 31, () -> {
      toolkit.clear(0x00AB1234);
      canvas.present();
    });
    Sprite sprite = toolkit.createSprite(4, 4);
    toolkit.drawTo(sprite, null);
    canvas.resize(50, 50);
    assertEquals(4, toolkit.targetWidth());
  }

  @Test
  void anUnfitCanvasIsRefused() throws Exception {
    java.awt.Canvas nowhere = new java.awt.Canvas();
    assertThrows(IllegalStateException.class, () -> toolkit.createCanvas(nowhere, 10, 10));
    assertThrows(IllegalArgumentException.class, () -> toolkit.createCanvas(component, 0, 10));
    assertThrows(NullPointerException.class, () -> toolkit.createCanvas(null, 10, 10));
    Canvas canvas = toolkit.createCanvas(component, 10, 10);
    assertThrows(IllegalStateException.class, canvas::present);
    assertSegments(Boolean.getBoolean("velmark5.test.shm") ? 2 : 0);
    toolkit.drawTo(canvas);
    assertThrows(IllegalArgumentException.class, () -> canvas.resize(10, -1));
    assertThrows(IllegalStateException.class, () -> canvas.resize(nowhere, 10, 10));
    canvas.present();
    canvas.close();
    canvas.close();
    assertThrows(IllegalStateException.class, canvas::present);
    assertThrows(IllegalStateException.class, () -> toolkit.drawTo(canvas));
    toolkit.clearAll(-1);
    assertEquals(0, toolkit.targetWidth());
    assertSegments(0);
  }

  /** The demo, resized and closed as a person would: it ends by itself, and leaves a picture and nothing else. */
  @Test
  void theDemoEndsWithItsWindow() throws Exception {
    toolkit.close();
    window.dispose();
    Path png = Files.createTempFile("velmark5-demo", ".png");
    try {
      CompletableFuture<Void> demo = CompletableFuture.runAsync(() -> {
        try {
          Demo.main(new String[] {"--size", "320x200", "--png", png.toString()});
        } catch (Exception e) {
          throw new IllegalStateException(e);
        }
      });
      Frame shown = null;
      while (shown == null && !demo.isDone()) {
        Thread.sleep(50);
        for (Frame frame : Frame.getFrames()) {
          if (frame.isShowing() && frame != window) {
            shown = frame;
          }
        }
      }
      Thread.sleep(300);
      shown.setSize(400, 260);
      Thread.sleep(300);
      assertFalse(demo.isDone());
      shown.dispatchEvent(new WindowEvent(shown, WindowEvent.WINDOW_CLOSING));
      demo.get(20, TimeUnit.SECONDS);
      assertFalse(shown.isDisplayable());
      BufferedImage picture = ImageIO.read(png.toFile());
      assertTrue(picture.getWidth() > 380, "the picture has the new size: " + picture.getWidth());
      assertSegments(0);
    } finally {
      Files.delete(png);
    }
  }
}
