package velmark5;

import java.util.Objects;

/**
 * What a face is made of.
 *
 * @param colour a 16-bit {@linkplain Hsl HSL word}; it also tints the texture
 * @param texture texture id, or {@link #NO_TEXTURE}
 * @param mapping the place of the texture, or null for one repeat on each face
 * @param transparency 0 opaque to 255 invisible
 * @param shading how it takes light
 */
public record Material(int colour, int texture, TextureMapping mapping, int transparency, Shading shading) {
  /** The id of no texture. */
  public static final int NO_TEXTURE = 65535;

  /**
   * Checks the ranges.
   *
   * @param colour 16 bits
   * @param texture 16 bits
   * @param mapping or null
   * @param transparency 0 to 255
   * @param shading not null
   * @throws IllegalArgumentException if a number is out of its range
   */
  public Material {
    Objects.requireNonNull(shading, "shading");
    range("colour", colour, 65535);
    range("texture", texture, 65535);
    range("transparency", transparency, 255);
  }

  private static void range(String name, int value, int most) {
    if (value < 0 || value > most) {
      throw new IllegalArgumentException(name + ": " + value + " is not from 0 to " + most);
    }
  }

  /**
   * An opaque, smooth material without texture.
   *
   * @param colour HSL word
   * @return the material
   */
  public static Material of(int colour) {
    return new Material(colour, NO_TEXTURE, null, 0, Shading.SMOOTH);
  }

  /**
   * This material with a texture.
   *
   * @param id texture id
   * @param where its place, or null for one repeat on each face
   * @return a new material
   */
  public Material textured(int id, TextureMapping where) {
    return new Material(colour, id, where, transparency, shading);
  }

  /**
   * This material with another transparency.
   *
   * @param amount 0 opaque to 255 invisible
   * @return a new material
   */
  public Material transparent(int amount) {
    return new Material(colour, texture, mapping, amount, shading);
  }

  /**
   * This material with another shading.
   *
   * @param kind how it takes light
   * @return a new material
   */
  public Material shaded(Shading kind) {
    return new Material(colour, texture, mapping, transparency, kind);
  }
}
