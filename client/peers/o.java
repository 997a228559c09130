/** Copies between the target and images. Has no native object. */
final class o {
  long nativeid;

  native void AA(
      long toolkit,
      long sprite,
      long depth,
      int x,
      int y,
      int w,
      int h,
      int dstX,
      int dstY,
      boolean colour,
      boolean depthToo);

  native void BA(
      long toolkit,
      long sprite,
      long depth,
      int x,
      int y,
      int w,
      int h,
      int dstX,
      int dstY,
      boolean colour,
      boolean depthToo);
}
