package velmark5;

/**
 * Text in one typeface and size. Made by the toolkit from {@link Glyphs}; lives in a pool.
 *
 * <p>Positions are those of the baseline, on which letters stand. A line feed starts the next line. A character without
 * a glyph is shown as a question mark if there is one, else left out. Drawing is cut to the toolkit's clip rectangle
 * and does nothing without a frame.
 */
public interface Font extends AutoCloseable {
  /**
   * The glyphs and their measures.
   *
   * @return what the font was made from
   */
  Glyphs glyphs();

  /**
   * Draws text in one colour.
   *
   * @param text the text
   * @param x where the first line starts
   * @param y the baseline of the first line
   * @param colour 0xAARRGGBB; whether the alpha counts depends on the kind of font
   */
  void draw(CharSequence text, int x, int y, int colour);

  /**
   * Draws text in one colour inside a shape.
   *
   * @param text the text
   * @param x where the first line starts
   * @param y the baseline of the first line
   * @param colour 0xAARRGGBB; whether the alpha counts depends on the kind of font
   * @param mask the shape
   * @param maskX left edge of the shape's box
   * @param maskY top edge of the shape's box
   */
  void draw(CharSequence text, int x, int y, int colour, ClippingMask mask, int maskX, int maskY);

  /**
   * Draws text that runs up the screen, a quarter turn against the clock; further lines follow to the right.
   *
   * @param text the text
   * @param x the baseline of the first line, now a column
   * @param y where the first line starts, its lower end
   * @param colour 0xAARRGGBB; whether the alpha counts depends on the kind of font
   */
  void drawUpwards(CharSequence text, int x, int y, int colour);

  /**
   * Measures text.
   *
   * @param text the text
   * @return pixels from the start to the end of its longest line
   */
  default int width(CharSequence text) {
    return glyphs().width(text);
  }

  /**
   * The distance of baselines.
   *
   * @return pixels from one line to the next
   */
  default int lineHeight() {
    return glyphs().lineHeight();
  }

  /**
   * How far letters reach above the baseline.
   *
   * @return pixels
   */
  default int ascent() {
    return glyphs().ascent();
  }

  /** Gives the memory back to the pool. */
  @Override
  void close();
}
