import velmark5.DepthBuffer;

/** Depth buffer. */
final class oa extends Peer implements DepthBuffer {
  long nativeid;

  private final int width;
  private final int height;

  native void g(int width, int height);

  native void za(long handle);

  oa(ja toolkit, int width, int height) {
    super(toolkit);
    this.width = width;
    this.height = height;
    g(width, height);
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "depth buffer";
  }

  @Override
  void destroy() {
    toolkit.leaveTarget(this);
    za(nativeid);
  }

  @Override
  public int width() {
    handle();
    return width;
  }

  @Override
  public int height() {
    handle();
    return height;
  }
}
