#ifndef REPORTLAYOUT_H
#define REPORTLAYOUT_H

#include <string>
#include <vector>

namespace hpn {

/// Boxes of a given size and the ways between them, to be placed. Sizes are pixels.
struct LayoutTask {
    struct Box {
        int Width = 0;
        int Height = 0;
    };
    struct Edge {
        int From = 0;
        int To = 0;
        char What = 'f'; ///< 'f' flow, 't' taken if true, 'n' taken if not
    };
    std::vector<Box> Boxes;
    std::vector<Edge> Edges;
};

/// Where everything stands, y downwards.
struct PlacedPicture {
    struct Box {
        int X = 0; ///< of the left upper corner
        int Y = 0;
        int Width = 0;
        int Height = 0;
    };
    struct Edge {
        int From = 0;
        int To = 0;
        char What = 'f';
        std::string Path; ///< as SVG writes it; ends where the tip of the arrow begins
    };
    int Width = 0;
    int Height = 0;
    std::vector<Box> Boxes;
    std::vector<Edge> Edges;
};

/// The task as graphviz reads it. Equal tasks give equal texts.
std::string writeDot(const LayoutTask& Task);
/// Reads what `dot -Tplain` wrote. False: it is not complete.
bool readPlain(const std::string& Text, std::size_t BoxCount, PlacedPicture& Result);

enum class DotAnswer { Done, TooSlow, Failed, NotThere };
/// Runs graphviz's `dot` on a text, no longer than `Seconds`. Several threads may do so at a time.
DotAnswer runDot(const std::string& Dot, double Seconds, std::string& Plain);

} // namespace hpn

#endif
