// SPDX-License-Identifier: Apache-2.0
#include "Score.h"

#include "cli/Text.h"

#include <algorithm>
#include <cstring>
#include <optional>
#include <sstream>
#include <string_view>

namespace {

constexpr uint32_t kLongestMs = INT32_MAX;
constexpr uint32_t kLongestWaitMs = 3'600'000;
constexpr uint32_t kFullAmplitude = 10000;
constexpr size_t kMostPackets = 339;
/** Steps that a score plays, those of its blocks counted each time. */
constexpr size_t kMostSteps = 1'000'000;
constexpr size_t kLongestText = 60;
constexpr char kTooMany[] = "more than 1000000 steps to play";

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

/** Reads a score line by line. */
class ScoreParser {
  public:
    ScoreParser(Score* score, std::vector<ScoreError>* errors) : mScore(*score), mErrors(*errors) {}

    void parseLine(std::string_view line) {
        ++mLine;
        mWords = wordsOf(line);
        mNext = 0;
        mEnd = line.size() + 1;
        if (!mWords.empty()) parseWords();
    }

    void finish() {
        if (!mErrors.empty()) return;
        for (const Block& block : mBlocks)
            mErrors.push_back({block.line, block.column, R"("repeat" without an "end")"});
        if (mErrors.empty() && mScore.order.empty()) mErrors.push_back({1, 1, "no step"});
    }

  private:
    struct Block {
        /** Where it begins in the order of the steps. */
        size_t start;
        uint32_t times;
        size_t line;
        size_t column;
    };
    struct Command {
        const char* name;
        ScoreStep::Kind kind;
        void (ScoreParser::*parse)(ScoreStep*);
    };
    static const std::vector<Command>& commands() {
        static const std::vector<Command> all = {
                {"click", ScoreStep::kClick, &ScoreParser::click},
                {"on", ScoreStep::kOn, &ScoreParser::on},
                {"off", ScoreStep::kOff, &ScoreParser::off},
                {"wait", ScoreStep::kWait, &ScoreParser::wait},
                {"amplitude", ScoreStep::kAmplitude, &ScoreParser::amplitude},
                {"intensity", ScoreStep::kIntensity, &ScoreParser::intensity},
                {"pattern", ScoreStep::kPattern, &ScoreParser::pattern},
                {"engine", ScoreStep::kEngine, &ScoreParser::engine},
                {"external", ScoreStep::kExternal, &ScoreParser::external},
                {"frequency", ScoreStep::kFrequency, &ScoreParser::frequency},
                {"force-touch", ScoreStep::kForceTouch, &ScoreParser::intensity},
                {"fold", ScoreStep::kFold, &ScoreParser::fold},
        };
        return all;
    }

    void parseWords() {
        const Word name = *take();
        const size_t before = mErrors.size();
        if (name.text == "repeat") {
            uint32_t times = 1;
            number("a number of times", 1, kMostSteps, &times);
            mBlocks.push_back({mScore.order.size(), times, mLine, name.column});
        } else if (name.text == "end") {
            endBlock(name);
        } else {
            const auto command =
                    std::find_if(commands().begin(), commands().end(),
                                 [&](const Command& each) { return name.text == each.name; });
            if (command == commands().end()) return complainOfName(name);
            ScoreStep step;
            step.kind = command->kind;
            step.line = mLine;
            step.column = name.column;
            step.name = name.text;
            for (const Word& word : mWords) {
                if (word.column != name.column) step.argument += " " + word.text;
            }
            step.argument.erase(0, 1);
            if (step.argument.size() > kLongestText) {
                step.argument.replace(kLongestText - 3, step.argument.size(), "...");
            }
            (this->*command->parse)(&step);
            mScore.order.push_back(static_cast<uint32_t>(mScore.lines.size()));
            mScore.lines.push_back(std::move(step));
            if (mScore.order.size() > kMostSteps) complain(name, kTooMany);
        }
        if (mErrors.size() == before && mNext < mWords.size()) {
            complain(mWords[mNext], cli::inQuotes(mWords[mNext].text) + " is one word too many");
        }
    }

    void complainOfName(const Word& name) {
        std::vector<std::string> names;
        for (const Command& command : commands())
            names.emplace_back(command.name);
        names.insert(names.end(), {"repeat", "end"});
        const std::string nearest = cli::suggestion(name.text, names);
        complain(name, "no step " + cli::inQuotes(name.text) +
                               (nearest.empty() ? "; there are " + cli::join(names, ", ", " and ")
                                                : nearest));
    }

    void endBlock(const Word& word) {
        if (mBlocks.empty()) return complain(word, R"("end" without a "repeat")");
        const Block block = mBlocks.back();
        mBlocks.pop_back();
        auto& order = mScore.order;
        const size_t size = order.size() - block.start;
        if (block.start + size * block.times > kMostSteps) {
            mErrors.push_back({block.line, block.column, kTooMany});
            return;
        }
        for (size_t i = size; i < size * block.times; ++i)
            order.push_back(order[order.size() - size]);
    }

    void click(ScoreStep* step) {
        step->number = 1;
        if (mNext < mWords.size()) choose({"light", "medium", "strong"}, step);
    }
    void on(ScoreStep* step) { number("a time in ms", 1, kLongestMs, &step->number); }
    void off(ScoreStep* /* step */) {}
    void wait(ScoreStep* step) { number("a time in ms", 0, kLongestWaitMs, &step->number); }
    void amplitude(ScoreStep* step) { number("an amplitude", 1, 255, &step->number); }
    void intensity(ScoreStep* step) { number("an intensity", 1, kFullAmplitude, &step->number); }
    void external(ScoreStep* step) { choose({"off", "on"}, step); }
    void frequency(ScoreStep* step) { number("a frequency type", 0, 4, &step->number); }
    void fold(ScoreStep* step) { choose({"open", "close"}, step); }

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
                return complain(*word, "more than 339 packets");
            } else if (!isShort(step->packets.back())) {
                complain(*word,
                         cli::inQuotes(word->text) + " has a value of more than 8 characters");
            }
        }
    }

    static bool isShort(const HapticEnginePackets::value_type& packet) {
        const int32_t unscaled[] = {packet.param0, packet.param2, packet.param3};
        return std::all_of(std::begin(unscaled), std::end(unscaled), [](int32_t value) {
            return value >= -9'999'999 && value <= 99'999'999;
        });
    }

    void number(const std::string& what, uint32_t least, uint32_t most, uint32_t* value) {
        const std::string range =
                " (" + std::to_string(least) + " to " + std::to_string(most) + ")";
        const std::optional<Word> word = take();
        if (!word) return complain({"", mEnd}, what + range + " is missing");
        const auto parsed = cli::parseNumber(word->text, least, most);
        if (!parsed) return complain(*word, cli::inQuotes(word->text) + " is not " + what + range);
        *value = *parsed;
    }

    /** Reads one of some words into the step's number. */
    void choose(const std::vector<std::string>& words, ScoreStep* step) {
        const std::string list = cli::join(words, ", ", " or ");
        const std::optional<Word> word = take();
        if (!word) return complain({"", mEnd}, list + " is missing");
        const auto found = std::find(words.begin(), words.end(), word->text);
        if (found == words.end())
            return complain(*word, cli::inQuotes(word->text) + " is not " + list);
        step->number = static_cast<uint32_t>(found - words.begin());
    }

    std::optional<Word> take() {
        if (mNext == mWords.size()) return std::nullopt;
        return mWords[mNext++];
    }
    void complain(const Word& word, const std::string& what) {
        mErrors.push_back({mLine, word.column, what});
    }

    Score& mScore;
    std::vector<ScoreError>& mErrors;
    std::vector<Block> mBlocks;
    std::vector<Word> mWords;
    size_t mNext = 0;
    size_t mLine = 0;
    size_t mEnd = 0;
};

}  // namespace

double Score::seconds() const {
    constexpr double kPatternMs = 1000;
    constexpr double kClickMs = 20;
    double now = 0;
    double stop = 0;
    for (const uint32_t index : order) {
        const ScoreStep& step = lines[index];
        if (step.kind == ScoreStep::kWait) now += step.number;
        if (step.kind == ScoreStep::kOn) stop = now + step.number;
        if (step.kind == ScoreStep::kOff) stop = now;
        if (step.kind == ScoreStep::kClick) stop = now + kClickMs;
        if (step.kind == ScoreStep::kPattern && step.number != 0) stop = now + kPatternMs;
        if (step.kind != ScoreStep::kEngine) continue;
        stop = now;
        for (const auto& packet : step.packets)
            stop += std::max(0, packet.param0);
    }
    return std::max(now, stop) / 1000;
}

std::vector<ScoreError> parseScore(const std::string& text, Score* score) {
    std::vector<ScoreError> errors;
    ScoreParser parser(score, &errors);
    std::istringstream lines(text);
    for (std::string line; errors.size() < kMostScoreErrors && std::getline(lines, line);)
        parser.parseLine(line);
    parser.finish();
    errors.resize(std::min(errors.size(), kMostScoreErrors));
    return errors;
}
