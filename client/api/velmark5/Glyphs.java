package velmark5;

import java.awt.Graphics2D;
import java.awt.RenderingHints;
import java.awt.font.FontRenderContext;
import java.awt.font.GlyphVector;
import java.awt.geom.Rectangle2D;
import java.awt.image.BufferedImage;
import java.util.ArrayList;
import java.util.HashMap;
import java.util.List;
import java.util.Map;
import java.util.Objects;
import java.util.function.IntUnaryOperator;
import java.util.stream.IntStream;

/**
 * The pictures and measures of a set of characters, from which a {@link Font} is made. Made from any font of Java 2D.
 */
public final class Glyphs {
  /** The printable characters of Latin text: what most western European languages need. */
  public static final String LATIN =
      IntStream.concat(IntStream.rangeClosed(0x20, 0x7E), IntStream.rangeClosed(0xA0, 0xFF))
          .collect(StringBuilder::new, StringBuilder::appendCodePoint, StringBuilder::append)
          .toString();

  private static final int MISSING = -1;

  private final List<Glyph> glyphs;
  private final Map<Character, Integer> indices = new HashMap<>();
  private final int ascent;
  private final int lineHeight;

  /**
   * One character.
   *
   * @param character which one
   * @param width columns of its picture
   * @param height rows of its picture
   * @param pixels width times height bytes, row after row
   * @param xOffset columns from the pen to the picture's left edge
   * @param yOffset rows from the baseline to the picture's top edge, negative above
   * @param advance columns from this character's pen to the next one's
   */
  public record Glyph(
      char character, int width, int height, byte[] pixels, int xOffset, int yOffset, int advance) {
    /**
     * Checks the picture's size.
     *
     * @param character which one
     * @param width columns of its picture
     * @param height rows of its picture
     * @param pixels width times height bytes
     * @param xOffset columns from the pen
     * @param yOffset rows from the baseline
     * @param advance columns to the next pen
     * @throws IllegalArgumentException if there are not width times height pixels
     */
    public Glyph {
      Objects.requireNonNull(pixels, "pixels");
      if (width < 0 || height < 0 || pixels.length != (long) width * height) {
        throw new IllegalArgumentException("pixels: " + pixels.length + " for " + width + "x" + height);
      }
    }
  }

  /**
   * Takes glyphs as they are.
   *
   * @param glyphs the glyphs, at most 32767, each character once
   * @param ascent how far letters reach above the baseline, in pixels
   * @param lineHeight distance of baselines, in pixels
   * @throws IllegalArgumentException if there are too many glyphs or a character comes twice
   */
  public Glyphs(List<Glyph> glyphs, int ascent, int lineHeight) {
    this.glyphs = List.copyOf(glyphs);
    this.ascent = ascent;
    this.lineHeight = lineHeight;
    if (glyphs.size() > Short.MAX_VALUE) {
      throw new IllegalArgumentException("glyphs: " + glyphs.size() + " is more than " + Short.MAX_VALUE);
    }
    for (Glyph glyph : glyphs) {
      if (indices.put(glyph.character(), indices.size()) != null) {
        throw new IllegalArgumentException("glyphs: '" + glyph.character() + "' comes twice");
      }
    }
  }

  /**
   * Draws characters of a Java 2D font with smooth edges, for {@link Toolkit#createSmoothFont}.
   *
   * @param font typeface, style and size
   * @param characters the characters, for instance {@link #LATIN}; those that the font does not have are left out
   * @return glyphs whose bytes are coverage
   */
  public static Glyphs smooth(java.awt.Font font, String characters) {
    return render(font, characters, true);
  }

  /**
   * Draws characters of a Java 2D font with hard edges, for {@link Toolkit#createMonoFont}.
   *
   * @param font typeface, style and size
   * @param characters the characters, for instance {@link #LATIN}; those that the font does not have are left out
   * @return glyphs whose bytes are 0 or 255
   */
  public static Glyphs hard(java.awt.Font font, String characters) {
    return render(font, characters, false);
  }

  /**
   * Glyphs for {@link Toolkit#createPalettedFont} with an outline one pixel wide: index 1 is the outline, 2 and up are
   * the letter in bands from its top to its bottom.
   *
   * @param font typeface, style and size
   * @param characters the characters, for instance {@link #LATIN}; those that the font does not have are left out
   * @param bands how many bands the height of the capitals is cut into, 1 to 253
   * @return glyphs whose bytes are indices from 0 to {@code bands + 1}
   * @throws IllegalArgumentException if the number of bands is out of range
   */
  public static Glyphs outlined(java.awt.Font font, String characters, int bands) {
    if (bands < 1 || bands > 253) {
      throw new IllegalArgumentException("bands: " + bands + " is not 1 to 253");
    }
    Glyphs plain = render(font, characters, false);
    int top = plain.indices.containsKey('H') ? -plain.glyphs.get(plain.indices.get('H')).yOffset() : plain.ascent;
    List<Glyph> outlined = new ArrayList<>();
    for (Glyph glyph : plain.glyphs) {
      outlined.add(outline(glyph, row -> 2 + Math.max(0, Math.min(bands - 1, (row + top) * bands / Math.max(1, top)))));
    }
    return new Glyphs(outlined, plain.ascent + 1, plain.lineHeight + 2);
  }

  /** A picture one pixel larger on each side; the index of a letter's pixel depends on its row from the baseline. */
  private static Glyph outline(Glyph glyph, IntUnaryOperator bandOfRow) {
    if (glyph.pixels().length == 0) {
      return glyph;
    }
    int width = glyph.width() + 2;
    int height = glyph.height() + 2;
    byte[] pixels = new byte[width * height];
    for (int y = 0; y < glyph.height(); y++) {
      for (int x = 0; x < glyph.width(); x++) {
        if (glyph.pixels()[y * glyph.width() + x] != 0) {
          for (int near = 0; near < 9; near++) {
            int at = (y + near / 3) * width + x + near % 3;
            if (near == 4) {
              pixels[at] = (byte) bandOfRow.applyAsInt(glyph.yOffset() + y);
            } else if (pixels[at] == 0) {
              pixels[at] = 1;
            }
          }
        }
      }
    }
    return new Glyph(
        glyph.character(), width, height, pixels, glyph.xOffset() - 1, glyph.yOffset() - 1, glyph.advance() + 1);
  }

  private static Glyphs render(java.awt.Font font, String characters, boolean smooth) {
    Object hint = smooth ? RenderingHints.VALUE_TEXT_ANTIALIAS_ON : RenderingHints.VALUE_TEXT_ANTIALIAS_OFF;
    FontRenderContext context = new FontRenderContext(null, hint, RenderingHints.VALUE_FRACTIONALMETRICS_OFF);
    var measures = font.getLineMetrics(characters, context);
    List<Glyph> glyphs = new ArrayList<>();
    characters
        .chars()
        .distinct()
        .filter(font::canDisplay)
        .forEach(character -> glyphs.add(render(font, (char) character, context, hint)));
    int ascent = (int) Math.ceil(measures.getAscent());
    return new Glyphs(glyphs, ascent, (int) Math.ceil(measures.getHeight()));
  }

  private static Glyph render(java.awt.Font font, char character, FontRenderContext context, Object hint) {
    GlyphVector vector = font.createGlyphVector(context, new char[] {character});
    int advance = Math.round(vector.getGlyphMetrics(0).getAdvanceX());
    Rectangle2D bounds = vector.getVisualBounds();
    if (bounds.isEmpty()) {
      return new Glyph(character, 0, 0, new byte[0], 0, 0, advance);
    }
    // Hinting may reach a pixel past the outline's bounds.
    int left = (int) Math.floor(bounds.getMinX()) - 1;
    int top = (int) Math.floor(bounds.getMinY()) - 1;
    int width = (int) Math.ceil(bounds.getMaxX()) + 1 - left;
    int height = (int) Math.ceil(bounds.getMaxY()) + 1 - top;
    BufferedImage image = new BufferedImage(width, height, BufferedImage.TYPE_BYTE_GRAY);
    Graphics2D graphics = image.createGraphics();
    graphics.setRenderingHint(RenderingHints.KEY_TEXT_ANTIALIASING, hint);
    graphics.drawGlyphVector(vector, -left, -top);
    graphics.dispose();
    return trimmed(character, image, left, top, advance);
  }

  private static Glyph trimmed(char character, BufferedImage image, int left, int top, int advance) {
    int[] samples = image.getRaster().getSamples(0, 0, image.getWidth(), image.getHeight(), 0, (int[]) null);
    int minX = image.getWidth();
    int minY = image.getHeight();
    int maxX = -1;
    int maxY = -1;
    for (int i = 0; i < samples.length; i++) {
      if (samples[i] != 0) {
        minX = Math.min(minX, i % image.getWidth());
        maxX = Math.max(maxX, i % image.getWidth());
        minY = Math.min(minY, i / image.getWidth());
        maxY = i / image.getWidth();
      }
    }
    if (maxX < 0) {
      return new Glyph(character, 0, 0, new byte[0], 0, 0, advance);
    }
    int width = maxX - minX + 1;
    int height = maxY - minY + 1;
    byte[] pixels = new byte[width * height];
    for (int i = 0; i < pixels.length; i++) {
      pixels[i] = (byte) samples[(minY + i / width) * image.getWidth() + minX + i % width];
    }
    return new Glyph(character, width, height, pixels, left + minX, top + minY, advance);
  }

  /**
   * The glyphs, in the order of their indices.
   *
   * @return a list that cannot be changed
   */
  public List<Glyph> list() {
    return glyphs;
  }

  /**
   * How far letters reach above the baseline.
   *
   * @return pixels
   */
  public int ascent() {
    return ascent;
  }

  /**
   * The distance of baselines.
   *
   * @return pixels from one line to the next
   */
  public int lineHeight() {
    return lineHeight;
  }

  /**
   * Finds the glyph that stands for a character.
   *
   * @param character the character
   * @return its index, or that of the question mark, or -1 when there is neither
   */
  public int indexOf(char character) {
    Integer index = indices.get(character);
    return index != null ? index : indices.getOrDefault('?', MISSING);
  }

  /**
   * Measures text.
   *
   * @param text the text
   * @return pixels from the start to the end of its longest line
   */
  public int width(CharSequence text) {
    int[] widest = {0};
    lay(text, (index, across, line) -> widest[0] = Math.max(widest[0], across + glyphs.get(index).advance()));
    return widest[0];
  }

  /** Takes glyphs and where they go. */
  @FunctionalInterface
  public interface Placement {
    /**
     * One glyph of a text.
     *
     * @param index which glyph
     * @param across pixels from the start of the line to the glyph's pen
     * @param line pixels from the first baseline to the glyph's, a multiple of the line height
     */
    void place(int index, int across, int line);
  }

  /**
   * Lays text out.
   *
   * @param text the text; a line feed starts a new line
   * @param placement gets every glyph of the text in order
   */
  public void lay(CharSequence text, Placement placement) {
    int across = 0;
    int line = 0;
    for (int i = 0; i < text.length(); i++) {
      char character = text.charAt(i);
      if (character == '\n') {
        across = 0;
        line += lineHeight;
        continue;
      }
      int index = indexOf(character);
      if (index != MISSING) {
        placement.place(index, across, line);
        across += glyphs.get(index).advance();
      }
    }
  }
}
