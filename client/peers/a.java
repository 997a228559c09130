import java.util.Optional;
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
  public void draw(Model model, float[] matrix) {
    wa(handle(), h.open(model), matrix, null);
  }

  @Override
  public Optional<ScreenPlacement> drawPlaced(Model model, float[] matrix) {
    int[] place = new int[6];
    wa(handle(), h.open(model), matrix, place);
    return place[5] == 0
        ? Optional.empty()
        : Optional.of(new ScreenPlacement(place[0], place[1], place[2], place[3], place[4]));
  }
}
