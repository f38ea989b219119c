// The keys of a job's ticket that differ between its two control strips. They come in two families:
// those below "Remote/Measurement/", which read "Remote/Measurement2/" for the second strip, and
// those that end in a "2" for the second strip. Keys that both strips share are written where they
// are used.
#pragma once

#include <string>
#include <string_view>

enum class Strip { first, second };

/// Of KZJobDataStruct::secondStrip: 0 is the first strip, any other value the second.
inline Strip stripOf(int secondStrip) {
    return secondStrip == 0 ? Strip::first : Strip::second;
}

/// The root of a strip's measurement, without a slash at its end.
inline std::string_view measurementRoot(Strip strip) {
    return strip == Strip::first ? "Remote/Measurement" : "Remote/Measurement2";
}

/// The key of a name below the strip's measurement, such as "Status" or "XYZValues/XValues".
inline std::string measurementKey(Strip strip, std::string_view name) {
    return std::string(measurementRoot(strip)).append("/").append(name);
}

/// The strip's form of a key such as "Footer/ControlstripFile".
inline std::string stripKey(Strip strip, std::string_view key) {
    return std::string(key).append(strip == Strip::first ? "" : "2");
}
