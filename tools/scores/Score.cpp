// SPDX-License-Identifier: Apache-2.0
#include "scores/Score.h"

#include "text/Text.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <sstream>

namespace vibratorctl {

namespace {

/** The most steps that a score plays; those of a block count each time. */
constexpr size_t kMaxSteps = 1'000'000;
constexpr char kTooMany[] = "more than 1000000 steps to play";

/** Reads a score line by line. */
class ScoreParser {
  public:
    ScoreParser(const std::vector<StepKind>& kinds, Score* score, std::vector<ScoreError>* errors)
        : mKinds(kinds), mScore(*score), mErrors(*errors) {}

    void parseLine(const std::string& line) {
        ++mLine;
        std::istringstream words(line.substr(0, line.find('#')));
        std::vector<size_t> columns;
        ScoreStep step;
        for (std::string word; words >> word;) {
            const auto end = words.eof() ? words.str().size() : static_cast<size_t>(words.tellg());
            columns.push_back(end - word.size() + 1);
            step.words.push_back(std::move(word));
        }
        if (columns.empty()) return;
        step.name = step.words.front();
        step.words.erase(step.words.begin());
        step.line = mLine;
        step.column = columns.front();
        columns.push_back(line.size() + 1);
        try {
            parseStep(std::move(step));
        } catch (const cli::UsageError& error) {
            const size_t column = error.index ? columns[*error.index + 1] : columns.front();
            mErrors.push_back({mLine, column, error.what()});
        }
    }

    void finish() {
        if (!mErrors.empty()) return;
        for (const Block& block : mBlocks)
            mErrors.push_back({block.line, block.column, R"("repeat" without an "end")"});
        if (mErrors.empty() && mScore.order.empty()) mErrors.push_back({1, 1, "no step"});
    }

  private:
    struct Block {
        /** Where the block begins in the order of the steps. */
        size_t start;
        uint32_t times;
        size_t line;
        size_t column;
    };

    void parseStep(ScoreStep step) {
        if (step.name == "repeat") {
            mBlocks.push_back({mScore.order.size(), 1, step.line, step.column});
            mRepeat.readStep(step.words);
            mBlocks.back().times = mTimes->number();
        } else if (step.name == "end") {
            endBlock(step);
        } else {
            // A step with a mistake counts, too.
            mScore.order.push_back(static_cast<uint32_t>(mScore.lines.size()));
            mScore.lines.push_back(step);
            readStep(&mScore.lines.back());
            if (mScore.order.size() > kMaxSteps) throw cli::UsageError(kTooMany);
        }
    }

    void readStep(ScoreStep* step) {
        if (step->name == "wait") {
            mWait.readStep(step->words);
            step->pause = mPause->number();
            return;
        }
        const auto kind = std::find_if(mKinds.begin(), mKinds.end(), [&](const StepKind& each) {
            return (step->name == "prebaked" ? "pattern" : step->name) == each.name;
        });
        if (kind == mKinds.end()) throw cli::UsageError(noStep(step->name));
        step->command = kind->command;
        step->command->readStep(step->words);
        step->runs = kind->runs();
        step->pause = kind->waits();
    }

    std::string noStep(const std::string& name) const {
        std::vector<std::string> names;
        for (const StepKind& kind : mKinds)
            names.push_back(kind.name);
        names.insert(names.end(), {"wait", "repeat", "end"});
        const std::string nearest = cli::suggestion(name == "sleep" ? "wait" : name, names);
        return "no step " + cli::inQuotes(name) +
               (nearest.empty() ? "; there are " + cli::join(names, ", ", " and ") : nearest);
    }

    void endBlock(const ScoreStep& step) {
        if (mBlocks.empty()) throw cli::UsageError(R"("end" without a "repeat")");
        const Block block = mBlocks.back();
        mBlocks.pop_back();
        cli::Command().readStep(step.words);
        auto& order = mScore.order;
        const size_t size = order.size() - block.start;
        if (block.start + size * block.times > kMaxSteps) {
            mErrors.push_back({block.line, block.column, kTooMany});
            return;
        }
        for (size_t i = size; i < size * block.times; ++i)
            order.push_back(order[order.size() - size]);
    }

    const std::vector<StepKind>& mKinds;
    Score& mScore;
    std::vector<ScoreError>& mErrors;
    cli::Command mWait;
    const cli::Argument* const mPause = mWait.add(
            "MS", cli::Numbers{"a time like 500, 500ms or 2s", 0, 3'600'000, "ms"}, "how long");
    cli::Command mRepeat;
    const cli::Argument* const mTimes =
            mRepeat.add("N", cli::Numbers{"a number of times", 1, kMaxSteps}, "how often");
    std::vector<Block> mBlocks;
    size_t mLine = 0;
};

}  // namespace

std::string ScoreStep::argument() const {
    constexpr size_t kMaxLength = 60;
    const std::string all = cli::join(words, " ", " ");
    return all.size() <= kMaxLength ? all : all.substr(0, kMaxLength - 3) + "...";
}

nlohmann::ordered_json ScoreStep::place() const {
    return {{"line", line}, {"column", column}};
}

double Score::seconds() const {
    double now = 0;
    double stop = 0;
    for (const uint32_t index : order) {
        const ScoreStep& step = lines[index];
        if (step.runs) stop = now + *step.runs;
        now += step.pause;
    }
    return std::max(now, stop) / 1000;
}

std::vector<ScoreError> parseScore(const std::string& text, const std::vector<StepKind>& kinds,
                                   Score* score) {
    std::vector<ScoreError> errors;
    ScoreParser parser(kinds, score, &errors);
    // Some editors begin a file with this mark, which nobody sees.
    constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";
    const bool isMarked = text.compare(0, kByteOrderMark.size(), kByteOrderMark) == 0;
    std::istringstream lines(text.substr(isMarked ? kByteOrderMark.size() : 0));
    for (std::string line; errors.size() < kMaxScoreErrors && std::getline(lines, line);)
        parser.parseLine(line);
    parser.finish();
    errors.resize(std::min(errors.size(), kMaxScoreErrors));
    return errors;
}

}  // namespace vibratorctl
