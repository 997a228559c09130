package velmark5;

import java.util.Objects;

/**
 * A change of a sprite's colours while it is drawn.
 *
 * @param operation what happens to each channel
 * @param colour the other operand, 0xAARRGGBB
 */
public record Tint(ColourOperation operation, int colour) {
  /** The sprite as it is. */
  public static final Tint NONE = new Tint(ColourOperation.NONE, 0);

  /**
   * Checks that there is an operation.
   *
   * @param operation what happens to each channel
   * @param colour the other operand
   */
  public Tint {
    Objects.requireNonNull(operation, "operation");
  }

  /**
   * Multiplies each channel.
   *
   * @param colour the factors in 256ths, alpha included: 0x80FFFFFF makes the sprite half transparent
   * @return the tint
   */
  public static Tint multiply(int colour) {
    return new Tint(ColourOperation.MULTIPLY, colour);
  }

  /**
   * Adds to each channel.
   *
   * @param colour what is added, alpha included
   * @return the tint
   */
  public static Tint add(int colour) {
    return new Tint(ColourOperation.ADD, colour);
  }

  /**
   * Subtracts from each channel.
   *
   * @param colour what is subtracted, alpha included
   * @return the tint
   */
  public static Tint subtract(int colour) {
    return new Tint(ColourOperation.SUBTRACT, colour);
  }

  /**
   * Mixes each channel with a colour's; the result's alpha comes from the mixture too.
   *
   * @param colour the colour; its own alpha byte is not used
   * @param kept how much of the sprite stays, 0 to 127 in 256ths
   * @return the tint
   * @throws IllegalArgumentException if {@code kept} is out of range
   */
  public static Tint mix(int colour, int kept) {
    if (kept < 0 || kept > 127) {
      throw new IllegalArgumentException("kept: " + kept + " is not 0 to 127");
    }
    return new Tint(ColourOperation.MIX, Colour.withAlpha(colour, kept));
  }
}
