import java.awt.AlphaComposite;
import java.awt.Color;
import java.awt.Font;
import java.awt.Graphics2D;
import java.awt.Rectangle;
import java.awt.RenderingHints;
import java.awt.TexturePaint;
import java.awt.font.GlyphVector;
import java.awt.geom.AffineTransform;
import java.awt.geom.Ellipse2D;
import java.awt.image.BufferedImage;
import java.io.BufferedReader;
import java.io.InputStreamReader;
import java.lang.management.ManagementFactory;
import java.lang.management.ThreadMXBean;
import java.util.ArrayList;
import java.util.Arrays;
import java.util.LinkedHashMap;
import java.util.List;
import java.util.Map;
import java.util.Random;
import java.util.regex.Pattern;

/**
 * What Java 2D takes for the works of the native benchmark, beside velmark5 and pixman in the same run. A round
 * runs the native program once and each way of Java 2D once; the least times of all rounds and ways count.
 * Times are the drawing thread's processor time.
 *
 * <p>Arguments: the native program, rounds.
 */
public final class Java2DBench {
  private static final int WIDTH = 1280;
  private static final int HEIGHT = 720;
  private static final int PLACES = 64;
  private static final String[] FORMS = {"plain", "masked", "upwards"};
  private static final int[] TARGETS = {BufferedImage.TYPE_INT_RGB, BufferedImage.TYPE_INT_ARGB_PRE};
  private static final int[] SOURCES = {BufferedImage.TYPE_INT_ARGB, BufferedImage.TYPE_INT_ARGB_PRE};

  /** Draws once at a place. */
  private interface Draw {
    void at(Graphics2D graphics, int x, int y);
  }

  /** One way of drawing a work: a target, what is set on it, and what is drawn in boxes of that size. */
  private record Way(BufferedImage target, AlphaComposite composite, Draw draw, int boxWidth, int boxHeight) {}

  /** A line of the table: the names of the same work in the native program, and how many units one drawing has. */
  private record Work(String name, Pattern ours, Pattern pixman, int units, List<Way> ways) {}

  private final List<Work> works = new ArrayList<>();
  private final Map<String, Double> times = new LinkedHashMap<>();

  public static void main(String[] arguments) throws Exception {
    Java2DBench bench = new Java2DBench();
    bench.addSprites();
    bench.addGlyphs();
    bench.addOthers();
    int rounds = Integer.parseInt(arguments[1]);
    for (int round = -1; round < rounds; ++round) {
      if (round == 0) bench.times.clear(); // the first round warms up
      bench.runNative(arguments[0], "sprites", "ns_px");
      bench.runNative(arguments[0], "fonts", "ns_glyph");
      for (Work work : bench.works) {
        for (int i = 0; i < work.ways.size(); ++i) bench.note("java2d/" + work.name + "/" + i, time(work, i));
      }
    }
    bench.print(rounds);
  }

  // --- Works ---------------------------------------------------------------------------------------------------------

  private void addSprites() {
    for (int size : new int[] {16, 64}) {
      for (String look : new String[] {"soft", "disc"}) {
        for (boolean alpha : new boolean[] {false, true}) {
          String blend = alpha ? "alpha" : "replace";
          if (look.equals("disc") && !alpha) continue;
          sprite(blend + "/" + look, size, look, alpha, size, size * size,
              image -> (g, x, y) -> g.drawImage(image, x, y, null));
          if (look.equals("disc")) continue;
          if (size == 64) {
            sprite("scaled_" + blend + "/soft", size, look, alpha, 100, 100 * 100,
                image -> (g, x, y) -> g.drawImage(image, x, y, 100, 100, null));
          }
          sprite("tiled_" + blend + "/soft", size, look, alpha, 256, 256 * 256,
              image ->
                  (g, x, y) -> {
                    g.setPaint(new TexturePaint(image, new Rectangle(x, y, size, size)));
                    g.fillRect(x, y, 256, 256);
                  });
          if (alpha) {
            double s = Math.sin(Math.PI / 6) * size;
            int box = (int) Math.ceil(s + Math.cos(Math.PI / 6) * size);
            sprite("rotated_alpha/soft", size, look, alpha, box, size * size,
                image ->
                    (g, x, y) -> {
                      AffineTransform map = AffineTransform.getTranslateInstance(x + s, y);
                      map.rotate(Math.PI / 6);
                      g.drawImage(image, map, null);
                    });
          }
        }
      }
    }
  }

  /** Works for which Java 2D has no equal: it does not add, and has no fonts of that kind. */
  private void addOthers() {
    for (String name : new String[] {"additive/soft", "rotated_additive/soft"}) {
      for (int size : new int[] {16, 64}) sprite(name, size, 0, List.of());
    }
    sprite("scaled_additive/soft", 64, 0, List.of());
    sprite("scaled_tested/soft", 64, 0, List.of());
    for (String font : new String[] {"mono_blended", "paletted", "paletted_solid"}) {
      for (String form : FORMS) glyphs(font, form, 0, List.of());
    }
  }

  private interface FromImage {
    Draw draw(BufferedImage image);
  }

  private void sprite(
      String name, int size, String look, boolean alpha, int box, int pixels, FromImage from) {
    List<Way> ways = new ArrayList<>();
    for (int target : TARGETS) {
      for (int source : SOURCES) {
        ways.add(
            new Way(
                new BufferedImage(WIDTH, HEIGHT, target),
                alpha ? AlphaComposite.SrcOver : AlphaComposite.Src,
                from.draw(image(size, look, source)),
                box,
                box));
      }
    }
    sprite(name, size, pixels, ways);
  }

  private void sprite(String name, int size, int pixels, List<Way> ways) {
    String known = "sprites/" + name + "/%s/" + size;
    Pattern ours = Pattern.compile(known.formatted("velmark5"));
    works.add(new Work(name + " " + size, ours, Pattern.compile(known.formatted("pixman")), pixels, ways));
  }

  /** As the native program's: random pixels, with an alpha each or as a disc with a soft rim. */
  private static BufferedImage image(int size, String look, int type) {
    BufferedImage image = new BufferedImage(size, size, type);
    Random random = new Random(3);
    for (int y = 0; y < size; ++y) {
      for (int x = 0; x < size; ++x) {
        double distance = Math.hypot(x + 0.5 - size / 2.0, y + 0.5 - size / 2.0);
        int disc = (int) (255 * Math.min(Math.max(size / 2.0 - distance, 0), 1));
        int alpha = look.equals("disc") ? disc : random.nextInt(256);
        image.setRGB(x, y, alpha << 24 | random.nextInt(1 << 24));
      }
    }
    return image;
  }

  /** Runs of twenty letters 12 pixels apart, laid out beforehand. */
  private void addGlyphs() {
    int glyphs = 20;
    int length = glyphs * 12;
    int height = 16;
    Font font = new Font(Font.MONOSPACED, Font.PLAIN, 20);
    for (boolean soft : new boolean[] {true, false}) {
      Object hint = soft ? RenderingHints.VALUE_TEXT_ANTIALIAS_ON : RenderingHints.VALUE_TEXT_ANTIALIAS_OFF;
      BufferedImage any = new BufferedImage(1, 1, TARGETS[0]);
      Graphics2D graphics = any.createGraphics();
      graphics.setRenderingHint(RenderingHints.KEY_TEXT_ANTIALIASING, hint);
      GlyphVector run = font.createGlyphVector(graphics.getFontRenderContext(), "abcdeghkmnopqrsuvwxz");
      for (int i = 0; i <= glyphs; ++i) run.setGlyphPosition(i, new java.awt.geom.Point2D.Float(12f * i, 0));
      Draw plain =
          (g, x, y) -> {
            g.setRenderingHint(RenderingHints.KEY_TEXT_ANTIALIASING, hint);
            g.setColor(new Color(0xE0C040));
            g.drawGlyphVector(run, x, y + 13);
          };
      Draw masked =
          (g, x, y) -> {
            g.setClip(new Ellipse2D.Float(x, y - (length - height) / 2f, length, length));
            plain.at(g, x, y);
            g.setClip(null);
          };
      Draw upwards =
          (g, x, y) -> {
            AffineTransform before = g.getTransform();
            g.translate(x, y + length);
            g.rotate(-Math.PI / 2);
            plain.at(g, 0, 0);
            g.setTransform(before);
          };
      Draw[] draws = {plain, masked, upwards};
      for (int form = 0; form < FORMS.length; ++form) {
        boolean up = form == 2;
        List<Way> ways = new ArrayList<>();
        for (int target : TARGETS) {
          BufferedImage image = new BufferedImage(WIDTH, HEIGHT, target);
          ways.add(
              new Way(image, AlphaComposite.SrcOver, draws[form], up ? height : length, up ? length : height));
        }
        glyphs(soft ? "alpha" : "mono", FORMS[form], glyphs, ways);
      }
    }
  }

  private void glyphs(String font, String form, int units, List<Way> ways) {
    String name = "fonts/" + font + "/" + form;
    Pattern pixman = Pattern.compile("fonts/pixman/.*/" + form + "/.*");
    works.add(new Work(name, Pattern.compile(name), pixman, units, ways));
  }

  // --- Measuring -----------------------------------------------------------------------------------------------------

  private void note(String name, double nanoseconds) {
    times.merge(name, nanoseconds, Math::min);
  }

  /** Nanoseconds per unit, over some 20 ms. */
  private static double time(Work work, int index) {
    Way way = work.ways.get(index);
    Graphics2D graphics = way.target.createGraphics();
    graphics.setComposite(way.composite);
    graphics.setRenderingHint(
        RenderingHints.KEY_INTERPOLATION, RenderingHints.VALUE_INTERPOLATION_NEAREST_NEIGHBOR);
    Random random = new Random(1);
    int[] xs = random.ints(PLACES, 0, WIDTH - way.boxWidth).toArray();
    int[] ys = random.ints(PLACES, 0, HEIGHT - way.boxHeight).toArray();
    ThreadMXBean threads = ManagementFactory.getThreadMXBean();
    long start = threads.getCurrentThreadCpuTime();
    long spent;
    long drawings = 0;
    do {
      for (int i = 0; i < PLACES; ++i) way.draw.at(graphics, xs[i], ys[i]);
      drawings += PLACES;
      spent = threads.getCurrentThreadCpuTime() - start;
    } while (spent < 20_000_000);
    graphics.dispose();
    return (double) spent / drawings / work.units;
  }

  private void runNative(String program, String family, String counter) throws Exception {
    Process process =
        new ProcessBuilder(
                program,
                "--benchmark_filter=^" + family,
                "--benchmark_min_time=0.01",
                "--benchmark_format=csv")
            .redirectError(ProcessBuilder.Redirect.DISCARD)
            .start();
    try (BufferedReader lines = new BufferedReader(new InputStreamReader(process.getInputStream()))) {
      int column = -1;
      for (String line = lines.readLine(); line != null; line = lines.readLine()) {
        String[] fields = line.replace("\"", "").split(",", -1);
        if (fields[0].equals("name")) column = Arrays.asList(fields).indexOf(counter);
        else if (column > 0) note(fields[0], Double.parseDouble(fields[column]));
      }
    }
    if (process.waitFor() != 0) throw new IllegalStateException(program + " failed");
  }

  // --- The table -----------------------------------------------------------------------------------------------------

  private double best(Pattern names) {
    return times.entrySet().stream()
        .filter(entry -> names.matcher(entry.getKey()).matches())
        .mapToDouble(Map.Entry::getValue)
        .min()
        .orElse(Double.NaN);
  }

  private void print(int rounds) {
    System.out.printf("ns per pixel (sprites) and per glyph (fonts), the least of %d rounds%n", rounds);
    System.out.printf("%-26s %9s %9s %9s %14s%n", "", "velmark5", "pixman", "Java 2D", "their multiple");
    for (Work work : works) {
      double ours = best(work.ours);
      double pixman = best(work.pixman);
      double java2d = best(Pattern.compile(Pattern.quote("java2d/" + work.name) + "/.*"));
      System.out.printf(
          "%-26s %9.3f %9.3f %9.3f %7.2f %6.1f%n", work.name, ours, pixman, java2d, pixman / ours, java2d / ours);
    }
  }
}
