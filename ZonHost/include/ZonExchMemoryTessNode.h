#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchTessNode.h"

// A tessellated node held in memory. A face added as null stands for a face
// that cannot be obtained.
class ZON_HOST_API ZonExchMemoryTessNode : public ZonBaseUnknown, public ZonIExchTessNode {
public:
    explicit ZonExchMemoryTessNode(int type, ZonUnicodeString name = {}) : _type(type), _name(std::move(name)) {}

    void SetPosition(const std::array<float, 9>& matrix, const std::array<float, 3>& translation)
    {
        _matrix = matrix;
        _translation = translation;
    }
    void AddChild(ZonIExchTessNode_var child) { _children.push_back(std::move(child)); }
    void AddFace(ZonIExchTessFace_var face) { _faces.push_back(std::move(face)); }

    int GetType() override { return _type; }
    ZonUnicodeString GetName() override { return _name; }
    void GetPosition(std::array<float, 9>& matrix, std::array<float, 3>& translation) override;
    unsigned GetNumberOfChildren() override { return static_cast<unsigned>(_children.size()); }
    ZonIExchTessNode_var GetChild(unsigned child) override;
    unsigned GetNumberOfFaces() override { return static_cast<unsigned>(_faces.size()); }
    ZonIExchTessFace_var GetFace(unsigned face) override;

private:
    int _type;
    ZonUnicodeString _name;
    std::array<float, 9> _matrix{1, 0, 0, 0, 1, 0, 0, 0, 1};
    std::array<float, 3> _translation{0, 0, 0};
    std::vector<ZonIExchTessNode_var> _children;
    std::vector<ZonIExchTessFace_var> _faces;
};
using ZonExchMemoryTessNode_var = std::shared_ptr<ZonExchMemoryTessNode>;
