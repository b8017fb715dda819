// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Report.h"
#include "scores/Score.h"

namespace vibratorctl {

/** What the commands share: the options of every command, the report, the service, the steps. */
class Client : public cli::Program {
  public:
    Client();

    const Report& report() const { return mReport; }
    Report& report() { return mReport; }
    /** @return the service. @throw Unreachable */
    ::android::sp<IDaxVibrator> service() const { return connect(instance()); }
    std::string instance() const { return mInstance->text(); }
    /** The commands that are also steps of scores, under names of their own. */
    std::vector<StepKind> steps;

    void warn(const std::string& text) const override;
    void complain(const std::string& status, const std::string& reason) const override;

  private:
    int perform(const cli::Command& command) override;

    const cli::Argument* const mInstance;
    const cli::Argument* const mTimeout;
    Report mReport;
};

}  // namespace vibratorctl
