package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.util.Arrays;
import java.util.List;
import java.util.function.IntUnaryOperator;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Test;

/** Shapes, sprites and text on a small target, all of whose pixels are compared. */
class DrawingTest extends ToolkitTest {
  private static final int WIDTH = 12;
  private static final int HEIGHT = 9;
  private static final Rect ALL = new Rect(0, 0, WIDTH, HEIGHT);
  private static final int PAPER = 0x00406080;
  private static final int INK = 0xFF123456;

  private MemoryPool pool;
  private Sprite target;

  @BeforeEach
  void open() {
    pool = toolkit.createPool(1000);
    target = toolkit.createSprite(WIDTH, HEIGHT);
    toolkit.drawTo(target, null);
  }

  /** Draws on paper; the rows say which of the words each pixel is, with a dot for paper. Missing rows are paper. */
  private void assertDraws(Runnable drawing, List<String> rows, int... words) {
    toolkit.clear(PAPER);
    drawing.run();
    int[] expected = new int[WIDTH * HEIGHT];
    Arrays.fill(expected, PAPER);
    for (int y = 0; y < rows.size(); y++) {
      for (int x = 0; x < rows.get(y).length(); x++) {
        char mark = rows.get(y).charAt(x);
        expected[y * WIDTH + x] = mark == '.' ? PAPER : words[mark - 'a'];
      }
    }
    assertArrayEquals(expected, pixels());
  }

  /** Puts four channel values together, each given by the channel's shift. */
  private static int channels(IntUnaryOperator valueAtShift) {
    int result = 0;
    for (int shift = 0; shift < 32; shift += 8) {
      result |= valueAtShift.applyAsInt(shift) << shift;
    }
    return result;
  }

  private static int byteAt(int word, int shift) {
    return word >>> shift & 255;
  }

  @Test
  void shapesInTheirModes() {
    Rect box = new Rect(2, 1, 4, 3);
    List<String> filled = List.of("", "..aaaa", "..aaaa", "..aaaa");
    assertDraws(() -> toolkit.fillRect(box, INK, BlendMode.REPLACE), filled, INK);
    assertDraws(() -> toolkit.fillRect(box, 0x80FFFFFF, BlendMode.ALPHA), filled, 0x809FAFBF);
    assertDraws(() -> toolkit.fillRect(box, 0x01C00101, BlendMode.ADD), filled, 0x01FF6181);
    assertDraws(() -> toolkit.drawRect(box, 0x01010101, BlendMode.ADD), List.of("", "..aaaa", "..a..a", "..aaaa"),
        0x01416181);
    assertDraws(() -> toolkit.horizontalLine(-3, 1, 5, INK, BlendMode.REPLACE), List.of("", "aa"), INK);
    assertDraws(() -> toolkit.verticalLine(2, 1, 3, INK, BlendMode.REPLACE), List.of("", "..a", "..a", "..a"), INK);
    assertDraws(() -> toolkit.line(4, 3, 2, 1, INK, BlendMode.REPLACE), List.of("", "..a", "...a", "....a"), INK);
    // The edge leans outwards: a disc of this size is a square.
    List<String> disc = List.of(".aaaaa", ".aaaaa", ".aaaaa", ".aaaaa", ".aaaaa");
    assertDraws(() -> toolkit.fillCircle(3, 2, -2, INK, BlendMode.REPLACE), disc, INK);
    toolkit.drawTo(target, toolkit.createDepthBuffer(WIDTH, HEIGHT));
    toolkit.clearDepth();
    assertDraws(() -> toolkit.fillCircle(3, 2, 2, INK, BlendMode.REPLACE), disc, INK);
  }

  @Test
  void trianglesAndThickLines() {
    ThreadResource resource = toolkit.createThreadResource();
    assertDraws(() -> resource.line(2, 3, 9, 3, INK, 2, BlendMode.REPLACE),
        List.of("", "", "..aaaaaaa", "..aaaaaaa"), INK);
    toolkit.setClip(new Rect(4, 0, 7, 9));
    toolkit.clear(0);
    resource.fillTriangle(0, 0, Colour.BLACK, 0, 32, Colour.BLACK, 32, 0, Colour.WHITE);
    for (int x = 5; x < 11; x++) {
      assertTrue(Colour.red(at(x, 0)) > Colour.red(at(x - 1, 0)), "brighter to the right");
    }
    assertEquals(PAPER, at(3, 0) & at(11, 0));
    resource.close();
    refuses(IllegalStateException.class, () -> resource.line(0, 0, 1, 1, -1, 2, BlendMode.REPLACE));
  }

  @Test
  void masksCutByTheClip() {
    ClippingMask mask = toolkit.createMask(pool, new Spans(9, 3, new int[] {0, 4, 8}, new int[] {9, 2, 0}));
    Runnable spans = () -> toolkit.fillMask(INK, mask, 3, 1);
    assertDraws(spans, List.of("", "...aaaaaaaaa", ".......aa"), INK);
    assertDraws(() -> toolkit.withClip(new Rect(0, 2, 8, 7), spans), List.of("", "", ".......a"), INK);
    assertDraws(() -> toolkit.line(8, 0, 8, 8, INK, BlendMode.REPLACE, mask, 3, 1),
        List.of("", "........a", "........a"), INK);
    assertEquals(12, mask.width() + mask.height());
    Spans circle = Spans.ellipse(8, 8);
    assertArrayEquals(new int[] {2, 1, 0, 0, 0, 0, 1, 2}, circle.starts());
    assertArrayEquals(new int[] {4, 6, 8, 8, 8, 8, 6, 4}, circle.lengths());
    assertArrayEquals(new int[] {0, 0, 0, 0, 0}, Spans.roundedRectangle(10, 5, 1).starts());
    refuses(IllegalArgumentException.class, () -> new Spans(1, 2, new int[2], new int[1]));
  }

  @Test
  void clipAndViewport() {
    toolkit.setClip(new Rect(-10, 5, 20, 100));
    assertEquals(Rect.between(0, 5, 10, HEIGHT), toolkit.clip());
    toolkit.narrowClip(new Rect(4, 0, 100, 7));
    Rect clip = Rect.between(4, 5, 10, 7);
    refuses(ArithmeticException.class, () -> toolkit.withClip(new Rect(9, 9, 0, 0), () -> {
      toolkit.clear(INK);
      throw new ArithmeticException();
    }));
    assertEquals(clip, toolkit.clip());
    toolkit.resetClip();
    assertEquals(ALL, toolkit.clip());
    assertDraws(() -> toolkit.withClip(clip, () -> toolkit.clearAll(INK)),
        List.of("", "", "", "", "", "....aaaaaa", "....aaaaaa"), INK);

    toolkit.setViewport(new Rect(1, 2, 3, 4));
    toolkit.setDepthRange(0, 1);
    assertEquals(new Rect(1, 2, 3, 4), toolkit.viewport());
    toolkit.resetViewport();
    assertEquals(ALL, toolkit.viewport());
  }

  @Test
  void areasAndScrolling() {
    assertDraws(() -> {
      toolkit.writeArea(new Rect(2, 1, 2, 2), new int[] {9, 9, 1, 2, 9, 3, 4}, 2, 3);
      assertArrayEquals(new int[] {1, 2, 3, 4}, toolkit.readArea(new Rect(2, 1, 2, 2)));
      toolkit.scroll(3, 2);
      toolkit.scroll(0, -100);
      assertEquals(0xFF000002, toolkit.snapshot().getRGB(6, 3));
    }, List.of("", "..ab", "..c", ".....ab", ".....cd"), 1, 2, 3, 4);
    for (Rect outside : new Rect[] {new Rect(-1, 0, 2, 2), new Rect(5, 0, 8, 1), new Rect(0, 8, 1, 2)}) {
      refuses(IllegalArgumentException.class, () -> toolkit.readArea(outside),
          () -> toolkit.writeArea(outside, new int[99], 0, 8));
    }
    refuses(ArrayIndexOutOfBoundsException.class, () -> toolkit.writeArea(new Rect(0, 0, 7, 9), new int[62], 0, 7));
    refuses(NullPointerException.class, () -> toolkit.writeArea(ALL, null, 0, 12));
  }

  @Test
  void spritesInTheirPlacements() {
    int a = 0xFF102030;
    int b = 0x80C0D0E0;
    Sprite sprite = sprite(3, 2, a, b, b, a, a, b);
    List<String> still = List.of("", "..abb", "..aab");
    List<String> turned = List.of("..aa", "..ab", "..bb");
    Runnable plain = () -> sprite.draw(2, 1, Tint.NONE, BlendMode.REPLACE);
    assertDraws(plain, still, a, b);
    assertDraws(() -> toolkit.withClip(new Rect(3, 0, 1, 9), plain), List.of("", "...b", "...a"), a, b);
    assertDraws(() -> sprite.drawScaled(new Rect(1, 0, 6, 4), Tint.NONE, BlendMode.REPLACE),
        List.of(".aabbbb", ".aabbbb", ".aaaabb", ".aaaabb"), a, b);
    assertDraws(() -> sprite.drawScaled(new Rect(0, 0, 0, 0), Tint.NONE, BlendMode.REPLACE), List.of());
    assertDraws(() -> sprite.drawAcross(2, 1, 5, 1, 2, 3, Tint.NONE, BlendMode.REPLACE), still, a, b);
    assertDraws(() -> sprite.drawAcross(4, 0, 4, 3, 2, 0, Tint.NONE, BlendMode.REPLACE), turned, a, b);
    assertDraws(() -> sprite.drawRotated(3, 1.5, Math.PI / 2, 1, Tint.NONE, BlendMode.REPLACE), turned, a, b);
    assertDraws(() -> sprite.drawAcross(1, 1, 1, 1, 1, 3, Tint.NONE, BlendMode.REPLACE), List.of());
    assertDraws(() -> sprite.drawTiled(new Rect(2, 1, 4, 3), Tint.NONE, BlendMode.REPLACE),
        List.of("", "..abba", "..aaba", "..abba"), a, b);

    int over = channels(s -> (byteAt(a, s) * 255 >> 8) + (byteAt(PAPER, s) >> 8));
    int half = channels(s -> (byteAt(b, s) * 128 >> 8) + (byteAt(PAPER, s) * 128 >> 8));
    ClippingMask mask = toolkit.createMask(pool, new Spans(3, 2, new int[] {1, 0}, new int[] {1, 3}));
    assertDraws(() -> sprite.draw(0, 0), List.of("abb", "aab"), over, half);
    assertDraws(() -> sprite.draw(0, 0, mask, 0, 0), List.of(".b", "aab"), over, half);
    assertDraws(() -> sprite.drawAcross(0, 0, 3, 0, 0, 2, mask, 0, 0, BlendMode.REPLACE), List.of(".b", "aab"), a, b);

    toolkit.drawTo(target, toolkit.createDepthBuffer(WIDTH, HEIGHT));
    toolkit.clearDepth();
    assertDraws(() -> sprite.drawScaled(new Rect(2, 1, 3, 2), 7, Tint.NONE, BlendMode.REPLACE), still, a, b);
    sprite.setMargins(new Margins(2, 1, 0, 0));
    assertDraws(plain, List.of("", "", "....abb", "....aab"), a, b);
    refuses(IllegalArgumentException.class,
        () -> sprite.drawAcross(0, 0, 1, 0, 0, 1, mask, 0, 0, BlendMode.ADD),
        () -> toolkit.createSprite(0, 5).drawTiled(ALL, Tint.NONE, BlendMode.ALPHA));
    sprite.close();
    refuses(IllegalStateException.class, () -> sprite.draw(0, 0));
  }

  @Test
  void tintsAndBlends() {
    int s = 0x70C01008;
    int c = 0x50A0F010;
    Sprite sprite = sprite(1, 1, s);
    int mixed = channels(i -> (byteAt(s, i) * 100 >> 8) + (byteAt(c, i) * 155 >> 8));
    Tint[] tints = {Tint.multiply(c), Tint.mix(c, 100), Tint.add(c), Tint.subtract(c)};
    int[] words = {
      channels(i -> byteAt(s, i) * byteAt(c, i) >> 8),
      // A mixture's alpha is mixed with the number that says how much is kept.
      Colour.withAlpha(mixed, (byteAt(s, 24) * 100 >> 8) + (100 * 155 >> 8)),
      channels(i -> Math.min(255, byteAt(s, i) + byteAt(c, i))),
      channels(i -> Math.max(0, byteAt(s, i) - byteAt(c, i))),
    };
    for (int n = 0; n < 4; n++) {
      Tint tint = tints[n];
      int word = words[n];
      assertDraws(() -> sprite.draw(0, 0, tint, BlendMode.REPLACE), List.of("a"), word);
      assertDraws(() -> sprite.draw(0, 0, tint, BlendMode.ADD), List.of("a"),
          channels(i -> Math.min(255, byteAt(word, i) + byteAt(PAPER, i))));
    }
    refuses(IllegalArgumentException.class, () -> Tint.mix(c, 128));
  }

  /** An "L" and a dot, on and off, two columns from pen to pen. */
  private static Glyphs letters(int on) {
    byte p = (byte) on;
    var capital = new Glyphs.Glyph('L', 2, 3, new byte[] {p, 0, p, 0, p, p}, 0, -3, 3);
    var dot = new Glyphs.Glyph('?', 1, 1, new byte[] {p}, 1, -1, 3);
    return new Glyphs(List.of(capital, dot, new Glyphs.Glyph(' ', 0, 0, new byte[0], 0, 0, 2)), 3, 4);
  }

  /** Ink on paper, each in its share of 256ths; fonts leave no alpha. */
  private static int inked(int inkShare, int paperShare) {
    return channels(i -> i == 24 ? 0 : (byteAt(PAPER, i) * paperShare >> 8) + (byteAt(INK, i) * inkShare >> 8));
  }

  @Test
  void textInThreeKindsOfFont() {
    Font mono = toolkit.createMonoFont(pool, letters(1));
    Font smooth = toolkit.createSmoothFont(pool, letters(64));
    PalettedFont paletted = toolkit.createPalettedFont(pool, letters(2), new int[] {9, 9, 0x777777});
    // Up the screen: the foot of the L points up, the dot stands one pixel from its pen.
    List<String> text = List.of("", ".a", ".a", ".aa..a", "", ".a", ".a", ".aa");
    List<String> upwards = List.of("", "....a", "", "", "....a", "..aaa");
    List<String> masked = List.of("", "", ".a", "..a");
    ClippingMask mask = toolkit.createMask(pool, new Spans(9, 2, new int[] {0, 2}, new int[] {9, 1}));
    for (Font font : List.of(mono, smooth, paletted)) {
      int seen = font == smooth ? inked(64, 192) : INK;
      assertDraws(() -> font.draw("Lx\nL", 1, 4, INK), text, seen);
      assertDraws(() -> font.drawUpwards("L?", 5, 6, INK), upwards, seen);
      assertDraws(() -> font.draw("L?", 1, 4, INK, mask, 0, 2), masked, seen);
    }
    assertDraws(() -> paletted.draw("Lx\nL", 1, 4), text, 0x777777);
    assertDraws(() -> paletted.drawUpwards("L?", 5, 6), upwards, 0x777777);
    assertDraws(() -> paletted.draw("L?", 1, 4, mask, 0, 2), masked, 0x777777);
    assertDraws(() -> mono.draw("?", 0, 1, 0x80123456), List.of(".a"), inked(128, 127));
    assertDraws(() -> mono.draw("L", 1, 4, 0x00123456), List.of());
    assertEquals(8, mono.width("L L\nx"));
    refuses(IllegalArgumentException.class, () -> toolkit.createPalettedFont(pool, letters(2), new int[2]));
    refuses(NullPointerException.class, () -> mono.draw("L", 0, 0, INK, null, 0, 0));
    pool.close();
    assertDraws(() -> mono.draw("L", 1, 4, INK), List.of());
    mono.close();
    refuses(IllegalStateException.class, () -> mono.draw("L", 1, 4, INK));
  }

  @Test
  void fontsOfTheMachine() {
    var typeface = new java.awt.Font(java.awt.Font.SANS_SERIF, java.awt.Font.BOLD, 30);
    for (Glyphs glyphs : List.of(
        Glyphs.smooth(typeface, "LI"), Glyphs.hard(typeface, "LI"), Glyphs.outlined(typeface, "LI", 5))) {
      Glyphs.Glyph letter = glyphs.list().get(glyphs.indexOf('L'));
      assertTrue(letter.height() > 15 && letter.height() < 32, "a capital of " + letter.height() + " rows");
      assertEquals(0, letter.yOffset() + letter.height(), 2, "it stands on the baseline");
      int lit = 0;
      int low = 0;
      for (int i = 0; i < letter.pixels().length; i++) {
        int on = letter.pixels()[i] != 0 ? 1 : 0;
        lit += on;
        low += i / letter.width() >= letter.height() * 3 / 4 ? on : 0;
      }
      assertTrue(low * 2 > lit * 4 / 5, "the foot of an L is its heavier half");
      assertTrue(glyphs.width("LL") > glyphs.width("II"));
    }
    refuses(IllegalArgumentException.class, () -> Glyphs.outlined(typeface, "L", 254),
        () -> new Glyphs.Glyph('x', 2, 2, new byte[3], 0, 0, 1));
  }
}
