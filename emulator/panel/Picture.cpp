#include "emulator/panel/Picture.h"

#include "emulator/panel/Glass.h"

#include <algorithm>
#include <fstream>
#include <stdexcept>

namespace emulator {

namespace {

using namespace glass;

// All measures of the SVG are in dots of the display.
constexpr int bezel = 5;
constexpr int textLeft = bezel + margin;
constexpr int width = textWidth + 2 * textLeft;
constexpr int height = textHeight + 2 * textLeft;
constexpr int pixelsPerDot = 4;

std::string number(int value) {
    return std::to_string(value);
}

std::string escaped(const std::string &text) {
    std::string result;
    for (const char c : text) {
        if (c == '&')
            result += "&amp;";
        else if (c == '<')
            result += "&lt;";
        else
            result += c;
    }
    return result;
}

// Neighbouring dots share one stroke, which its dashes separate again.
std::string strokes(const Glyph &dots, int left, int top) {
    std::string path;
    for (int y = 0; y < glyphRows; y++) {
        const unsigned row = dots.at(static_cast<std::size_t>(y));
        int x = 0;
        while (x < glyphColumns) {
            int length = 0;
            while (x + length < glyphColumns &&
                   (row >> static_cast<unsigned>(glyphColumns - 1 - x - length) & 1U) != 0)
                length++;
            if (length > 0)
                path += "M" + number(left + x) + " " + number(top + y) + "h" + number(length);
            x += std::max(length, 1);
        }
    }
    return path;
}

std::string rectangle(int x, int y, int w, int h, const std::string &attributes) {
    return "<rect x=\"" + number(x) + "\" y=\"" + number(y) + "\" width=\"" + number(w) +
           "\" height=\"" + number(h) + "\" " + attributes;
}

} // namespace

Picture::Picture(const Display &display) : cursor(display.visibleCursor()) {
    for (int row = 0; row < Display::rowCount; row++)
        rows.at(static_cast<std::size_t>(row)) = display.visibleRow(row);
}

Picture::Picture(const Rows &itsRows) : rows(itsRows) {
    for (std::string &row : rows)
        row.resize(Display::visibleColumns, ' ');
}

std::string Picture::text() const {
    const auto border = [this](int row, char mark) {
        std::string line(Display::visibleColumns, '-');
        if (cursor && row == cursor->row)
            line.at(static_cast<std::size_t>(cursor->column)) = mark;
        return "+" + line + "+\n";
    };
    return border(0, 'v') + "|" + printable(rows[0]) + "|\n|" + printable(rows[1]) + "|\n" +
           border(1, '^');
}

std::string Picture::svg() const {
    std::string cells;
    std::string dots;
    for (int row = 0; row < Display::rowCount; row++) {
        const int top = textLeft + row * rowPitch;
        cells +=
            "M" + number(textLeft) + " " + number(top + glyphRows / 2) + "h" + number(textWidth);
        for (int column = 0; column < Display::visibleColumns; column++) {
            const char character =
                rows.at(static_cast<std::size_t>(row)).at(static_cast<std::size_t>(column));
            dots += strokes(glyph(character), textLeft + column * cellPitch, top);
        }
    }
    std::string svg =
        "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" + number(width * pixelsPerDot) +
        "\" height=\"" + number(height * pixelsPerDot) + "\" viewBox=\"0 0 " + number(width) + " " +
        number(height) + "\">\n<title>" + escaped(printable(rows[0] + "|" + rows[1])) +
        "</title>\n" + rectangle(0, 0, width, height, "rx=\"3\" fill=\"#22262b\"/>\n") +
        rectangle(bezel, bezel, width - 2 * bezel, height - 2 * bezel,
                  "fill=\"" + std::string(background) + "\"/>\n") +
        "<path d=\"" + cells + "\" stroke=\"" + blankDot +
        "\" stroke-width=\"8\" stroke-dasharray=\"5 1\"/>\n";
    if (!dots.empty()) {
        // Strokes run along the middle of their dots.
        svg += "<path transform=\"translate(.05 .5)\" d=\"" + dots + "\" stroke=\"" + darkDot +
               "\" stroke-width=\".9\" stroke-dasharray=\".9 .1\"/>\n";
    }
    if (cursor) {
        svg += rectangle(textLeft + cursor->column * cellPitch, textLeft + cursor->row * rowPitch,
                         glyphColumns, glyphRows,
                         "fill=\"" + std::string(darkDot) + "\" fill-opacity=\".45\">") +
               "<animate attributeName=\"visibility\" values=\"visible;hidden\" dur=\"0.8s\" "
               "calcMode=\"discrete\" repeatCount=\"indefinite\"/></rect>\n";
    }
    return svg + "</svg>\n";
}

void Picture::write(const std::filesystem::path &path) const {
    std::ofstream file(path, std::ios::binary);
    file << svg();
    file.close();
    if (!file)
        throw std::runtime_error("cannot write " + path.string());
}

} // namespace emulator
