#include "chart/Chart.h"

#include <fmt/format.h>

#include <algorithm>

#include "chart/ChartFrame.h"
#include "chart/ChartStyle.h"
#include "chart/LanePanel.h"
#include "chart/MarkupText.h"
#include "chart/PluginPanel.h"
#include "chart/TimeText.h"

namespace vantor::analyze {

namespace {

constexpr double headHeight = 84;

std::string Counted(std::size_t count, const char* one, const char* many) {
    return fmt::format("{} {}", count, count == 1 ? one : many);
}

std::string Heading(const ChartFrame& frame) {
    const BootTimeline& timeline = frame.timeline;
    return fmt::format("{} in {} on {}", Counted(timeline.entries.size(), "plugin", "plugins"),
                       RoundedTime(timeline.end), Counted(timeline.workers, "worker", "workers"));
}

// What the critical chain is made of, in a sentence.
std::string ChainSummary(const ChartFrame& frame) {
    if (frame.chain.empty()) {
        return "no plugin was run";
    }
    Microseconds running = 0;
    for (const ChainLink& link : frame.chain) {
        running += frame.timeline.entries.at(link.entry).Ran();
    }
    const auto& entries = frame.timeline.entries;
    const Microseconds length =
        entries.at(frame.chain.back().entry).end - entries.at(frame.chain.front().entry).start;
    return fmt::format("critical chain: {}, {} running and {} between them",
                       Counted(frame.chain.size(), "plugin", "plugins"), RoundedTime(running),
                       RoundedTime(length - running));
}

std::string ChainNames(const ChartFrame& frame) {
    constexpr std::size_t most = 50;
    std::string names;
    for (std::size_t i = 0; i < std::min(frame.chain.size(), most); ++i) {
        names +=
            (i == 0 ? "" : ", ") + Printable(frame.timeline.entries.at(frame.chain[i].entry).name);
    }
    return frame.chain.size() > most ? fmt::format("{}, ...", names) : names;
}

// What each kind of mark means, in a row.
void DrawLegend(SvgText& svg, double baseline) {
    const double y = baseline - 9;
    double x = ChartFrame::margin;
    const auto word = [&](const char* text, double width) {
        svg.Text("legend", x + 30, baseline, Anchor::Start, text);
        x += 30 + width;
    };
    svg.Raw("<g class=\"legends\">");
    svg.Rect("bar", x, y, 24, 10);
    word("running", 76);
    svg.Raw("<g class=\"chain\">");
    svg.Rect("bar", x, y, 24, 10);
    svg.Raw("</g>");
    word("running, on the critical chain", 208);
    svg.Line("barrier-wait", x, y + 5, x + 24, y + 5);
    word("waiting for its barriers", 174);
    svg.Rect("worker-wait", x, y + 1.5, 24, 7);
    word("waiting for a worker", 156);
    svg.Raw("<g class=\"barrier\">");
    svg.Line("pole", x + 12, y - 4, x + 12, y + 14);
    svg.Path("mark", fmt::format("M{} {}l4 4l-4 4l-4 -4z", Coordinate(x + 12), Coordinate(y + 1)));
    svg.Raw("</g>");
    word("barrier reached", 120);
    svg.Raw("</g>\n");
}

std::string Drawing(const ChartFrame& frame, const std::string& source) {
    const PluginPanel plugins(frame, headHeight + LanePanelHeight(frame));
    const double height = plugins.Bottom();
    const std::string size =
        fmt::format("{} {}", Coordinate(ChartFrame::width), Coordinate(height));
    SvgText svg;
    svg.Raw(
        fmt::format("<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"{}\" height=\"{}\" "
                    "viewBox=\"0 0 {}\" role=\"img\" aria-labelledby=\"chart-title chart-text\">\n",
                    Coordinate(ChartFrame::width), Coordinate(height), size));
    svg.Raw(fmt::format("<title id=\"chart-title\">{}</title>\n", Escaped(Heading(frame))));
    svg.Raw(fmt::format("<desc id=\"chart-text\">{}; {}: {}</desc>\n", Escaped(source),
                        Escaped(ChainSummary(frame)), Escaped(ChainNames(frame))));
    svg.Raw(fmt::format("<style>{}</style>\n{}", chartStyle, chartPatterns));
    svg.Rect("paper", 0, 0, ChartFrame::width, height);
    svg.Text("heading", ChartFrame::margin, 28, Anchor::Start, Heading(frame));
    svg.Text("quiet", ChartFrame::margin, 47, Anchor::Start, ChainSummary(frame));
    svg.Name("source", ChartFrame::width - ChartFrame::margin, 26, Anchor::End,
             Shortened(source, 60));
    svg.Raw("\n");
    DrawLegend(svg, 71);
    DrawLanePanel(svg, frame, headHeight);
    plugins.Draw(svg);
    svg.Raw("</svg>\n");
    return svg.Result();
}

}  // namespace

std::string ChartAsSvg(const BootTimeline& timeline, const std::string& source) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n" +
           Drawing(ChartFrame(timeline), Printable(source));
}

std::string ChartAsHtml(const BootTimeline& timeline, const std::string& source) {
    const ChartFrame frame(timeline);
    std::string remarks;
    for (const std::string& remark : timeline.remarks) {
        remarks += fmt::format("<li>{}</li>\n", Escaped(Printable(remark)));
    }
    if (!remarks.empty()) {
        remarks = "<ul>\n" + remarks + "</ul>\n";
    }
    // The policy makes sure that nothing is ever fetched or run.
    return fmt::format("<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"UTF-8\">\n"
                       "<meta http-equiv=\"Content-Security-Policy\" content=\"default-src 'none'; "
                       "style-src 'unsafe-inline'\">\n"
                       "<meta name=\"color-scheme\" content=\"light dark\">\n"
                       "<title>{}</title>\n<style>{}</style>\n</head>\n<body>\n"
                       "<figure>\n{}</figure>\n{}</body>\n</html>\n",
                       Escaped(Heading(frame)), pageStyle, Drawing(frame, Printable(source)),
                       remarks);
}

}  // namespace vantor::analyze
