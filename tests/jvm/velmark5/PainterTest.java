package velmark5;

import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertThrows;

import java.util.Arrays;
import java.util.Random;
import java.util.function.IntBinaryOperator;
import java.util.function.IntUnaryOperator;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;

/** Each primitive changes just the pixels that it should, seen from Java. */
@Tag("headless")
class PainterTest {
  private static final int WIDTH = 37;
  private static final int HEIGHT = 29;
  private static final Rect ALL = new Rect(0, 0, WIDTH, HEIGHT);
  private static final int INK = 0xFF123456;

  private Toolkit toolkit;
  private Sprite target;
  private int[] start;

  @BeforeEach
  void openOnNoise() {
    toolkit = Toolkit.create();
    target = toolkit.createSprite(WIDTH, HEIGHT);
    start = new Random(5).ints(WIDTH * HEIGHT).toArray();
    toolkit.drawTo(target, null);
    toolkit.writeArea(ALL, start, 0, WIDTH);
  }

  @AfterEach
  void close() {
    toolkit.close();
  }

  private interface Area {
    boolean covers(int x, int y);
  }

  /** Draws, compares the whole target with what the area and the new pixel say, and restores the noise. */
  private void check(Runnable drawing, Area area, IntUnaryOperator pixel) {
    drawing.run();
    int[] expected = start.clone();
    for (int i = 0; i < expected.length; i++) {
      if (area.covers(i % WIDTH, i / WIDTH)) {
        expected[i] = pixel.applyAsInt(expected[i]);
      }
    }
    assertArrayEquals(expected, toolkit.readArea(ALL));
    toolkit.writeArea(ALL, start, 0, WIDTH);
  }

  private void check(Runnable drawing, Area area) {
    check(drawing, area, d -> INK);
  }

  private static int eachChannel(int d, int c, IntBinaryOperator operation, int alpha) {
    int result = alpha << 24;
    for (int shift = 0; shift < 24; shift += 8) {
      result |= operation.applyAsInt(d >> shift & 255, c >> shift & 255) << shift;
    }
    return result;
  }

  private static int blended(int d, int c) {
    int a = c >>> 24;
    return eachChannel(d, c, (dc, cc) -> (cc * a >> 8) + (dc * (256 - a) >> 8), a);
  }

  private static int added(int d, int c) {
    return eachChannel(d, c, (dc, cc) -> Math.min(255, dc + cc), (d >>> 24) + (c >>> 24) & 255);
  }

  /** The circle of radius 8 around (9, 9). Between an inner and an outer ring the edge's own rule decides. */
  private Area circle() {
    return (x, y) -> {
      int square = (x - 9) * (x - 9) + (y - 9) * (y - 9);
      boolean isInk = toolkit.readArea(new Rect(x, y, 1, 1))[0] == INK;
      return square <= 7 * 7 || (square < 9 * 9 && isInk);
    };
  }

  @Test
  void rectanglesInAllModes() {
    Rect inside = new Rect(3, 4, 21, 9);
    check(() -> toolkit.fillRect(inside, INK, BlendMode.REPLACE), inside::contains);
    check(() -> toolkit.fillRect(inside, INK, BlendMode.ALPHA), inside::contains);
    check(() -> toolkit.fillRect(inside, 0x5080FF13, BlendMode.ALPHA), inside::contains, d -> blended(d, 0x5080FF13));
    check(() -> toolkit.fillRect(inside, 0x5080FF13, BlendMode.ADD), inside::contains, d -> added(d, 0x5080FF13));
    Rect over = new Rect(-5, 20, 100, 100);
    check(() -> toolkit.fillRect(over, INK, BlendMode.REPLACE), over::contains);
    check(() -> toolkit.clear(INK), ALL::contains);
    Rect hole = new Rect(4, 5, 19, 7);
    check(() -> toolkit.drawRect(inside, 0x30405060, BlendMode.ADD), (x, y) -> inside.contains(x, y)
        && !hole.contains(x, y), d -> added(d, 0x30405060));
  }

  @Test
  void linesAndCircles() {
    check(() -> toolkit.horizontalLine(-3, 5, 10, INK, BlendMode.REPLACE), (x, y) -> y == 5 && x < 7);
    check(() -> toolkit.verticalLine(6, 20, 50, INK, BlendMode.REPLACE), (x, y) -> x == 6 && y >= 20);
    check(() -> toolkit.line(25, 20, 5, 0, INK, BlendMode.REPLACE), (x, y) -> x - 5 == y && y <= 20);
    check(() -> toolkit.line(0, 4, 30, 4, 0x40FFFFFF, BlendMode.ADD), (x, y) -> y == 4 && x <= 30,
        d -> added(d, 0x40FFFFFF));
    check(() -> toolkit.fillCircle(9, 9, -8, INK, BlendMode.REPLACE), circle());
  }

  @Test
  void masksCutByTheClip() {
    try (MemoryPool pool = toolkit.createPool(4096);
        ClippingMask mask =
            toolkit.createMask(pool, new Spans(9, 3, new int[] {0, 4, 8}, new int[] {9, 2, 0}))) {
      Area spans = (x, y) -> (y == 10 && x >= 30) || (y == 11 && (x == 34 || x == 35));
      check(() -> toolkit.fillMask(INK, mask, 30, 10), spans);
      check(() -> toolkit.withClip(new Rect(0, 11, 35, 10), () -> toolkit.fillMask(INK, mask, 30, 10)),
          (x, y) -> x == 34 && y == 11);
      assertEquals(ALL, toolkit.clip());
      check(() -> toolkit.line(36, 10, 27, 10, INK, BlendMode.REPLACE, mask, 30, 10), (x, y) -> y == 10 && x >= 30);
      check(() -> toolkit.line(35, 9, 35, 20, INK, BlendMode.REPLACE, mask, 30, 10),
          (x, y) -> x == 35 && (y == 10 || y == 11));
      assertEquals(9, mask.width());
      assertEquals(3, mask.height());
    }
  }

  @Test
  void clipAndViewport() {
    toolkit.setClip(new Rect(-10, 5, 30, 100));
    assertEquals(Rect.between(0, 5, 20, HEIGHT), toolkit.clip());
    toolkit.narrowClip(new Rect(4, 0, 100, 10));
    Rect clip = Rect.between(4, 5, 20, 10);
    assertEquals(clip, toolkit.clip());
    check(() -> toolkit.clearAll(INK), clip::contains);
    assertThrows(ArithmeticException.class, () -> toolkit.withClip(new Rect(9, 9, 0, 0), () -> {
      toolkit.clear(INK);
      throw new ArithmeticException();
    }));
    check(() -> {}, (x, y) -> false);
    assertEquals(clip, toolkit.clip());
    toolkit.resetClip();
    assertEquals(ALL, toolkit.clip());

    assertEquals(ALL, toolkit.viewport());
    toolkit.setViewport(new Rect(1, 2, 3, 4));
    toolkit.setDepthRange(0, 1);
    assertEquals(new Rect(1, 2, 3, 4), toolkit.viewport());
    toolkit.resetViewport();
    assertEquals(ALL, toolkit.viewport());
  }

  @Test
  void areasAndScrolling() {
    Rect part = new Rect(30, 20, 7, 9);
    int[] seen = toolkit.readArea(part);
    assertEquals(63, seen.length);
    assertEquals(start[21 * WIDTH + 30], seen[7]);
    toolkit.writeArea(new Rect(0, 0, 2, 2), new int[] {9, 9, 1, 2, 9, 3, 4}, 2, 3);
    assertArrayEquals(new int[] {1, 2, 3, 4}, toolkit.readArea(new Rect(0, 0, 2, 2)));
    toolkit.writeArea(ALL, start, 0, WIDTH);

    int[] expected = start.clone();
    System.arraycopy(start, 0, expected, 2 * WIDTH + 3, start.length - 2 * WIDTH - 3);
    toolkit.scroll(3, 2);
    assertArrayEquals(expected, toolkit.readArea(ALL));
    toolkit.scroll(0, -100);
    assertArrayEquals(expected, toolkit.readArea(ALL));

    var image = toolkit.snapshot();
    assertEquals(0xFF000000 | expected[5 * WIDTH + 6], image.getRGB(6, 5));
    for (Rect outside : Arrays.asList(new Rect(-1, 0, 2, 2), new Rect(30, 0, 8, 1), new Rect(0, 28, 1, 2))) {
      assertThrows(IllegalArgumentException.class, () -> toolkit.readArea(outside));
      assertThrows(IllegalArgumentException.class, () -> toolkit.writeArea(outside, new int[99], 0, 8));
    }
    assertThrows(ArrayIndexOutOfBoundsException.class, () -> toolkit.writeArea(part, new int[62], 0, 7));
    assertThrows(NullPointerException.class, () -> toolkit.writeArea(part, null, 0, 7));
    assertArrayEquals(expected, toolkit.readArea(ALL));
  }

  @Test
  void depthKeepsCirclesOut() {
    try (DepthBuffer depth = toolkit.createDepthBuffer(WIDTH, HEIGHT)) {
      toolkit.drawTo(target, depth);
      toolkit.clearDepth();
      check(() -> toolkit.fillCircle(9, 9, 8, INK, BlendMode.REPLACE), circle());
    }
  }

  @Test
  void aShapeHasTheRowsOfItsBox() {
    Spans circle = Spans.ellipse(8, 8);
    assertArrayEquals(new int[] {2, 1, 0, 0, 0, 0, 1, 2}, circle.starts());
    assertArrayEquals(new int[] {4, 6, 8, 8, 8, 8, 6, 4}, circle.lengths());
    Spans box = Spans.roundedRectangle(10, 5, 1);
    assertArrayEquals(new int[] {0, 0, 0, 0, 0}, box.starts());
    assertThrows(IllegalArgumentException.class, () -> new Spans(1, 2, new int[2], new int[1]));
  }
}
