import velmark5.NativeLibrary;
import velmark5.TextureSource;
import velmark5.Toolkit;
import velmark5.spi.Peers;

/** Makes toolkits; the API finds this class by its name. */
final class Velmark5Peers implements Peers {
  @Override
  public Toolkit createToolkit(TextureSource textures, int count) {
    NativeLibrary.load();
    return new ja(textures, count);
  }
}
