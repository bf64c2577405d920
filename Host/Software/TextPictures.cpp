// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/TextPictures.h"

#include <algorithm>
#include <sstream>
#include <vector>

#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/TextPainter.h"

namespace Vantrel::Host::Software {

namespace {

// Blue, green, red: a slate is dark enough not to glare in a dim room and far from any black of a film.
constexpr Pixel kSlateGround{0.13, 0.10, 0.09, 1};
constexpr Pixel kSlateRule{0.16, 0.22, 0.78, 1};
constexpr Pixel kSlateName{0.95, 0.95, 0.95, 1};
constexpr Pixel kSlateReason{0.68, 0.66, 0.64, 1};

constexpr std::size_t kReasonLines = 4;

std::vector<std::string> SplitLines(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        if (!line.empty() && line.back() == '\r') line.pop_back();
        lines.push_back(line);
    }
    return lines;
}

/// The first characters of a text that fit, whole characters of UTF-8 only.
std::size_t CountFitting(const TextPainter& painter, const std::string& text, double width) {
    std::size_t low = 1;
    std::size_t high = text.size();
    while (low < high) {
        const std::size_t middle = (low + high + 1) / 2;
        if (painter.Measure(text.substr(0, middle)) <= width) {
            low = middle;
        } else {
            high = middle - 1;
        }
    }
    while (low < text.size() && low > 1 && (static_cast<unsigned char>(text[low]) & 0xC0U) == 0x80U) --low;
    return low;
}

/// Breaks at blanks, else after a slash, and where a word is too long, anywhere.
std::vector<std::string> Wrap(const TextPainter& painter, std::string text, double width, std::size_t limit) {
    std::vector<std::string> lines;
    while (!text.empty() && lines.size() < limit) {
        if (painter.Measure(text) <= width) {
            lines.push_back(text);
            break;
        }
        std::size_t count = CountFitting(painter, text, width);
        const std::size_t blank = text.rfind(' ', count);
        const std::size_t slash = text.rfind('/', count - 1);
        if (blank != std::string::npos && blank > 0) {
            count = blank;
        } else if (slash != std::string::npos && slash > 0) {
            count = slash + 1;
        }
        lines.push_back(text.substr(0, count));
        text.erase(0, text[count] == ' ' ? count + 1 : count);
    }
    return lines;
}

}  // namespace

void DrawTitle(const Title& title, double aspect, Picture& picture) {
    const double size = title.size > 0 ? title.size : picture.height / 10.0;
    const TextPainter painter(title.font, size, aspect);
    const std::vector<std::string> lines = SplitLines(title.text);
    const Pixel color{title.color[2], title.color[1], title.color[0], title.color[3]};
    const double block = painter.GetLineHeight() * (static_cast<double>(lines.size()) - 1.0) + painter.GetAscent() +
                         painter.GetDescent();
    double baseline = title.position[1] * picture.height - block / 2.0 + painter.GetAscent();
    for (const std::string& line : lines) {
        const double shift = title.align < 0 ? 0.0 : title.align > 0 ? 1.0 : 0.5;
        painter.Draw(line, title.position[0] * picture.width - shift * painter.Measure(line), baseline, color, picture);
        baseline += painter.GetLineHeight();
    }
}

void DrawSlate(const std::string& name, const std::string& reason, double aspect, Picture& picture) {
    Fill(picture, 0, 0, picture.width, picture.height, kSlateGround);
    const double height = picture.height;
    const double room = picture.width * 0.86;
    const TextPainter large("Liberation Sans Bold", std::max(height / 14.0, 6.0), aspect);
    const TextPainter small("Liberation Sans", std::max(height / 28.0, 5.0), aspect);
    const std::vector<std::string> names = Wrap(large, name.empty() ? "offline media" : name, room, 2);
    const std::vector<std::string> reasons = Wrap(small, reason, room, kReasonLines);
    const auto centred = [&](const TextPainter& painter, const std::string& line, double baseline, const Pixel& color) {
        painter.Draw(line, (picture.width - painter.Measure(line)) / 2.0, baseline, color, picture);
    };
    double baseline = height * 0.46 - large.GetLineHeight() * (static_cast<double>(names.size()) - 1.0);
    for (const std::string& line : names) {
        centred(large, line, baseline, kSlateName);
        baseline += large.GetLineHeight();
    }
    const int rule = std::max(1, picture.height / 240);
    Fill(picture, picture.width * 3 / 8, static_cast<int>(height * 0.5), picture.width / 4, rule, kSlateRule);
    baseline = height * 0.5 + small.GetLineHeight() * 1.5;
    for (const std::string& line : reasons) {
        centred(small, line, baseline, kSlateReason);
        baseline += small.GetLineHeight();
    }
}

}  // namespace Vantrel::Host::Software
