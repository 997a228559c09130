package velmark5;

import java.util.EnumSet;
import java.util.Set;

/**
 * What may still be done to a {@link Model}. The set is a promise: it can only shrink, and the library throws away the
 * data that serves none of what is left.
 */
public enum ModelFunction {
  /** Vertices may change along x: moves, turns about y and z, other sizes. */
  MOVE_X(0x00001),
  /** Vertices may change along y; also fitting to the terrain. */
  MOVE_Y(0x00002),
  /** Vertices may change along z. */
  MOVE_Z(0x00004),
  /** Turns carry the normals along. */
  ROTATE_NORMALS(0x00008),
  /** The model may be mirrored. */
  MIRROR(0x00010),
  /** Groups of vertices may be animated by their labels. */
  ANIMATE_VERTICES(0x00020),
  /** Colours of groups of faces may be animated. */
  ANIMATE_COLOUR(0x00080),
  /** Transparency of groups of faces may be animated. */
  ANIMATE_ALPHA(0x00100),
  /** Animation carries the normals along. */
  ANIMATE_NORMALS(0x00200),
  /** Groups of billboards may be animated. */
  ANIMATE_BILLBOARDS(0x00400),
  /** The model may be lit again, for the client's first purpose. */
  RELIGHT_A(0x01000),
  /** The model may be lit again, for the client's second purpose. */
  RELIGHT_B(0x02000),
  /** Colours may be replaced. */
  RECOLOUR(0x04000),
  /** Textures may be replaced. */
  RETEXTURE(0x08000),
  /** Normals may be merged with those of a neighbour. */
  SHARE_LIGHT(0x10000),
  /** The model may cast a shadow. */
  CAST_SHADOW(0x40000),
  /** The model may be tinted. */
  TINT(0x80000);

  private final int bit;

  ModelFunction(int bit) {
    this.bit = bit;
  }

  /**
   * The mask by which the native library knows a set of functions.
   *
   * @param functions the set
   * @return one bit for each
   */
  public static int mask(Set<ModelFunction> functions) {
    int mask = 0;
    for (ModelFunction function : functions) {
      mask |= function.bit;
    }
    return mask;
  }

  /**
   * The functions of a native mask.
   *
   * @param mask bits; those without a function are left out
   * @return a new set
   */
  public static EnumSet<ModelFunction> of(int mask) {
    EnumSet<ModelFunction> functions = EnumSet.noneOf(ModelFunction.class);
    for (ModelFunction function : values()) {
      if ((mask & function.bit) != 0) {
        functions.add(function);
      }
    }
    return functions;
  }
}
