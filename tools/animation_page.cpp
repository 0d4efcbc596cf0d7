#include "tools/animation_page.h"

#include "tools/base64.h"
#include "tools/writers.h"

namespace pelm_tool {
namespace {

// The picture lies 24 pixels from the left and the top.
constexpr const char *style = R"(<style>
body { margin: 24px; background: #181922; color: #e8e4d8; font: 14px/1.5 system-ui, sans-serif; }
canvas { display: block; image-rendering: pixelated;
         background: repeating-conic-gradient(#33344a 0 25%, #26273a 0 50%) 0 0 / 16px 16px; }
button { font: inherit; }
</style>
)";

// A page opened as page.html#3 shows the third frame and stands still.
constexpr const char *player = R"(
const screen = document.getElementById("screen");
const brush = screen.getContext("2d");
const toggle = document.getElementById("toggle");
const images = frames.map(([, source]) => Object.assign(new Image(), { src: source }));
let at = 0, played = 0, timer = 0, due = 0;

function show() {
  brush.clearRect(0, 0, screen.width, screen.height);
  brush.drawImage(images[at], 0, 0);
  document.getElementById("where").textContent =
    `frame ${at + 1} of ${frames.length}, ${frames[at][0]} ms` + (plays ? `, play ${played + 1} of ${plays}` : "");
}

function stop() {
  clearTimeout(timer);
  timer = 0;
  toggle.textContent = "Play";
}

function next() {
  if (at + 1 == frames.length && plays && played + 1 >= plays) return stop();
  if (at + 1 == frames.length) played++;
  at = (at + 1) % frames.length;
  show();
  wait();
}

function wait() {
  due = Math.max(due + frames[at][0], performance.now());
  timer = setTimeout(next, due - performance.now());
}

function play() {
  if (at + 1 == frames.length && plays && played + 1 >= plays) at = played = 0;
  toggle.textContent = "Pause";
  due = performance.now();
  show();
  wait();
}

function step(by) {
  stop();
  at = (at + by + frames.length) % frames.length;
  show();
}

toggle.onclick = () => timer ? stop() : play();
document.getElementById("back").onclick = () => step(-1);
document.getElementById("forward").onclick = () => step(1);
addEventListener("load", () => {
  const chosen = parseInt(location.hash.slice(1));
  if (chosen >= 1 && chosen <= frames.length) step(chosen - 1); else play();
});
</script>
</body>
</html>
)";

std::string escaped(const std::string &text) {
    std::string result;
    for (const char c : text) {
        switch (c) {
        case '&': result += "&amp;"; break;
        case '<': result += "&lt;"; break;
        case '>': result += "&gt;"; break;
        default: result += c;
        }
    }
    return result;
}

} // namespace

void AnimationPage::begin(const Picture &picture) {
    has_begun_ = true;
    write("<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n<title>" + escaped(title_) +
          "</title>\n" + style + "</head>\n<body>\n<canvas id=\"screen\" width=\"" + std::to_string(picture.width) +
          "\" height=\"" + std::to_string(picture.height) +
          "\"></canvas>\n<p><button id=\"back\">&lt;</button> <button id=\"toggle\">Pause</button> "
          "<button id=\"forward\">&gt;</button> <span id=\"where\"></span></p>\n<script>\nconst frames = [\n");
}

void AnimationPage::add(const Picture &picture, uint32_t delay) {
    if (!has_begun_) begin(picture);
    write("[");
    write(std::to_string(delay));
    write(", \"data:image/png;base64,");
    Base64 text(output_);
    write_png(text, picture);
    text.finish();
    write("\"],\n");
}

void AnimationPage::finish(uint32_t plays) {
    write("];\nconst plays = " + std::to_string(plays) + "; // 0: for ever" + player);
}

} // namespace pelm_tool
