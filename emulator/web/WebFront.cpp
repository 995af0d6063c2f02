#include "emulator/web/WebFront.h"

#include "emulator/journey/StepTable.h"
#include "emulator/panel/Font.h"
#include "emulator/web/WebFiles.h"

#include <algorithm>
#include <cmath>

namespace emulator {

namespace {

constexpr std::chrono::milliseconds frameTime{50};
// A page that hears nothing for some seconds takes the connection for lost.
constexpr std::chrono::seconds repeatTime{1};
constexpr std::streamoff mostRecorded = 1 << 20; // bytes: many hours of pressing keys
constexpr std::string_view pressWord = "press ";
constexpr std::string_view releaseWord = "release";

// Journeys and JSON write printable text in the same way.
std::string json(const std::string &text) {
    return quoted(text);
}

std::string json(bool value) {
    return value ? "true" : "false";
}

// The character in place of a byte that is not printable has the dots of any such byte.
std::string jsonText(const std::string &bytes) {
    std::string text;
    for (const char c : bytes)
        text += isPrintable(c) ? std::string(1, c) : "\uFFFD";
    return json(text);
}

std::string jsonGlyph(char character) {
    std::string rows;
    for (const std::uint8_t row : glyph(character))
        rows += (rows.empty() ? "" : ",") + std::to_string(row);
    return "[" + rows + "]";
}

std::string fontJson() {
    std::string glyphs;
    for (char c = ' '; isPrintable(c); c++)
        glyphs += json(std::string(1, c)) + ":" + jsonGlyph(c) + ",\n";
    return "{" + glyphs + "\"\uFFFD\":" + jsonGlyph('\0') + "}\n";
}

} // namespace

WebFront::WebFront(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint,
                   const Display &itsDisplay, Keypad &itsKeypad, Use itsUse)
    : display(itsDisplay), keypad(itsKeypad), use(itsUse), finger(itsKeypad), load(Clock::now()),
      recorder(recording, itsDisplay, itsKeypad), server(loop, endpoint, *this) {}

std::optional<int> WebFront::look(TimePoint now) {
    if (isRecording())
        recorder.look(now);
    if (recorder.isBetweenKeys())
        recorded = recording.tellp();
    finger.look(now);
    load.look(now);
    if (now >= showAgain && server.hasPages()) {
        showAgain = now + frameTime;
        if (std::string newest = state(); newest != shown || now >= repeat) {
            repeat = now + repeatTime;
            shown = newest;
            server.show(std::move(newest));
        }
    }
    return std::nullopt;
}

std::optional<TimePoint> WebFront::wakeAt() const {
    std::optional<TimePoint> wake = finger.wakeAt();
    if (server.hasPages())
        wake = std::min(wake.value_or(TimePoint::max()), showAgain);
    return wake;
}

void WebFront::finish(const std::string &reason) {
    ending = reason;
    finger.lift();
    if (isRecording())
        recorder.finish();
    server.finish(state());
}

std::optional<WebService::Resource> WebFront::resource(std::string_view name) const {
    const auto *file = std::find_if(webFiles.begin(), webFiles.end(),
                                    [&](const WebFile &each) { return each.name == name; });
    if (file != webFiles.end())
        return Resource{file->type, std::string(file->text)};
    if (name == "font.json")
        return Resource{"application/json", fontJson()};
    if (name == "journey")
        return Resource{"text/plain; charset=utf-8", journey()};
    return std::nullopt;
}

std::string WebFront::state() const {
    const bool isCursorSeen =
        display.cursorBlinking() && display.cursorColumn() < Display::visibleColumns;
    const auto position = [&] {
        return "[" + std::to_string(display.cursorRow()) + "," +
               std::to_string(display.cursorColumn()) + "]";
    };
    const auto name = [](Key key) { return json(std::string(traits(key).name)); };
    const std::optional<Key> down = keypad.down();
    std::string text = "{\"rows\":[" + jsonText(display.visibleRow(0)) + "," +
                       jsonText(display.visibleRow(1)) + "]";
    const auto add = [&](const char *member, const std::string &value) {
        text += std::string(",\"") + member + "\":" + value;
    };
    add("cursor", isCursorSeen ? position() : "null");
    add("down", down ? name(*down) : "null");
    add("counted", name(keypad.lastAnswer()));
    add("polls", std::to_string(keypad.heldPolls()));
    add("bytes", json(load.recentBytes()));
    add("load", std::to_string(std::lround(load.percent())));
    add("program", json(programState()));
    add("watch", json(use == Use::watch));
    add("recorded", std::to_string(recorded));
    if (!ending.empty()) {
        add("ending", jsonText(ending));
        add("journey", json(recording.str()));
    }
    return text + "}";
}

bool WebFront::take(const WebSession &page, std::string_view message) {
    if (message == releaseWord) {
        if (presser == &page)
            finger.release(Clock::now());
        return true;
    }
    const auto *key = std::find_if(keys.begin(), keys.end(), [&](const KeyTraits &each) {
        return message == std::string(pressWord) + std::string(each.name);
    });
    if (key == keys.end())
        return false;
    if (use == Use::operate && ending.empty()) {
        finger.press(key->key, Clock::now());
        presser = &page;
    }
    return true;
}

void WebFront::leave(const WebSession &page) {
    if (presser != &page)
        return;
    finger.lift();
    presser = nullptr;
}

bool WebFront::isRecording() {
    return recording.tellp() < mostRecorded;
}

std::string WebFront::programState() const {
    const unsigned long openings = display.openings();
    if (openings <= 1)
        return "running";
    return openings == 2 ? "restarted" : "restarted " + std::to_string(openings - 1) + " times";
}

std::string WebFront::journey() const {
    return recording.str() + recorder.end();
}

} // namespace emulator
