package velmark5;

import java.util.EnumSet;
import java.util.Set;

/**
 * How a model is built.
 *
 * @param functions what may still be done to it
 * @param pointLit whether point lights reach it
 * @param flatColours whether textures that allow it are replaced by their flat colour
 * @param ambient its ambient level, 128 for 1
 * @param contrast divisor of the sun's light, not 0: the smaller, the stronger; smooth faces take the sun as it is at 768
 */
public record ModelSettings(
    Set<ModelFunction> functions, boolean pointLit, boolean flatColours, int ambient, int contrast) {
  /**
   * Copies the set.
   *
   * @param functions what may still be done to it
   * @param pointLit whether point lights reach it
   * @param flatColours whether textures are replaced where they allow it
   * @param ambient ambient level
   * @param contrast divisor of the sun's light
   * @throws IllegalArgumentException if the contrast is 0
   */
  public ModelSettings {
    functions = Set.copyOf(functions);
    if (contrast == 0) {
      throw new IllegalArgumentException("contrast: 0 is no divisor");
    }
  }

  /** Can only be drawn; point lights reach it; light as it is. */
  public static final ModelSettings STANDARD =
      new ModelSettings(EnumSet.noneOf(ModelFunction.class), true, false, 128, 768);

  /**
   * These settings with other functions.
   *
   * @param allowed what may still be done
   * @return new settings
   */
  public ModelSettings allowing(Set<ModelFunction> allowed) {
    return new ModelSettings(allowed, pointLit, flatColours, ambient, contrast);
  }

  /**
   * These settings with other light.
   *
   * @param level ambient level, 128 for 1
   * @param divisor of the sun's light
   * @return new settings
   */
  public ModelSettings lit(int level, int divisor) {
    return new ModelSettings(functions, pointLit, flatColours, level, divisor);
  }
}
