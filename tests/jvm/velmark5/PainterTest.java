package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.util.Random;
import java.util.function.IntBinaryOperator;
import java.util.function.IntUnaryOperator;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Test;

/** Each primitive changes just the pixels that it should, seen from Java. */
class PainterTest extends ToolkitTest {
  private static final int WIDTH = 37;
  private static final int HEIGHT = 29;
  private static final Rect ALL = new Rect(0, 0, WIDTH, HEIGHT);
  private static final int INK = 0xFF123456;
  private static final int TINT = 0x5080FF13;

  private final int[] start = new Random(5).ints(WIDTH * HEIGHT).toArray();
  private Sprite target;

  @BeforeEach
  void openOnNoise() {
    target = sprite(WIDTH, HEIGHT, start);
    toolkit.drawTo(target, null);
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
    assertArrayEquals(expected, pixels());
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
  private boolean circle(int x, int y) {
    int square = (x - 9) * (x - 9) + (y - 9) * (y - 9);
    return square <= 7 * 7 || (square < 9 * 9 && at(x, y) == INK);
  }

  @Test
  void shapesInAllModes() {
    Rect box = new Rect(3, 4, 21, 9);
    check(() -> toolkit.fillRect(box, INK, BlendMode.REPLACE), box::contains);
    check(() -> toolkit.fillRect(box, TINT, BlendMode.ALPHA), box::contains, d -> blended(d, TINT));
    check(() -> toolkit.fillRect(box, TINT, BlendMode.ADD), box::contains, d -> added(d, TINT));
    check(() -> toolkit.clear(INK), ALL::contains);
    Rect hole = new Rect(4, 5, 19, 7);
    check(() -> toolkit.drawRect(box, TINT, BlendMode.ADD), (x, y) -> box.contains(x, y) && !hole.contains(x, y),
        d -> added(d, TINT));
    check(() -> toolkit.horizontalLine(-3, 5, 10, INK, BlendMode.REPLACE), (x, y) -> y == 5 && x < 7);
    check(() -> toolkit.verticalLine(6, 20, 50, INK, BlendMode.REPLACE), (x, y) -> x == 6 && y >= 20);
    check(() -> toolkit.line(25, 20, 5, 0, INK, BlendMode.REPLACE), (x, y) -> x - 5 == y && y <= 20);
    check(() -> toolkit.fillCircle(9, 9, -8, INK, BlendMode.REPLACE), this::circle);
    toolkit.drawTo(target, toolkit.createDepthBuffer(WIDTH, HEIGHT));
    toolkit.clearDepth();
    check(() -> toolkit.fillCircle(9, 9, 8, INK, BlendMode.REPLACE), this::circle);
  }

  @Test
  void masksCutByTheClip() {
    MemoryPool pool = toolkit.createPool(4096);
    ClippingMask mask = toolkit.createMask(pool, new Spans(9, 3, new int[] {0, 4, 8}, new int[] {9, 2, 0}));
    Area spans = (x, y) -> (y == 10 && x >= 30) || (y == 11 && (x == 34 || x == 35));
    check(() -> toolkit.fillMask(INK, mask, 30, 10), spans);
    check(() -> toolkit.withClip(new Rect(0, 11, 35, 10), () -> toolkit.fillMask(INK, mask, 30, 10)),
        (x, y) -> x == 34 && y == 11);
    assertEquals(ALL, toolkit.clip());
    check(() -> toolkit.line(36, 10, 27, 10, INK, BlendMode.REPLACE, mask, 30, 10), (x, y) -> y == 10 && x >= 30);
    assertEquals(12, mask.width() + mask.height());
    Spans circle = Spans.ellipse(8, 8);
    assertArrayEquals(new int[] {2, 1, 0, 0, 0, 0, 1, 2}, circle.starts());
    assertArrayEquals(new int[] {4, 6, 8, 8, 8, 8, 6, 4}, circle.lengths());
    assertArrayEquals(new int[] {0, 0, 0, 0, 0}, Spans.roundedRectangle(10, 5, 1).starts());
    refuses(IllegalArgumentException.class, () -> new Spans(1, 2, new int[2], new int[1]));
  }

  @Test
  void clipAndViewport() {
    toolkit.setClip(new Rect(-10, 5, 30, 100));
    assertEquals(Rect.between(0, 5, 20, HEIGHT), toolkit.clip());
    toolkit.narrowClip(new Rect(4, 0, 100, 10));
    Rect clip = Rect.between(4, 5, 20, 10);
    check(() -> toolkit.clearAll(INK), clip::contains);
    refuses(ArithmeticException.class, () -> toolkit.withClip(new Rect(9, 9, 0, 0), () -> {
      toolkit.clear(INK);
      throw new ArithmeticException();
    }));
    check(() -> {}, (x, y) -> false);
    assertEquals(clip, toolkit.clip());
    toolkit.resetClip();
    assertEquals(ALL, toolkit.clip());

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
    toolkit.scroll(0, -100);
    assertEquals(0xFF000000 | expected[5 * WIDTH + 6], toolkit.snapshot().getRGB(6, 5));
    for (Rect outside : new Rect[] {new Rect(-1, 0, 2, 2), new Rect(30, 0, 8, 1), new Rect(0, 28, 1, 2)}) {
      refuses(IllegalArgumentException.class, () -> toolkit.readArea(outside),
          () -> toolkit.writeArea(outside, new int[99], 0, 8));
    }
    refuses(ArrayIndexOutOfBoundsException.class, () -> toolkit.writeArea(part, new int[62], 0, 7));
    refuses(NullPointerException.class, () -> toolkit.writeArea(part, null, 0, 7));
    assertArrayEquals(expected, pixels());
  }
}
