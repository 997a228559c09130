package velmark5;

/**
 * Colours as words of the form 0xAARRGGBB. All arguments are 0 to 255 unless a method says otherwise; bits above the
 * low eight are ignored.
 */
public final class Colour {
  /** Opaque black. */
  public static final int BLACK = 0xFF000000;

  /** Opaque white. */
  public static final int WHITE = 0xFFFFFFFF;

  /** No colour at all: black with an alpha of 0. */
  public static final int TRANSPARENT = 0;

  private Colour() {}

  /**
   * An opaque colour.
   *
   * @param red red
   * @param green green
   * @param blue blue
   * @return the colour with an alpha of 255
   */
  public static int rgb(int red, int green, int blue) {
    return argb(255, red, green, blue);
  }

  /**
   * A colour with alpha.
   *
   * @param alpha 0 invisible to 255 opaque
   * @param red red
   * @param green green
   * @param blue blue
   * @return the colour, channels not multiplied by alpha
   */
  public static int argb(int alpha, int red, int green, int blue) {
    return (alpha & 255) << 24 | (red & 255) << 16 | (green & 255) << 8 | (blue & 255);
  }

  /**
   * The same colour with another alpha.
   *
   * @param colour the colour
   * @param alpha the new alpha
   * @return red, green and blue of the colour with that alpha
   */
  public static int withAlpha(int colour, int alpha) {
    return (alpha & 255) << 24 | (colour & 0xFFFFFF);
  }

  /**
   * A colour between two others, all four channels in proportion.
   *
   * @param from the colour at 0
   * @param to the colour at 1
   * @param amount where between them; values outside 0 to 1 count as the nearer end
   * @return the mixed colour, rounded to the nearest value in each channel
   */
  public static int mix(int from, int to, double amount) {
    double t = Math.max(0, Math.min(1, amount));
    int result = 0;
    for (int shift = 0; shift < 32; shift += 8) {
      double a = from >>> shift & 255;
      double b = to >>> shift & 255;
      result |= (int) Math.round(a + (b - a) * t) << shift;
    }
    return result;
  }

  /**
   * A colour made darker, or dimmer for {@link BlendMode#ADD}; its alpha stays.
   *
   * @param colour the colour
   * @param factor 0 black to 1 unchanged; values outside count as the nearer end
   * @return the scaled colour
   */
  public static int scale(int colour, double factor) {
    return withAlpha(mix(0, colour, factor), colour >>> 24);
  }

  /**
   * The colour's alpha.
   *
   * @param colour the colour
   * @return 0 to 255
   */
  public static int alpha(int colour) {
    return colour >>> 24;
  }

  /**
   * The colour's red.
   *
   * @param colour the colour
   * @return 0 to 255
   */
  public static int red(int colour) {
    return colour >>> 16 & 255;
  }

  /**
   * The colour's green.
   *
   * @param colour the colour
   * @return 0 to 255
   */
  public static int green(int colour) {
    return colour >>> 8 & 255;
  }

  /**
   * The colour's blue.
   *
   * @param colour the colour
   * @return 0 to 255
   */
  public static int blue(int colour) {
    return colour & 255;
  }
}
