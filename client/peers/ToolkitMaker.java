import java.awt.Component;
import java.util.Objects;
import velmark5.Canvas;
import velmark5.ClippingMask;
import velmark5.DepthBuffer;
import velmark5.Font;
import velmark5.Glyphs;
import velmark5.MemoryPool;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelSettings;
import velmark5.NativeLibrary;
import velmark5.PalettedFont;
import velmark5.Rect;
import velmark5.Spans;
import velmark5.Sprite;
import velmark5.ThreadResource;
import velmark5.Toolkit;

/** What the toolkit makes. It keeps each thing until that is closed. */
interface ToolkitMaker extends ToolkitPart, Toolkit {
  @Override
  default MemoryPool createPool(int bytes) {
    ja toolkit = live();
    return toolkit.keep(new ba(toolkit, bytes));
  }

  @Override
  default Canvas createCanvas(Component component, int width, int height) {
    ja toolkit = live();
    NativeLibrary.prepareDisplay();
    return toolkit.keep(new za(toolkit, component, width, height));
  }

  @Override
  default Sprite createSprite(int width, int height) {
    ja toolkit = live();
    return toolkit.keep(new fa(toolkit, width, height));
  }

  @Override
  default Sprite createSprite(int[] pixels, int width, int height, int stride, boolean opaque) {
    Objects.requireNonNull(pixels, "pixels");
    ja toolkit = live();
    return toolkit.keep(new fa(toolkit, pixels, width, height, stride, opaque));
  }

  @Override
  default Sprite createSprite(int[] palette, byte[] indices, byte[] alpha, int width, int height, int stride) {
    Objects.requireNonNull(palette, "palette");
    Objects.requireNonNull(indices, "indices");
    ja toolkit = live();
    return toolkit.keep(new fa(toolkit, palette, indices, alpha, width, height, stride));
  }

  @Override
  default Sprite captureSprite(Rect area, boolean opaque) {
    ja toolkit = live();
    return toolkit.keep(new fa(toolkit, area, opaque));
  }

  @Override
  default DepthBuffer createDepthBuffer(int width, int height) {
    ja toolkit = live();
    return toolkit.keep(new oa(toolkit, width, height));
  }

  @Override
  default ClippingMask createMask(MemoryPool pool, Spans spans) {
    ja toolkit = live();
    return toolkit.keep(new wa(toolkit, toolkit.own((ba) pool), spans));
  }

  @Override
  default Font createMonoFont(MemoryPool pool, Glyphs glyphs) {
    ja toolkit = live();
    return toolkit.keep(new m(toolkit, toolkit.own((ba) pool), glyphs));
  }

  @Override
  default Font createSmoothFont(MemoryPool pool, Glyphs glyphs) {
    ja toolkit = live();
    return toolkit.keep(new ea(toolkit, toolkit.own((ba) pool), glyphs));
  }

  @Override
  default PalettedFont createPalettedFont(MemoryPool pool, Glyphs glyphs, int[] palette) {
    ja toolkit = live();
    return toolkit.keep(new ia(toolkit, toolkit.own((ba) pool), glyphs, palette));
  }

  @Override
  default Model createModel(MemoryPool pool, Mesh mesh, ModelSettings settings) {
    ja toolkit = live();
    return toolkit.keep(new h(toolkit, toolkit.own((ba) pool), mesh, settings));
  }

  @Override
  default ThreadResource createThreadResource() {
    ja toolkit = live();
    return toolkit.keep(new a(toolkit));
  }
}
