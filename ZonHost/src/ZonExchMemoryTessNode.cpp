#include "ZonExchMemoryTessNode.h"

void ZonExchMemoryTessNode::GetPosition(std::array<float, 9>& matrix, std::array<float, 3>& translation)
{
    matrix = _matrix;
    translation = _translation;
}

ZonIExchTessNode_var ZonExchMemoryTessNode::GetChild(unsigned child)
{
    return child < _children.size() ? _children[child] : nullptr;
}

ZonIExchTessFace_var ZonExchMemoryTessNode::GetFace(unsigned face)
{
    return face < _faces.size() ? _faces[face] : nullptr;
}
