import velmark5.Rect;

/** Copies between the target and images. Has no native object. */
final class o {
  long nativeid;

  native void AA(
      long toolkit, long sprite, long depth, int x, int y, int w, int h, int dstX, int dstY, boolean colour,
      boolean depthToo);

  native void BA(
      long toolkit, long sprite, long depth, int x, int y, int w, int h, int dstX, int dstY, boolean colour,
      boolean depthToo);

  void fromTarget(ja toolkit, fa sprite, oa depth, Rect area, int x, int y) {
    AA(
        toolkit.nativeid, ja.handleOf(sprite), ja.handleOf(depth), area.x(), area.y(), area.width(), area.height(), x,
        y, sprite != null, depth != null);
  }

  void toTarget(ja toolkit, fa sprite, oa depth, Rect area, int x, int y) {
    BA(
        toolkit.nativeid, ja.handleOf(sprite), ja.handleOf(depth), area.x(), area.y(), area.width(), area.height(), x,
        y, sprite != null, depth != null);
  }
}
