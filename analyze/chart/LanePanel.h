#ifndef VANTOR_ANALYZE_CHART_LANEPANEL_H
#define VANTOR_ANALYZE_CHART_LANEPANEL_H

#include "chart/ChartFrame.h"
#include "chart/SvgText.h"

namespace vantor::analyze {

// The workers' part of a chart: a lane each with the plugins it ran, and the barriers as vertical
// marks through all lanes. It shows the whole boot at a glance, however many plugins there are.
double LanePanelHeight(const ChartFrame& frame);
void DrawLanePanel(SvgText& svg, const ChartFrame& frame, double top);

}  // namespace vantor::analyze

#endif
