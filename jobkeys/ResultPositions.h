// SPDX-License-Identifier: Apache-2.0
// The server's 27 positions of a result (C87). A ticket's array "Values/Measured" has a value at
// each position; "Values/Approval" and "Values/Decimal" have the matching entries. Under a preset
// of the PSD kind, "Values/PSDApproval" and "Values/PSDDecimal" replace these two. They have ten
// positions in their own order, that of the verdicts.
#pragma once

#include <iterator>
#include <optional>

namespace jobkeys {

/// Entries of an analysis result: of analyseResultsRecord::values, and of its approvals and
/// decimals.
struct ResultPosition {
    int value;
    int verdict;
};

inline constexpr int noValue = -1; ///< Shown as -1.0.

/// This position shows spotAverage if a preset of the PSD kind does not judge the spot maximum,
/// i.e. if entry psdSpotMaximum of tolerancePresetParameterRecord::usedForPSDResult is not 1.
inline constexpr int spotMaximum = 27;
inline constexpr int spotAverage = 26;
inline constexpr int psdSpotMaximum = 21;

// clang-format off
inline constexpr ResultPosition resultPositions[] = {
    /*  0 */ {0, 6},
    /*  1 */ {1, 7},
    /*  2 */ {2, 8},
    /*  3 */ {3, 9},
    /*  4 */ {4, 4},
    /*  5 */ {5, 0},
    /*  6 */ {6, 1},
    /*  7 */ {7, 5},
    /*  8 */ {14, 12},
    /*  9 */ {12, 10},
    /* 10 */ {19, 13},
    /* 11 */ {20, 3},
    /* 12 */ {noValue, 2},
    /* 13 */ {spotMaximum, 19},
    /* 14 */ {13, 11},
    /* 15 */ {28, 20},
    /* 16 */ {29, 21},
    /* 17 */ {32, 24},
    /* 18 */ {33, 25},
    /* 19 */ {30, 22},
    /* 20 */ {31, 23},
    /* 21 */ {36, 28},
    /* 22 */ {34, 26},
    /* 23 */ {37, 27},
    /* 24 */ {38, 30},
    /* 25 */ {39, 31},
    /* 26 */ {spotAverage, 18},
};
// clang-format on
inline constexpr int positionCount = std::size(resultPositions);
inline constexpr int psdPositionCount = 10;

/// The entry of values at a position of "Values/Measured", or noValue.
constexpr int valueAt(int position, bool showsSpotMaximum) {
    const int value = resultPositions[position].value;
    return value == spotMaximum && !showsSpotMaximum ? spotAverage : value;
}

/// The number of positions of approvals and decimals.
constexpr int verdictCount(bool isPsd) {
    return isPsd ? psdPositionCount : positionCount;
}

/// The entry of approvals and decimals at a position below verdictCount.
constexpr int verdictAt(int position, bool isPsd) {
    return isPsd ? position : resultPositions[position].verdict;
}

/// The position of an entry of approvals and decimals: the inverse of verdictAt. Nothing if the
/// ticket does not have it.
constexpr std::optional<int> positionOfVerdict(int verdict, bool isPsd) {
    for (int position = 0; position < verdictCount(isPsd); ++position) {
        if (verdictAt(position, isPsd) == verdict) {
            return position;
        }
    }
    return std::nullopt;
}

} // namespace jobkeys
