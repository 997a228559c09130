import velmark5.ClippingMask;
import velmark5.Spans;

/** Clipping mask. */
final class wa extends Peer implements ClippingMask {
  long nativeid;

  private final ba pool;
  private final int width;
  private final int height;

  native void l(int unused, ba pool, int width, int height, int[] starts, int[] lengths);

  native void ma();

  wa(ja toolkit, ba pool, Spans spans) {
    super(toolkit);
    this.pool = pool;
    width = spans.width();
    height = spans.height();
    l(0, pool, width, height, spans.starts(), spans.lengths());
    pool.residents++;
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "clipping mask";
  }

  @Override
  void destroy() {
    ma();
    pool.residents--;
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
