#include "mesa_peer.h"

#define GL_GLEXT_PROTOTYPES
#include <GL/osmesa.h>
#include <signal.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

using triangle_scene::kind;

struct request {
  kind what;
  int size;
  bool count_pixels;
};

struct gl_vertex {
  float position[4];  // clip coordinates
  float colour[4];    // red, green, blue, alpha
  float texture[2];
  float weights[3];
  float fog;
};

// One GL context and the scene that it drew last.
class renderer {
 public:
  bool start() {
    const int attributes[] = {
        OSMESA_FORMAT, OSMESA_BGRA, OSMESA_DEPTH_BITS, 24, OSMESA_PROFILE, OSMESA_COMPAT_PROFILE, 0};
    const OSMesaContext context = OSMesaCreateContextAttribs(attributes, nullptr);
    if (context == nullptr) return false;
    frame_.resize(static_cast<std::size_t>(triangle_scene::width * triangle_scene::height));
    if (!OSMesaMakeCurrent(context, frame_.data(), GL_UNSIGNED_BYTE, triangle_scene::width, triangle_scene::height)) {
      return false;
    }
    glEnable(GL_DEPTH_TEST);
    glDepthFunc(GL_LEQUAL);
    glClearColor(0, 0, 0, 0);
    glFogi(GL_FOG_MODE, GL_LINEAR);
    glFogi(GL_FOG_COORDINATE_SOURCE, GL_FOG_COORDINATE);
    glFogf(GL_FOG_START, 0.5f);
    glFogf(GL_FOG_END, 1);
    const float fog[] = {0.6f, 0.6f, 0.5f, 1};
    glFogfv(GL_FOG_COLOR, fog);
    for (int i = 0; i < 4; ++i) make_texture(i);
    program_ = make_program();
    return program_ != 0;
  }

  mesa_peer::result draw(const request& r) {
    if (size_ != r.size || what_ != r.what) prepare(r);
    const std::size_t count = vertices_.size() / 3;
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    glFinish();
    const double begin = triangle_scene::thread_seconds();
    if (r.count_pixels) {
      for (std::size_t i = 0; i < count; i += triangle_scene::sparse_step(r.size, count)) {
        glDrawArrays(GL_TRIANGLES, static_cast<GLint>(i * 3), 3);
      }
    } else {
      glDrawArrays(GL_TRIANGLES, 0, static_cast<GLsizei>(count * 3));
    }
    glFinish();
    const double seconds = triangle_scene::thread_seconds() - begin;
    long covered = 0;
    if (r.count_pixels) {
      std::vector<float> depths(frame_.size());
      glReadPixels(0, 0, triangle_scene::width, triangle_scene::height, GL_DEPTH_COMPONENT, GL_FLOAT, depths.data());
      for (const float d : depths) covered += d != 1;
    }
    return {seconds, covered};
  }

 private:
  // Textures 0 to 2 are the scene's, 3 is the light map.
  static void make_texture(int i) {
    std::vector<std::uint32_t> texels;
    for (int v = 0; v < 128; ++v) {
      for (int u = 0; u < 128; ++u) {
        texels.push_back(i < 3 ? triangle_scene::texel(i, u, v) : triangle_scene::light(u, v) * 0x10101u | 0xFF000000u);
      }
    }
    glBindTexture(GL_TEXTURE_2D, static_cast<GLuint>(i + 1));
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, 128, 128, 0, GL_BGRA, GL_UNSIGNED_BYTE, texels.data());
  }

  static GLuint make_program() {
    const GLuint program = glCreateProgram();
    const auto add = [program](GLenum type, const char* text) {
      const GLuint shader = glCreateShader(type);
      glShaderSource(shader, 1, &text, nullptr);
      glCompileShader(shader);
      glAttachShader(program, shader);
    };
    add(GL_VERTEX_SHADER,
        "varying vec4 colour; varying vec2 uv; varying vec3 weights;\n"
        "void main() { gl_Position = gl_Vertex; colour = gl_Color; uv = gl_MultiTexCoord0.xy;\n"
        "  weights = gl_MultiTexCoord1.xyz; }\n");
    add(GL_FRAGMENT_SHADER,
        "varying vec4 colour; varying vec2 uv; varying vec3 weights; uniform sampler2D a, b, c;\n"
        "void main() { gl_FragColor = colour * (texture2D(a, uv) * weights.x + texture2D(b, uv) * weights.y\n"
        "  + texture2D(c, uv) * weights.z); }\n");
    glLinkProgram(program);
    int linked = 0;
    glGetProgramiv(program, GL_LINK_STATUS, &linked);
    if (!linked) return 0;
    glUseProgram(program);
    const char* const samplers[] = {"a", "b", "c"};
    for (int i = 0; i < 3; ++i) glUniform1i(glGetUniformLocation(program, samplers[i]), i);
    glUseProgram(0);
    return program;
  }

  static void enable(GLenum capability, bool on) { on ? glEnable(capability) : glDisable(capability); }

  void prepare(const request& r) {
    size_ = r.size;
    what_ = r.what;
    vertices_.clear();
    for (const auto& t : triangle_scene::make(r.size, r.what == kind::textured_translucent)) {
      for (int i = 0; i < 3; ++i) {
        const auto& p = t[static_cast<std::size_t>(i)];
        // A perspective: w grows with depth.
        const float w = 1 + p.z;
        const auto channel = [&](int shift) { return static_cast<float>(p.colour >> shift & 0xFF) / 255; };
        vertices_.push_back({{(p.x / (triangle_scene::width / 2) - 1) * w, (1 - p.y / (triangle_scene::height / 2)) * w,
                              (2 * p.z - 1) * w, w},
                             {channel(16), channel(8), channel(0), channel(24)},
                             {p.u / 128, p.v / 128},
                             {i == 0 ? 1.0f : 0.0f, i == 1 ? 1.0f : 0.0f, i == 2 ? 1.0f : 0.0f},
                             p.z});
      }
    }
    const auto stride = static_cast<GLsizei>(sizeof(gl_vertex));
    const gl_vertex* const v = vertices_.data();
    glEnableClientState(GL_VERTEX_ARRAY);
    glVertexPointer(4, GL_FLOAT, stride, v->position);
    const bool coloured = r.what != kind::depth_only;
    coloured ? glEnableClientState(GL_COLOR_ARRAY) : glDisableClientState(GL_COLOR_ARRAY);
    glColorPointer(4, GL_FLOAT, stride, v->colour);
    glColorMask(coloured, coloured, coloured, coloured);
    r.what == kind::textured_fog ? glEnableClientState(GL_FOG_COORD_ARRAY) : glDisableClientState(GL_FOG_COORD_ARRAY);
    glFogCoordPointer(GL_FLOAT, stride, &v->fog);
    enable(GL_FOG, r.what == kind::textured_fog);
    enable(GL_BLEND, r.what == kind::textured_translucent || r.what == kind::pixel_alpha);
    glBlendFunc(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA);
    glUseProgram(r.what == kind::three_textures ? program_ : 0);

    const bool textured = coloured && r.what != kind::smooth;
    for (int unit = 2; unit >= 0; --unit) {
      glActiveTexture(static_cast<GLenum>(GL_TEXTURE0 + unit));
      glBindTexture(GL_TEXTURE_2D, unit == 1 && r.what == kind::light_map ? 4 : static_cast<GLuint>(unit + 1));
      glTexEnvi(GL_TEXTURE_ENV, GL_TEXTURE_ENV_MODE, GL_MODULATE);
      enable(GL_TEXTURE_2D, (textured && unit == 0) || (r.what == kind::light_map && unit == 1));
      glClientActiveTexture(static_cast<GLenum>(GL_TEXTURE0 + unit));
      const bool weights = r.what == kind::three_textures && unit == 1;
      (textured && unit == 0) || weights || (r.what == kind::light_map && unit == 1)
          ? glEnableClientState(GL_TEXTURE_COORD_ARRAY)
          : glDisableClientState(GL_TEXTURE_COORD_ARRAY);
      glTexCoordPointer(weights ? 3 : 2, GL_FLOAT, stride, weights ? v->weights : v->texture);
    }
  }

  std::vector<std::uint32_t> frame_;
  std::vector<gl_vertex> vertices_;
  GLuint program_ = 0;
  int size_ = 0;
  kind what_{};
};

// What the process does until the pipe closes.
[[noreturn]] void serve(int requests, int results, int vector_width) {
  setenv("GALLIUM_DRIVER", "llvmpipe", 1);
  setenv("LP_NUM_THREADS", "0", 1);
  setenv("LP_NATIVE_VECTOR_WIDTH", std::to_string(vector_width).c_str(), 1);
  renderer gl;
  const bool usable = gl.start();
  request r;
  while (read(requests, &r, sizeof r) == static_cast<ssize_t>(sizeof r)) {
    const mesa_peer::result answer = usable ? gl.draw(r) : mesa_peer::result{-1, 0};
    if (write(results, &answer, sizeof answer) != static_cast<ssize_t>(sizeof answer)) break;
  }
  _exit(0);
}

}  // namespace

mesa_peer::mesa_peer(int vector_width) {
  int to[2], from[2];
  if (pipe(to) != 0 || pipe(from) != 0) std::abort();
  const pid_t child = fork();
  if (child < 0) std::abort();
  if (child == 0) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    close(to[1]);
    close(from[0]);
    serve(to[0], from[1], vector_width);
  }
  close(to[0]);
  close(from[1]);
  requests_ = to[1];
  results_ = from[0];
}

mesa_peer::result mesa_peer::draw(kind what, int size, bool count_pixels) {
  const request r{what, size, count_pixels};
  result answer{-1, 0};
  if (write(requests_, &r, sizeof r) != static_cast<ssize_t>(sizeof r) ||
      read(results_, &answer, sizeof answer) != static_cast<ssize_t>(sizeof answer)) {
    return {-1, 0};
  }
  return answer;
}
