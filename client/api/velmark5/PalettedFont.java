package velmark5;

/** A font with colours of its own. The methods with a colour draw all of a glyph's pixels in that one. */
public interface PalettedFont extends Font {
  /**
   * Draws text in the font's own colours.
   *
   * @param text the text
   * @param x where the first line starts
   * @param y the baseline of the first line
   */
  void draw(CharSequence text, int x, int y);

  /**
   * Draws text in the font's own colours inside a shape.
   *
   * @param text the text
   * @param x where the first line starts
   * @param y the baseline of the first line
   * @param mask the shape
   * @param maskX left edge of the shape's box
   * @param maskY top edge of the shape's box
   */
  void draw(CharSequence text, int x, int y, ClippingMask mask, int maskX, int maskY);

  /**
   * Draws text in the font's own colours that runs up the screen.
   *
   * @param text the text
   * @param x the baseline of the first line, now a column
   * @param y where the first line starts, its lower end
   */
  void drawUpwards(CharSequence text, int x, int y);
}
