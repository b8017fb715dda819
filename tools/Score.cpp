// SPDX-License-Identifier: Apache-2.0
#include "Score.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <optional>
#include <sstream>
#include <string_view>

namespace {

using ::android::hardware::vibrator::V1_0::EffectStrength;

constexpr uint32_t kLongestMs = INT32_MAX;
constexpr uint32_t kLongestWaitMs = 3'600'000;
constexpr uint32_t kFullAmplitude = 10000;
constexpr size_t kMostPackets = 339;

struct Word {
    std::string text;
    size_t column;
};

std::vector<Word> wordsOf(std::string_view line) {
    constexpr std::string_view kBlanks = " \t\r";
    line = line.substr(0, line.find('#'));
    std::vector<Word> words;
    size_t start = line.find_first_not_of(kBlanks);
    while (start != std::string_view::npos) {
        const size_t end = std::min(line.find_first_of(kBlanks, start), line.size());
        words.push_back({std::string(line.substr(start, end - start)), start + 1});
        start = line.find_first_not_of(kBlanks, end);
    }
    return words;
}

/** Reads the words of one line. */
class LineParser {
  public:
    LineParser(std::string_view line, size_t number, std::vector<ScoreError>* errors)
        : mWords(wordsOf(line)), mNumber(number), mEnd(line.size() + 1), mErrors(*errors) {}

    bool isEmpty() const { return mWords.empty(); }

    ScoreStep parse() {
        using Parse = void (LineParser::*)(ScoreStep*);
        struct Command {
            const char* name;
            ScoreStep::Kind kind;
            Parse parse;
        };
        constexpr Command kCommands[] = {
                {"click", ScoreStep::kClick, &LineParser::click},
                {"on", ScoreStep::kOn, &LineParser::on},
                {"off", ScoreStep::kOff, nullptr},
                {"wait", ScoreStep::kWait, &LineParser::wait},
                {"amplitude", ScoreStep::kAmplitude, &LineParser::amplitude},
                {"intensity", ScoreStep::kIntensity, &LineParser::intensity},
                {"pattern", ScoreStep::kPattern, &LineParser::pattern},
                {"engine", ScoreStep::kEngine, &LineParser::engine},
        };
        ScoreStep step;
        const Word name = *take();
        const auto* command =
                std::find_if(std::begin(kCommands), std::end(kCommands),
                             [&](const Command& each) { return name.text == each.name; });
        if (command == std::end(kCommands)) {
            complain(name, "\"" + name.text +
                                   "\" is none of click, on, off, wait, amplitude, intensity, "
                                   "pattern, engine");
            return step;
        }
        step.kind = command->kind;
        const size_t before = mErrors.size();
        if (command->parse != nullptr) (this->*command->parse)(&step);
        if (mErrors.size() == before && mNext < mWords.size()) {
            complain(mWords[mNext], "\"" + mWords[mNext].text + "\" is one word too many");
        }
        return step;
    }

  private:
    void click(ScoreStep* step) {
        const std::optional<Word> word = take();
        if (!word) return;
        const char* const names[] = {"light", "medium", "strong"};
        const auto* name = std::find(std::begin(names), std::end(names), word->text);
        if (name == std::end(names)) {
            complain(*word, "\"" + word->text + "\" is none of light, medium, strong");
            return;
        }
        step->strength = static_cast<EffectStrength>(name - names);
    }
    void on(ScoreStep* step) { number("a time in ms", 1, kLongestMs, &step->number); }
    void wait(ScoreStep* step) { number("a time in ms", 0, kLongestWaitMs, &step->number); }
    void amplitude(ScoreStep* step) { number("an amplitude", 1, 255, &step->number); }
    void intensity(ScoreStep* step) { number("an intensity", 1, kFullAmplitude, &step->number); }

    void pattern(ScoreStep* step) {
        number("a pattern's number", 0, kLongestMs, &step->number);
        if (mNext < mWords.size() && mWords[mNext].text != "repeat") {
            number("an amplitude", 1, kFullAmplitude, &step->amplitude);
        }
        if (mNext < mWords.size() && mWords[mNext].text == "repeat") {
            step->repeat = true;
            ++mNext;
        }
    }

    void engine(ScoreStep* step) {
        number("an amplitude", 1, kFullAmplitude, &step->amplitude);
        if (mNext == mWords.size()) complain({"", mEnd}, "packets are missing");
        while (const std::optional<Word> word = take()) {
            std::string error;
            if (!parsePacket(word->text, &step->packets, &error)) {
                complain(*word, error);
            } else if (step->packets.size() > kMostPackets) {
                complain(*word, "more than 339 packets");
                return;
            } else if (!isShort(step->packets.back())) {
                complain(*word, "\"" + word->text + "\" has a value of more than 8 characters");
            }
        }
    }

    static bool isShort(const HapticEnginePackets::value_type& packet) {
        const int32_t unscaled[] = {packet.param0, packet.param2, packet.param3};
        return std::all_of(std::begin(unscaled), std::end(unscaled), [](int32_t value) {
            return value >= -9'999'999 && value <= 99'999'999;
        });
    }

    void number(const char* what, uint32_t least, uint32_t most, uint32_t* value) {
        const std::optional<Word> word = take();
        const std::string range = std::string(what) + " from " + std::to_string(least) + " to " +
                                  std::to_string(most);
        if (!word) {
            complain({"", mEnd}, range + " is missing");
            return;
        }
        const char* end = word->text.data() + word->text.size();
        const auto [stop, status] = std::from_chars(word->text.data(), end, *value);
        if (status != std::errc() || stop != end || *value < least || *value > most) {
            complain(*word, "\"" + word->text + "\" is not " + range);
        }
    }

    std::optional<Word> take() {
        if (mNext == mWords.size()) return std::nullopt;
        return mWords[mNext++];
    }
    void complain(const Word& word, const std::string& what) {
        mErrors.push_back({mNumber, word.column, what});
    }

    std::vector<Word> mWords;
    size_t mNext = 0;
    size_t mNumber;
    size_t mEnd;
    std::vector<ScoreError>& mErrors;
};

}  // namespace

std::vector<ScoreError> parseScore(const std::string& text, std::vector<ScoreStep>* steps) {
    std::vector<ScoreError> errors;
    std::istringstream lines(text);
    size_t number = 0;
    for (std::string line; std::getline(lines, line);) {
        LineParser parser(line, ++number, &errors);
        if (!parser.isEmpty()) steps->push_back(parser.parse());
    }
    return errors;
}
