import java.util.Optional;
import velmark5.BlendMode;
import velmark5.Matrix;
import velmark5.Model;
import velmark5.ScreenPlacement;
import velmark5.ThreadResource;

/** Thread resource. */
final class a extends Peer implements ThreadResource {
  long nativeid;

  native void ha(int unused0, int unused1, int unused2, int a, int b);

  native void R(long handle);

  native void JA(long handle);

  native void UA(long handle);

  native void wa(long resource, h model, float[] matrix, int[] result);

  native void K(long handle, int x0, int y0, int x1, int y1, int colour, int thickness, int mode);

  native void ra(
      long unused, float x0, float y0, float x1, float y1, float x2, float y2, int colour0, int colour1, int colour2);

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

  @Override
  public void draw(Model model, Matrix matrix) {
    wa(handle(), h.open(model), matrix.toArray(), null);
  }

  @Override
  public Optional<ScreenPlacement> drawPlaced(Model model, Matrix matrix) {
    int[] place = new int[6];
    wa(handle(), h.open(model), matrix.toArray(), place);
    return place[5] == 0
        ? Optional.empty()
        : Optional.of(new ScreenPlacement(place[0], place[1], place[2], place[3], place[4]));
  }

  @Override
  public void fillTriangle(
      float x0, float y0, int colour0, float x1, float y1, int colour1, float x2, float y2, int colour2) {
    ra(handle(), x0, y0, x1, y1, x2, y2, colour0, colour1, colour2);
  }

  @Override
  public void line(int x0, int y0, int x1, int y1, int colour, int thickness, BlendMode mode) {
    K(handle(), x0, y0, x1, y1, colour, thickness, mode.code());
  }
}
