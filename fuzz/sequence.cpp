#include "sequence.h"

#include "glcalls/glcalls.h"
#include "glmodel.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/memorystream.h"
#include "orv/meshcache.h"
#include "orv/meshutil.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"
#include "orv/texture2dcache.h"

#include <algorithm>
#include <array>
#include <map>
#include <set>

namespace sequence
{

using namespace orv;

namespace
{

// --- Observed events ---------------------------------------------------------------------------------------

std::set<int> g_aliveNodes; ///< of the engine

template <class Node>
class Watched : public Node
{
public:
    template <class... Arguments>
    explicit Watched(int id, const Arguments&... arguments) : Node(arguments...)
                                                            , m_id(id)
    {
        g_aliveNodes.insert(id);
    }
    ~Watched() override { g_aliveNodes.erase(m_id); }

private:
    int m_id;
};

class Programs : public StreamSource
{
public:
    bool exists(const char* name) const override { return find(name) != nullptr; }
    const char* getName() const override { return "sequence"; }

    SharedPtr<Stream> open(const char* name, bool writable) override
    {
        const std::string* text = find(name);
        if (!text || writable)
            return {};
        return makeShared<MemoryStream>(text->data(), int(text->size()));
    }

private:
    const std::string* find(const std::string& name) const
    {
        const auto found = m_files.find(name);
        return found == m_files.end() ? nullptr : &found->second;
    }

    static std::string makeProgram(const std::string& vertexSource)
    {
        return "1.0 vertex_source_file " + vertexSource +
               " fragment_source_file any.frag uniform u_float M_VALUE uniform u_texture M_PICTURE";
    }

    const std::map<std::string, std::string> m_files = {
        {"small.sp", makeProgram("small.vert")},
        {"large.sp", makeProgram("large.vert")},
        {"small.vert", "a_position"},
        {"large.vert", "a_position a_normal a_uv0"},
        {"any.frag", "void main() {}"},
        {"small.ap", "1.0 shader_program small.sp"},
        {"large.ap", "1.0 shader_program large.sp"},
    };
};

// --- The model ---------------------------------------------------------------------------------------------

constexpr int NO_NODE = -1;
constexpr int ROOT = 0;

struct ModelNode
{
    bool isSolid = false;
    int parent = NO_NODE;
    std::set<int> children;
    float position = 0; ///< x, as set
    float local = 0;    ///< x of the local transform
    int mesh = NO_NODE;
    int appearance = NO_NODE;
    std::vector<int> joints;
};

struct ModelAppearance
{
    SharedPtr<Appearance> real;
    GLuint program = 0;
    GLuint texture = 0;
    float value = 0;
    bool isLost = false; ///< with its context
    bool isTextureLost = false;
};

struct ModelMesh
{
    SharedPtr<Mesh> real; ///< kept, so that its names stay its own
    bool isLost = false;
};

constexpr size_t SLOTS = 6;
constexpr size_t MOST_STEPS = 400;

class Player
{
public:
    explicit Player(const std::vector<uint8_t>& bytes) : m_bytes(bytes)
    {
        glmodel::install();
        g_aliveNodes.clear();
        m_pool->registerSource(makeShared<Programs>());
        m_camera->setPosition(Vector3f(0, 0, 5));
        m_nodes[ROOT];
        m_held[ROOT] = m_root;
        begin();
    }

    std::string play()
    {
        size_t step = 0;
        while (m_at < m_bytes.size() && m_fault.empty() && ++step < MOST_STEPS)
        {
            takeStep();
            look();
        }
        if (m_fault.empty())
            end();
        return m_fault.empty() ? m_fault : m_fault + " after " + std::to_string(step) + " steps";
    }

private:
    // --- Choosing ------------------------------------------------------------------------------------------

    size_t choose(size_t count) { return m_at < m_bytes.size() ? m_bytes[m_at++] % count : 0; }

    int& chooseSlot() { return m_slots[choose(SLOTS)]; }

    /// A node that the application holds: one in a slot, or the root.
    int chooseNode()
    {
        const int node = chooseSlot();
        return m_held.count(node) ? node : ROOT;
    }

    Solid* findSolid(int node)
    {
        const auto held = m_held.find(node);
        return held != m_held.end() && m_nodes[node].isSolid ? static_cast<Solid*>(held->second.get())
                                                             : nullptr;
    }

    void fail(const std::string& fault)
    {
        if (m_fault.empty())
            m_fault = fault;
    }

    // --- Steps ---------------------------------------------------------------------------------------------

    void takeStep()
    {
        switch (choose(18))
        {
        case 0: makeNode(false); break;
        case 1:
        case 2: makeNode(true); break;
        case 3:
        case 4: attach(); break;
        case 5: dropNode(chooseSlot()); break;
        case 6: move(); break;
        case 7: makeMesh(); break;
        case 8: makeAppearance(); break;
        case 9: setValue(); break;
        case 10: setTexture(); break;
        case 11: changeSolid(); break;
        case 12: attachJoint(); break;
        case 13: callGl(); break;
        case 14: m_pool->flush(); break;
        case 15: loseContext(); break;
        case 16: drawOne(); break;
        default: draw();
        }
    }

    void makeNode(bool isSolid)
    {
        int& slot = chooseSlot();
        dropNode(slot);
        const int id = ++m_lastNode;
        ModelNode& node = m_nodes[id];
        node.isSolid = isSolid;
        if (isSolid)
        {
            m_held[id] = makeShared<Watched<Solid>>(id);
            dress(id);
        }
        else
            m_held[id] = makeShared<Watched<SceneNode>>(id);
        slot = id;
        if (choose(2) == 0)
            attach(id, ROOT, false);
    }

    /// Gives a solid an existing mesh and appearance.
    void dress(int id)
    {
        Solid& solid = *findSolid(id);
        ModelNode& node = m_nodes[id];
        node.mesh = m_meshes.empty() ? NO_NODE : int(choose(m_meshes.size()));
        node.appearance = m_appearances.empty() ? NO_NODE : int(choose(m_appearances.size()));
        solid.setMesh(node.mesh == NO_NODE ? SharedPtr<Mesh>() : m_meshes[size_t(node.mesh)].real);
        solid.setAppearance(node.appearance == NO_NODE ? SharedPtr<Appearance>()
                                                       : m_appearances[size_t(node.appearance)].real);
    }

    void changeSolid()
    {
        const int id = chooseSlot();
        if (findSolid(id))
            dress(id);
    }

    void attach()
    {
        const int node = chooseSlot();
        const int parent = choose(8) == 0 ? NO_NODE : chooseNode();
        if (m_held.count(node))
            attach(node, parent, choose(2) == 0);
    }

    void attach(int id, int parent, bool preserves)
    {
        const float world = findWorldNow(id);
        const float parentWorld = parent == NO_NODE ? 0 : findWorldNow(parent);
        m_held[id]->setParent(parent == NO_NODE ? SharedPtr<SceneNode>() : m_held[parent], preserves);
        if (isAbove(id, parent))
            return; // refused
        ModelNode& node = m_nodes[id];
        node.local = preserves ? world - parentWorld : node.position;
        if (node.parent != NO_NODE)
            m_nodes[node.parent].children.erase(id);
        node.parent = parent;
        if (parent != NO_NODE)
            m_nodes[parent].children.insert(id);
    }

    void dropNode(int& slot)
    {
        m_held.erase(slot);
        slot = NO_NODE;
        forgetUnreachable();
    }

    void move()
    {
        const int id = chooseSlot();
        const float position = float(choose(5));
        if (!m_held.count(id))
            return;
        m_held[id]->setPosition(Vector3f(position, 0, 0));
        ModelNode& node = m_nodes[id];
        if (node.position != position)
            node.position = node.local = position;
    }

    void makeMesh()
    {
        if (m_meshes.size() >= 12)
            return;
        MeshCache& cache = *m_pool->getMeshCache();
        const Vector2f once(1, 1);
        const size_t kind = choose(6);
        m_meshes.push_back({kind == 0   ? createCubeMesh(cache, once)
                            : kind == 1 ? createSquareMesh(cache, once)
                                        : createSphereMesh(cache, unsigned(kind), 3, once)});
        if (!m_meshes.back().real)
            fail("no mesh");
    }

    void makeAppearance()
    {
        if (m_appearances.size() >= 12)
            return;
        ModelAppearance made;
        made.real = loadAppearance(*m_pool, choose(2) == 0 ? "small.ap" : "large.ap");
        if (!made.real || !made.real->getShaderProgram() || made.real->getShaderProgram()->getId() == 0)
            return fail("no appearance");
        made.program = made.real->getShaderProgram()->getId();
        made.real->setProperty("M_VALUE", made.value);
        m_appearances.push_back(made);
    }

    ModelAppearance* chooseAppearance()
    {
        return m_appearances.empty() ? nullptr : &m_appearances[choose(m_appearances.size())];
    }

    void setValue()
    {
        if (ModelAppearance* chosen = chooseAppearance())
        {
            chosen->value = float(choose(9));
            if (!chosen->real->setProperty("M_VALUE", chosen->value))
                fail("a value that cannot be set");
        }
    }

    void setTexture()
    {
        ModelAppearance* chosen = chooseAppearance();
        if (!chosen)
            return;
        const uint32_t pixels[4] = {};
        const SharedPtr<Texture2D> texture = m_pool->getTexture2DCache()->create(
            2, 2, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, pixels, nullptr);
        if (!texture || !chosen->real->setProperty("M_PICTURE", texture))
            return fail("a texture that cannot be set");
        chosen->texture = texture->getId();
        chosen->isTextureLost = false;
    }

    void attachJoint()
    {
        const int id = chooseSlot();
        const int joint = chooseNode();
        Solid* solid = findSolid(id);
        if (!solid || solid->getJointCount() >= Solid::MAX_JOINTS)
            return;
        solid->attachJoint(m_held[joint], Matrix4f::IDENTITY);
        m_nodes[id].joints.push_back(joint);
    }

    /// GL calls of the application between two frames.
    void callGl()
    {
        const GLuint number = GLuint(choose(8));
        switch (choose(8))
        {
        case 0: glUseProgram(0); break;
        case 1: glBindBuffer(GL_ARRAY_BUFFER, 0); break;
        case 2: glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0); break;
        case 3: glDisableVertexAttribArray(number); break;
        case 4:
            glBindBuffer(GL_ARRAY_BUFFER, 0);
            glVertexAttribPointer(number, 4, GL_FLOAT, GL_FALSE, 0, m_bytes.data());
            break;
        case 5: glEnableVertexAttribArray(number); break;
        case 6:
            glActiveTexture(GL_TEXTURE0 + number);
            glBindTexture(GL_TEXTURE_2D, 0);
            break;
        default: glActiveTexture(GL_TEXTURE0 + number);
        }
    }

    /// Keeps objects of the lost context, which draw nothing and delete nothing from now on.
    void loseContext()
    {
        m_block = nullptr;
        m_renderer = nullptr;
        m_context = nullptr;
        glmodel::loseContext();
        m_pool->forgetContext();
        for (ModelMesh& mesh : m_meshes)
            mesh.isLost = true;
        for (ModelAppearance& appearance : m_appearances)
            appearance.isLost = appearance.isTextureLost = true;
        begin();
    }

    void begin()
    {
        m_context = makeShared<RenderContext>();
        m_renderer = makeShared<SimpleRenderer>(m_context, m_pool);
        m_block = makeShared<RenderBlock>(m_renderer, m_root, m_camera);
    }

    // --- Drawing -------------------------------------------------------------------------------------------

    /// The objects that a solid must be drawn with. @return false if it is not drawn.
    bool findDraw(const ModelNode& node, glmodel::Draw& draw) const
    {
        if (!node.isSolid || node.mesh == NO_NODE || node.appearance == NO_NODE)
            return false;
        const ModelMesh& mesh = m_meshes[size_t(node.mesh)];
        const ModelAppearance& appearance = m_appearances[size_t(node.appearance)];
        if (mesh.isLost || appearance.isLost)
            return false;
        draw.program = appearance.program;
        draw.indexBuffer = mesh.real->getIndexBuffer()->getId();
        draw.positionBuffer = mesh.real->getVertexBuffer()->getId();
        draw.count = GLsizei(mesh.real->getIndexBuffer()->getCount());
        draw.value = appearance.value;
        draw.texture = appearance.isTextureLost ? 0 : appearance.texture;
        return true;
    }

    void addDraws(int id, std::vector<glmodel::Draw>& draws)
    {
        glmodel::Draw draw;
        if (findDraw(m_nodes[id], draw))
            draws.push_back(draw);
        for (const int child : m_nodes[id].children)
            addDraws(child, draws);
    }

    void draw()
    {
        std::vector<glmodel::Draw> wanted;
        addDraws(ROOT, wanted);
        glmodel::takeDraws();
        m_block->render();
        compare("a frame", wanted);
    }

    /// One solid, without a block.
    void drawOne()
    {
        const int id = chooseSlot();
        Solid* solid = findSolid(id);
        if (!solid || !solid->getAppearance())
            return;
        std::vector<glmodel::Draw> wanted(1);
        if (!findDraw(m_nodes[id], wanted[0]))
            return; // a lost program does not change the current one
        glmodel::takeDraws();
        solid->draw(*m_context);
        compare("a solid", wanted);
    }

    static std::string describe(const std::vector<glmodel::Draw>& draws)
    {
        std::string text;
        for (const glmodel::Draw& draw : draws)
        {
            text += " program " + std::to_string(draw.program) + " indices " + std::to_string(draw.count) +
                    " of " + std::to_string(draw.indexBuffer) + " vertices " +
                    std::to_string(draw.positionBuffer) + " value " + std::to_string(int(draw.value)) +
                    " texture " + std::to_string(draw.texture) + ";";
        }
        return text;
    }

    void compare(const std::string& what, std::vector<glmodel::Draw> wanted)
    {
        std::vector<glmodel::Draw> drawn = glmodel::takeDraws();
        std::sort(wanted.begin(), wanted.end());
        std::sort(drawn.begin(), drawn.end());
        if (wanted != drawn)
            fail(what + " is drawn as" + describe(drawn) + " and not as" + describe(wanted));
    }

    // --- Comparing -----------------------------------------------------------------------------------------

    bool isAbove(int node, int below) const
    {
        while (below != NO_NODE && below != node)
            below = m_nodes.at(below).parent;
        return below == node;
    }

    float findWorld(int id) const
    {
        float world = 0;
        for (; id != NO_NODE; id = m_nodes.at(id).parent)
            world += m_nodes.at(id).local;
        return world;
    }

    /// The same, or the engine's value where the model cannot know: below nodes that a joint may keep.
    float findWorldNow(int id)
    {
        const bool isCertain = findReached(false).count(findTop(id)) != 0;
        return isCertain ? findWorld(id) : m_held[id]->getWorldTransform().columns[3].x;
    }

    void reach(int id, bool byJoints, std::set<int>& reached) const
    {
        const auto found = m_nodes.find(id);
        if (found == m_nodes.end() || !reached.insert(id).second)
            return;
        for (const int child : found->second.children)
            reach(child, byJoints, reached);
        for (const int joint : found->second.joints)
        {
            if (byJoints)
                reach(joint, byJoints, reached);
        }
    }

    /// The nodes that the application holds, everything below them, and joints that their solids may keep alive.
    std::set<int> findReached(bool byJoints) const
    {
        std::set<int> reached;
        for (const auto& [id, node] : m_held)
            reach(id, byJoints, reached);
        return reached;
    }

    void forgetUnreachable()
    {
        const std::set<int> reached = findReached(true);
        for (auto entry = m_nodes.begin(); entry != m_nodes.end();)
        {
            if (reached.count(entry->first))
            {
                ++entry;
                continue;
            }
            for (const int child : entry->second.children)
            {
                if (const auto left = m_nodes.find(child); left != m_nodes.end())
                    left->second.parent = NO_NODE;
            }
            entry = m_nodes.erase(entry);
        }
    }

    void look()
    {
        if (const std::string fault = glmodel::takeFault(); !fault.empty())
            fail(fault);
        const std::set<int> certain = findReached(false);
        const std::set<int> possible = findReached(true);
        for (const int id : certain)
        {
            if (id != ROOT && !g_aliveNodes.count(id))
                fail("a node is gone that is held");
        }
        for (const int id : g_aliveNodes)
        {
            if (!possible.count(id))
                fail("a node lives that nobody holds");
        }
        for (const auto& [id, node] : m_held)
            lookAt(id, *node, certain, possible);
    }

    /// Its place, and those of its joints.
    void lookAt(int id, const SceneNode& node, const std::set<int>& certain, const std::set<int>& possible)
    {
        int top = id;
        while (m_nodes[top].parent != NO_NODE)
            top = m_nodes[top].parent;
        if (!certain.count(top))
            return; // below what only a joint may keep
        if (node.getWorldTransform().columns[3].x != findWorld(id))
            return fail("a node is at " + std::to_string(int(node.getWorldTransform().columns[3].x)) +
                        " and not at " + std::to_string(int(findWorld(id))));
        if ((node.getParent() == nullptr) != (m_nodes[id].parent == NO_NODE))
            return fail("a node has another parent");
        const Solid* solid = findSolid(id);
        const std::vector<int>& joints = m_nodes[id].joints;
        for (size_t i = 0; solid && i < joints.size(); ++i)
        {
            const float at = solid->getJointTransform(int(i)).columns[3].x;
            if (m_held.count(joints[i]) && certain.count(findTop(joints[i])) && at != findWorld(joints[i]))
                return fail("a joint that lives is not followed");
            if (!possible.count(joints[i]) && at != findWorld(id))
                return fail("a joint that is gone is followed");
        }
    }

    int findTop(int id)
    {
        while (m_nodes[id].parent != NO_NODE)
            id = m_nodes[id].parent;
        return id;
    }

    void end()
    {
        for (int& slot : m_slots)
            dropNode(slot);
        m_block = nullptr;
        m_renderer = nullptr;
        m_held.clear();
        m_root = nullptr;
        m_meshes.clear();
        m_appearances.clear();
        m_context = nullptr;
        if (!g_aliveNodes.empty())
            fail("nodes live when all is dropped");
        m_pool->flush();
        m_pool->flush(); // what the assets of the first round held
        if (glmodel::countLiveNames() != 0)
            fail("GL names are left: " + std::to_string(glmodel::countLiveNames()));
        if (const std::string fault = glmodel::takeFault(); !fault.empty())
            fail(fault);
    }

    const std::vector<uint8_t>& m_bytes;
    size_t m_at = 0;
    std::string m_fault;

    SharedPtr<AssetCachePool> m_pool = makeShared<AssetCachePool>();
    SharedPtr<Camera> m_camera = makeShared<Camera>();
    SharedPtr<SceneNode> m_root = makeShared<SceneNode>();
    SharedPtr<RenderContext> m_context;
    SharedPtr<SimpleRenderer> m_renderer;
    SharedPtr<RenderBlock> m_block;

    std::array<int, SLOTS> m_slots = {NO_NODE, NO_NODE, NO_NODE, NO_NODE, NO_NODE, NO_NODE};
    std::map<int, SharedPtr<SceneNode>> m_held; ///< by the application
    std::map<int, ModelNode> m_nodes;           ///< that may be alive
    std::vector<ModelMesh> m_meshes;
    std::vector<ModelAppearance> m_appearances;
    int m_lastNode = ROOT;
};

} // namespace

std::string play(const std::vector<uint8_t>& bytes)
{
    std::string fault = Player(bytes).play();
    glcalls::reset();
    return fault;
}

} // namespace sequence
