package velmark5;

import java.util.Objects;

/**
 * How a texture behaves.
 *
 * @param averageHsl the 16-bit hue, saturation and lightness word that stands for the texture
 * @param alpha how its alpha is used
 * @param lighting kind of material, 0 to 255; 6 is not lit
 * @param greyBlend how much ground vertices with it turn to grey, 0 to 255
 * @param brighten how much ground vertices with it are lightened, 0 to 255
 * @param scrollU speed along u, -128 to 127 in 64ths of its width per second
 * @param scrollV speed along v, -128 to 127 in 64ths of its height per second
 * @param flatColour whether its average colour may stand for it
 * @param hidden whether faces with it are left out
 * @param wrapU whether it repeats along u
 * @param wrapV whether it repeats along v
 */
public record TextureMetrics(
    int averageHsl,
    Alpha alpha,
    int lighting,
    int greyBlend,
    int brighten,
    int scrollU,
    int scrollV,
    boolean flatColour,
    boolean hidden,
    boolean wrapU,
    boolean wrapV) {
  /** An opaque texture that repeats, is lit and stands still. */
  public static final TextureMetrics PLAIN =
      new TextureMetrics(0, Alpha.OPAQUE, 0, 0, 0, 0, 0, false, false, true, true);

  /** How a texture's alpha is used. */
  public enum Alpha {
    /** Not at all. */
    OPAQUE(0),
    /** Words of 0 are holes. */
    HOLES(1),
    /** The texture blends with what is behind it. */
    BLENDED(2);

    private final int code;

    Alpha(int code) {
      this.code = code;
    }

    /**
     * The number by which the native library knows the kind.
     *
     * @return 0 to 2
     */
    public int code() {
      return code;
    }
  }

  /**
   * Checks the ranges.
   *
   * @param averageHsl 0 to 65535
   * @param alpha how its alpha is used
   * @param lighting 0 to 255
   * @param greyBlend 0 to 255
   * @param brighten 0 to 255
   * @param scrollU -128 to 127
   * @param scrollV -128 to 127
   * @param flatColour whether its average colour may stand for it
   * @param hidden whether faces with it are left out
   * @param wrapU whether it repeats along u
   * @param wrapV whether it repeats along v
   * @throws IllegalArgumentException if a number is out of range
   */
  public TextureMetrics {
    Objects.requireNonNull(alpha, "alpha");
    check("averageHsl", averageHsl, 0, 65535);
    check("lighting", lighting, 0, 255);
    check("greyBlend", greyBlend, 0, 255);
    check("brighten", brighten, 0, 255);
    check("scrollU", scrollU, -128, 127);
    check("scrollV", scrollV, -128, 127);
  }

  private static void check(String name, int value, int least, int most) {
    if (value < least || value > most) {
      throw new IllegalArgumentException(name + ": " + value + " is not " + least + " to " + most);
    }
  }

  /**
   * The same with another average colour.
   *
   * @param hsl 16-bit hue, saturation and lightness
   * @return the new metrics
   */
  public TextureMetrics withAverage(int hsl) {
    return new TextureMetrics(
        hsl, alpha, lighting, greyBlend, brighten, scrollU, scrollV, flatColour, hidden, wrapU, wrapV);
  }

  /**
   * The same with another use of alpha.
   *
   * @param kind how alpha is used
   * @return the new metrics
   */
  public TextureMetrics withAlpha(Alpha kind) {
    return new TextureMetrics(
        averageHsl, kind, lighting, greyBlend, brighten, scrollU, scrollV, flatColour, hidden, wrapU, wrapV);
  }

  /**
   * The same with another kind of material.
   *
   * @param kind 0 to 255
   * @return the new metrics
   */
  public TextureMetrics withLighting(int kind) {
    return new TextureMetrics(
        averageHsl, alpha, kind, greyBlend, brighten, scrollU, scrollV, flatColour, hidden, wrapU, wrapV);
  }

  /**
   * The same, scrolling.
   *
   * @param u -128 to 127 in 64ths of its width per second
   * @param v -128 to 127 in 64ths of its height per second
   * @return the new metrics
   */
  public TextureMetrics withScroll(int u, int v) {
    return new TextureMetrics(
        averageHsl, alpha, lighting, greyBlend, brighten, u, v, flatColour, hidden, wrapU, wrapV);
  }

  /**
   * The same with other edges.
   *
   * @param u whether it repeats along u
   * @param v whether it repeats along v
   * @return the new metrics
   */
  public TextureMetrics withWrap(boolean u, boolean v) {
    return new TextureMetrics(
        averageHsl, alpha, lighting, greyBlend, brighten, scrollU, scrollV, flatColour, hidden, u, v);
  }
}
