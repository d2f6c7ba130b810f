#include "GraphShapes.h"

#include <algorithm>
#include <random>
#include <stdexcept>

namespace vantor::bench {

namespace {

constexpr std::size_t layer = 20;

void AddLayers(GraphShape& shape) {
    for (std::size_t first = 0; first < shape.count; first += layer + 1) {
        const std::size_t barrier = std::min(first + layer, shape.count - 1);
        for (std::size_t node = first; node < barrier; ++node) {
            shape.edges.emplace_back(node, barrier);
        }
        const std::size_t end = std::min(barrier + 1 + layer, shape.count);
        for (std::size_t node = barrier + 1; node < end; ++node) {
            shape.edges.emplace_back(barrier, node);
        }
    }
}

// Chains side by side, of 1 to 100 nodes each, drawn from a fixed seed: nodes of many heights are
// ready together.
void AddMixedChains(GraphShape& shape) {
    constexpr std::minstd_rand::result_type longest = 100;
    std::minstd_rand draw(20260);
    for (std::size_t node = 1, left = draw() % longest; node < shape.count; ++node) {
        if (left > 0) {
            shape.edges.emplace_back(node - 1, node);
            --left;
        } else {
            left = draw() % longest;
        }
    }
}

}  // namespace

GraphShape MakeShape(const std::string& kind, std::size_t count) {
    GraphShape shape;
    shape.count = count;
    if (kind == "layered") {
        AddLayers(shape);
    } else if (kind == "chain") {
        for (std::size_t node = 1; node < count; ++node) {
            shape.edges.emplace_back(node - 1, node);
        }
    } else if (kind == "mixed") {
        AddMixedChains(shape);
    } else if (kind != "independent") {
        throw std::invalid_argument("no such shape: " + kind);
    }
    return shape;
}

}  // namespace vantor::bench
