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
    ::android::sp<IDaxVibrator> service() const { return connect(*mInstance); }
    const std::string& instance() const { return *mInstance; }
    /** The commands that are also steps of scores, under names of their own. */
    std::vector<StepKind> steps;

    void complain(const std::string& status, const std::string& reason) const override;

  private:
    bool isJson() const override { return mReport.isJson(); }
    int perform(const cli::Command& command) override;

    cli::Value<std::string> mInstance;
    cli::Value<uint32_t> mTimeout;
    Report mReport;
};

}  // namespace vibratorctl
