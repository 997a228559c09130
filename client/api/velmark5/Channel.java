package velmark5;

/** A byte of a frame's pixel that can become a sprite's alpha. */
public enum Channel {
  /** The red byte. */
  RED(0),
  /** The green byte. */
  GREEN(1),
  /** The blue byte. */
  BLUE(2),
  /** 255 wherever the whole word is not 0, else 0. */
  COVERAGE(3);

  private final int code;

  Channel(int code) {
    this.code = code;
  }

  /**
   * The number by which the native library knows the channel.
   *
   * @return 0 to 3
   */
  public int code() {
    return code;
  }
}
