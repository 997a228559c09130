package velmark5.demo;

import java.nio.file.Path;

/**
 * What the command line asks for.
 *
 * @param frames frames to draw before the program ends, or 0 to run until the window is closed
 * @param png where the last frame is saved, or null
 * @param width columns of the window's content
 * @param height rows of the window's content
 * @param scene what is shown: {@code village} or {@code lake}
 * @param start seconds of the show that are left out
 */
record Options(int frames, Path png, int width, int height, String scene, int start) {
  static final String USAGE =
      """
      usage: velmark5.demo.Demo [--frames N] [--png FILE] [--size WxH] [--scene NAME] [--start SECONDS]
        --frames N   draw N frames as fast as possible, then end
        --png FILE   save the last frame as a PNG file
        --size WxH   size in pixels, 1280x720 if not given
        --scene NAME village (three-dimensional, the default) or lake (a night in two dimensions)
        --start N    leave out the first N seconds of the show; a day of the village has 240""";

  static Options parse(String[] arguments) {
    Options options = new Options(0, null, 1280, 720, "village", 0);
    for (int i = 0; i < arguments.length; i += 2) {
      if (i + 1 == arguments.length) {
        throw new IllegalArgumentException(arguments[i] + " needs a value, or is unknown");
      }
      options = options.with(arguments[i], arguments[i + 1]);
    }
    return options;
  }

  private Options with(String name, String value) {
    switch (name) {
      case "--frames":
        return new Options(number(name, value), png, width, height, scene, start);
      case "--png":
        return new Options(frames, Path.of(value), width, height, scene, start);
      case "--size":
        String[] sides = value.split("x");
        if (sides.length != 2) {
          throw new IllegalArgumentException(name + " takes WIDTHxHEIGHT, not " + value);
        }
        return new Options(frames, png, number(name, sides[0]), number(name, sides[1]), scene, start);
      case "--scene":
        if (!value.equals("village") && !value.equals("lake")) {
          throw new IllegalArgumentException("There is no scene " + value);
        }
        return new Options(frames, png, width, height, value, start);
      case "--start":
        return new Options(frames, png, width, height, scene, number(name, value));
      default:
        throw new IllegalArgumentException(name + " is unknown");
    }
  }

  private static int number(String name, String value) {
    int number;
    try {
      number = Integer.parseInt(value);
    } catch (NumberFormatException e) {
      throw new IllegalArgumentException(name + ": " + value + " is not a number", e);
    }
    if (number < 1 || number > 1_000_000) {
      throw new IllegalArgumentException(name + ": " + value + " is out of range");
    }
    return number;
  }
}
