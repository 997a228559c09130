import velmark5.ThreadResource;

/** Thread resource. */
final class a extends Peer implements ThreadResource {
  long nativeid;

  native void ha(int unused0, int unused1, int unused2, int a, int b);

  native void R(long handle);

  native void JA(long handle);

  native void UA(long handle);

  a(ja toolkit) {
    super(toolkit);
    ha(0, 0, 0, 0, 0);
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "thread resource";
  }

  @Override
  void destroy() {
    R(nativeid);
  }

  @Override
  public void begin() {
    JA(handle());
  }

  @Override
  public void end() {
    UA(handle());
  }
}
