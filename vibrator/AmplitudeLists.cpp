// SPDX-License-Identifier: Apache-2.0
#include "AmplitudeLists.h"

#include "MotorType.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

const AmplitudeList kNone;
const AmplitudeList kW = {0, 1000, 5000, 9000};
const AmplitudeList kX = {0, 2000, 4000, 6000, 8000, 10000};
const AmplitudeList kY = {0, 3400, 4900, 6500, 8200, 10000};
const AmplitudeList kZ = {0, 3000, 4000, 6000, 8000, 10000};

/** The lists for TYPE_0, for TYPE_1, and for TYPE_1 without patterns selected by index. */
struct AmplitudeLists {
    const AmplitudeList& type0;
    const AmplitudeList& type1;
    const AmplitudeList& type1WithoutIndex;
};

/** Indexed by motor type number. */
const AmplitudeLists kListsOfMotor[kMotorTypeCount] = {
        {kNone, kNone, kNone},  // NONE
        {kNone, kNone, kNone},  // COINDC
        {kX, kY, kY},           // LINEAR
        {kW, kW, kW},           // COINDC_PMIC
        {kNone, kNone, kNone},  // COINDC_INDEX
        {kZ, kX, kX},           // LINEAR_INDEX
        {kZ, kX, kX},           // LINEAR_0832RC
        {kZ, kX, kX},           // LINEAR_1040
        {kX, kY, kY},           // LINEAR_RCVMOT
        {kX, kX, kY},           // LINEAR_1030
};

}  // namespace

const AmplitudeList& selectAmplitudeList(int32_t motor, DaxAmplitudeType type, bool hasIndex) {
    const AmplitudeLists& lists = kListsOfMotor[motor];
    if (type == DaxAmplitudeType::TYPE_0) return lists.type0;
    return hasIndex ? lists.type1 : lists.type1WithoutIndex;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
