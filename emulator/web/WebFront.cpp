#include "emulator/web/WebFront.h"

#include "emulator/panel/Glass.h"
#include "emulator/web/WebFiles.h"

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>
#include <utility>

namespace emulator {

namespace {

using nlohmann::json;

constexpr std::chrono::milliseconds frameTime{50};
// A page that hears nothing for some seconds takes the connection for lost.
constexpr std::chrono::seconds repeatTime{1};
constexpr std::streamoff mostRecorded = 1 << 20; // bytes: many hours of pressing keys
constexpr std::string_view pressWord = "press ";
constexpr std::string_view holdWord = "hold";
constexpr std::string_view releaseWord = "release";
constexpr std::string_view startOverWord = "start over";
// A page says twice a second that its key is held. A connection that has stalled, or a page that
// hangs, must not keep the key down.
constexpr std::chrono::milliseconds holdTime{1500};

// The character in place of a byte that is not printable has the dots of any such byte.
constexpr const char *noCharacter = "\uFFFD";

std::string withoutOtherBytes(const std::string &bytes) {
    std::string text;
    for (const char c : bytes)
        text += isPrintable(c) ? std::string(1, c) : noCharacter;
    return text;
}

// All that the page needs to know to draw the glass.
std::string glassJson() {
    json glyphs{{noCharacter, glyph('\0')}};
    for (char c = ' '; isPrintable(c); c++)
        glyphs[std::string(1, c)] = glyph(c);
    return json{
        {"glyphs", glyphs},
        {"glyph", {glyphColumns, glass::glyphRows}},
        {"pitch", {glass::cellPitch, glass::rowPitch}},
        {"size", {glass::textWidth, glass::textHeight}},
        {"background", glass::background},
        {"blankDot", glass::blankDot},
        {"darkDot", glass::darkDot},
    }
        .dump();
}

} // namespace

WebFront::WebFront(Loop &loop, const boost::asio::ip::tcp::endpoint &endpoint,
                   const Display &itsDisplay, Keypad &itsKeypad, Use itsUse,
                   std::function<void()> itsStartOver)
    : display(itsDisplay), keypad(itsKeypad), use(itsUse), startOver(std::move(itsStartOver)),
      finger(itsKeypad), load(Clock::now()), server(loop, endpoint, *this) {
    recorder.emplace(recording, display, keypad);
}

std::optional<int> WebFront::look(TimePoint now) {
    if (!isFull)
        recorder->look(now);
    isFull = recording.tellp() >= mostRecorded;
    if (recorder->isBetweenKeys())
        recorded = recording.tellp();
    if (now >= holdUntil)
        letGo();
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
    TimePoint wake = std::min(finger.wakeAt().value_or(TimePoint::max()), holdUntil);
    if (server.hasPages())
        wake = std::min(wake, showAgain);
    return wake;
}

void WebFront::beginAnew() {
    isStartingOver = false;
    load = LineLoad(Clock::now());
    appliances++;
    recording.str("");
    recorded = 0;
    recorder.emplace(recording, display, keypad);
}

void WebFront::finish(const std::string &reason) {
    ending = reason;
    finger.lift();
    if (!isFull)
        recorder->finish();
    server.finish(state());
}

std::optional<WebService::Resource> WebFront::resource(std::string_view name) const {
    const auto *file = std::find_if(webFiles.begin(), webFiles.end(),
                                    [&](const WebFile &each) { return each.name == name; });
    if (file != webFiles.end())
        return Resource{file->type, std::string(file->text)};
    if (name == "glass.json") {
        static const std::string glass = glassJson();
        return Resource{"application/json", glass};
    }
    if (name == "journey")
        return Resource{"text/plain; charset=utf-8", journey()};
    return std::nullopt;
}

std::string WebFront::state() const {
    const auto cursor = display.visibleCursor();
    const std::optional<Key> down = keypad.down();
    json state{
        {"rows",
         {withoutOtherBytes(display.visibleRow(0)), withoutOtherBytes(display.visibleRow(1))}},
        {"cursor", cursor ? json{cursor->row, cursor->column} : json()},
        {"down", down ? json(traits(*down).name) : json()},
        {"presser", presser ? json(*presser) : json()},
        {"counted", traits(keypad.lastAnswer()).name},
        {"polls", keypad.heldPolls()},
        {"bytes", load.recentBytes()},
        {"load", std::lround(load.percent())},
        {"program", programState()},
        {"appliance", appliances},
        {"recorded", static_cast<std::streamoff>(recorded)},
        {"isFull", isFull},
        {"isStartingOver", isStartingOver},
    };
    if (!ending.empty()) {
        state["ending"] = withoutOtherBytes(ending);
        state["journey"] = recording.str();
    }
    return state.dump();
}

std::string WebFront::welcome(const Page &page) const {
    json state = json::parse(this->state());
    state["page"] = page.number;
    const char *watchedBy = page.use == Use::watch ? "address" : "";
    state["watch"] = use == Use::watch ? "journey" : watchedBy;
    state["canStartOver"] = startOver && page.use == Use::operate;
    return state.dump();
}

bool WebFront::take(const Page &page, std::string_view message) {
    if (page.use == Use::watch)
        return false;
    if (message == startOverWord) {
        if (startOver && ending.empty() && !std::exchange(isStartingOver, true)) {
            letGo();
            startOver();
        }
        return startOver != nullptr;
    }
    if (message == releaseWord || message == holdWord) {
        if (presser != page.number || holdUntil == TimePoint::max())
            return true;
        const TimePoint now = Clock::now();
        holdUntil = message == holdWord ? now + holdTime : TimePoint::max();
        if (message == releaseWord)
            finger.release(now);
        return true;
    }
    const auto *key = std::find_if(keys.begin(), keys.end(), [&](const KeyTraits &each) {
        return message == std::string(pressWord) + std::string(each.name);
    });
    if (key == keys.end())
        return false;
    if (use == Use::operate && ending.empty() && !isStartingOver)
        press(key->key, page);
    return true;
}

void WebFront::press(Key key, const Page &page) {
    const TimePoint now = Clock::now();
    finger.press(key, now);
    presser = page.number;
    holdUntil = now + holdTime;
}

void WebFront::leave(const Page &page) {
    if (presser == page.number)
        letGo();
}

void WebFront::letGo() {
    finger.lift();
    presser.reset();
    holdUntil = TimePoint::max();
}

std::string WebFront::programState() const {
    const unsigned long openings = display.openings();
    if (openings <= 1)
        return "running";
    return openings == 2 ? "restarted" : "restarted " + std::to_string(openings - 1) + " times";
}

std::string WebFront::journey() const {
    return recording.str() + recorder->end();
}

} // namespace emulator
