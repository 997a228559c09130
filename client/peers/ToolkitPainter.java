import java.util.Objects;
import velmark5.BlendMode;
import velmark5.ClippingMask;
import velmark5.Painter;
import velmark5.Rect;

/** The toolkit's drawing in two dimensions. */
interface ToolkitPainter extends ToolkitPart, Painter {
  /** What a clear sets. */
  int COLOURS = 1;

  int DEPTHS = 2;

  @Override
  default void clear(int colour) {
    live().ba(COLOURS, colour);
  }

  @Override
  default void clearDepth() {
    live().ba(DEPTHS, 0);
  }

  @Override
  default void clearAll(int colour) {
    live().ba(COLOURS | DEPTHS, colour);
  }

  @Override
  default void fillMask(int colour, ClippingMask mask, int x, int y) {
    ja toolkit = live();
    toolkit.DA(colour, toolkit.own((wa) mask), x, y);
  }

  @Override
  default void fillRect(int x, int y, int width, int height, int colour, BlendMode mode) {
    live().B(x, y, width, height, colour, mode.code());
  }

  @Override
  default void horizontalLine(int x, int y, int length, int colour, BlendMode mode) {
    live().XA(x, y, length, colour, mode.code());
  }

  @Override
  default void verticalLine(int x, int y, int length, int colour, BlendMode mode) {
    live().G(x, y, length, colour, mode.code());
  }

  @Override
  default void line(int x0, int y0, int x1, int y1, int colour, BlendMode mode) {
    live().YA(x0, y0, x1, y1, colour, mode.code());
  }

  @Override
  default void line(
      int x0, int y0, int x1, int y1, int colour, BlendMode mode, ClippingMask mask, int maskX, int maskY) {
    ja toolkit = live();
    toolkit.R(x0, y0, x1, y1, colour, mode.code(), toolkit.own((wa) mask), maskX, maskY);
  }

  @Override
  default void fillCircle(int x, int y, int radius, int colour, BlendMode mode) {
    live().CA(x, y, radius, colour, mode.code());
  }

  @Override
  default void scroll(int dx, int dy) {
    live().VA(dx, dy);
  }

  @Override
  default int[] readArea(Rect area) {
    ja toolkit = live();
    try {
      return toolkit.E(area.x(), area.y(), area.width(), area.height());
    } catch (Exception e) {
      throw Peer.translated(e);
    }
  }

  @Override
  default void writeArea(Rect area, int[] pixels, int offset, int stride) {
    Objects.requireNonNull(pixels, "pixels");
    live().BA(area.x(), area.y(), area.width(), area.height(), pixels, offset, stride);
  }

  @Override
  default Rect clip() {
    int[] edges = new int[4];
    live().qa(edges);
    return Rect.between(edges[0], edges[1], edges[2], edges[3]);
  }

  @Override
  default void setClip(Rect area) {
    live().r(area.x(), area.y(), area.right(), area.bottom());
  }

  @Override
  default void narrowClip(Rect area) {
    live().o(area.x(), area.y(), area.right(), area.bottom());
  }

  @Override
  default void resetClip() {
    live().L();
  }
}
