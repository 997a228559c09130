package velmark5;

/** The 16-bit colour words of models and terrain: hue in 6 bits, saturation in 3, lightness in 7, from the top. */
public final class Hsl {
  private Hsl() {}

  /**
   * A colour word.
   *
   * @param hue in turns: 0 red, 1/3 green, 2/3 blue; whole turns do not count
   * @param saturation 0 grey to 1 pure
   * @param lightness 0 black to 1 white
   * @return the word
   */
  public static int of(double hue, double saturation, double lightness) {
    int h = (int) ((hue - Math.floor(hue)) * 64) & 63;
    int s = Math.max(0, Math.min(7, (int) (saturation * 8)));
    int l = Math.max(0, Math.min(127, (int) (lightness * 128)));
    return h << 10 | s << 7 | l;
  }

  /**
   * The colour word that looks most like a colour of the screen.
   *
   * @param rgb 0xRRGGBB
   * @return the word
   */
  public static int ofRgb(int rgb) {
    // What the library shows of a channel is its 0.7th power.
    double gamma = 1 / 0.7;
    double r = Math.pow((rgb >> 16 & 255) / 256.0, gamma);
    double g = Math.pow((rgb >> 8 & 255) / 256.0, gamma);
    double b = Math.pow((rgb & 255) / 256.0, gamma);
    double most = Math.max(r, Math.max(g, b));
    double least = Math.min(r, Math.min(g, b));
    double range = most - least;
    double lightness = (most + least) / 2;
    if (range == 0) {
      return of(0, 0, lightness);
    }
    double hue = most == r ? (g - b) / range / 6 : most == g ? ((b - r) / range + 2) / 6 : ((r - g) / range + 4) / 6;
    double saturation = lightness < 0.5 ? range / (most + least) : range / (2 - most - least);
    return of(hue, saturation, lightness);
  }
}
