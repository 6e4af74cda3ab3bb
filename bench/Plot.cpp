// Time over size: both axes logarithmic, so that what takes linear time is a line of slope one.

#include "Results.h"

#include <cmath>
#include <fstream>

namespace bench {

namespace {

constexpr double left = 80, top = 30, width = 500, height = 380;
constexpr double leastSize = 1, mostSize = 1000; // MB
constexpr double leastTime = 1, mostTime = 1e4;  // ms

double across(double size) {
    return left + width * std::log(size / leastSize) / std::log(mostSize / leastSize);
}
double down(double time) {
    return top + height * (1 - std::log(time / leastTime) / std::log(mostTime / leastTime));
}

struct Series {
    const char* label;
    const char* benchmark;
    const char* counter;
    const char* color;
};

const Series allSeries[] = {
    {"libxml2, empty pass", "read", "passMs", "#777777"},
    {"pugixml by hand, structs", "pugixmlStructs", "ms", "#d95f02"},
    {"records", "read", "ms", "#1b6ca8"},
    {"plain structs", "structs", "ms", "#2a9d5c"},
    {"unmarshallEach, records", "eachRecord", "ms", "#8e44ad"},
};

void line(std::ostream& svg, double x1, double y1, double x2, double y2, const char* style) {
    svg << "<line x1=\"" << x1 << "\" y1=\"" << y1 << "\" x2=\"" << x2 << "\" y2=\"" << y2 << "\" "
        << style << "/>\n";
}
void text(std::ostream& svg, double x, double y, const std::string& words, const char* style) {
    svg << "<text x=\"" << x << "\" y=\"" << y << "\" " << style << ">" << words << "</text>\n";
}

void drawAxes(std::ostream& svg) {
    const char* const grid = "stroke=\"#dddddd\"";
    for (double size = leastSize; size <= mostSize; size *= 10) {
        line(svg, across(size), top, across(size), top + height, grid);
        text(svg, across(size), top + height + 18, std::to_string(std::lround(size)),
             "text-anchor=\"middle\"");
    }
    for (double time = leastTime; time <= mostTime; time *= 10) {
        line(svg, left, down(time), left + width, down(time), grid);
        text(svg, left - 8, down(time) + 4, std::to_string(std::lround(time)),
             "text-anchor=\"end\"");
    }
    line(svg, left, top, left, top + height, "stroke=\"black\"");
    line(svg, left, top + height, left + width, top + height, "stroke=\"black\"");
    text(svg, left + width / 2, top + height + 42, "size of the document, MB",
         "text-anchor=\"middle\"");
    text(svg, 0, 0, "processor time, ms",
         "text-anchor=\"middle\" transform=\"translate(22 220) rotate(-90)\"");
}

} // namespace

bool Results::plot(const std::string& path) const {
    std::ofstream svg(path);
    svg << "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"620\" height=\"470\" "
           "viewBox=\"0 0 620 470\" font-family=\"sans-serif\" font-size=\"13\">\n"
           "<rect width=\"620\" height=\"470\" fill=\"white\"/>\n";
    drawAxes(svg);
    double legend = top + 20;
    for (const Series& series : allSeries) {
        std::string points;
        for (const int size : {1, 10, 60, 600}) {
            const double time =
                counter(std::string(series.benchmark) + "/" + std::to_string(size), series.counter);
            if (time > 0)
                points += std::to_string(across(size)) + "," + std::to_string(down(time)) + " ";
        }
        if (points.empty())
            continue;
        svg << "<polyline points=\"" << points << "\" fill=\"none\" stroke-width=\"2\" stroke=\""
            << series.color << "\"/>\n";
        const std::string color = std::string("stroke-width=\"2\" stroke=\"") + series.color + "\"";
        line(svg, left + 20, legend - 4, left + 45, legend - 4, color.c_str());
        text(svg, left + 52, legend, series.label, "");
        legend += 20;
    }
    svg << "</svg>\n";
    svg.close();
    return svg.good();
}

} // namespace bench
