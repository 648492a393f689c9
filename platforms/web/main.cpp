// The functions for the page's script. A returned string is valid until the next call that returns one.

#include "webviewer.h"

#include "orv/version.h"

#include <algorithm>
#include <string>

#include <emscripten.h>

namespace
{

web::WebViewer& getViewer()
{
    static web::WebViewer viewer;
    return viewer;
}

std::string& getAnswer()
{
    static std::string answer;
    return answer;
}

/// Adds a JSON string. The script replaces invalid UTF-8.
void addText(std::string& json, const std::string& text)
{
    static const char HEX[] = "0123456789abcdef";
    json += '"';
    for (const char c : text)
    {
        if (c == '"' || c == '\\')
            json += '\\';
        if (static_cast<unsigned char>(c) >= 0x20)
            json += c;
        else
            json += std::string("\\u00") + HEX[c >> 4] + HEX[c & 15];
    }
    json += '"';
}

/// Adds an array of count elements, each written by write(i).
template <class Write>
void addArray(std::string& json, int count, const Write& write)
{
    json += '[';
    for (int i = 0; i < count; ++i)
    {
        if (i > 0)
            json += ',';
        write(i);
    }
    json += ']';
}

void addRemarks(std::string& json)
{
    const auto& remarks = getViewer().getRemarks();
    addArray(json, int(remarks.size()),
             [&](int i)
             {
                 json +=
                     remarks[size_t(i)].isError ? R"({"error":true,"text":)" : R"({"error":false,"text":)";
                 addText(json, remarks[size_t(i)].text);
                 json += '}';
             });
}

void addScene(std::string& json)
{
    web::WebViewer& viewer = getViewer();
    json += R"(,"parts":)" + std::to_string(viewer.getPartCount());
    json += R"(,"triangles":)" + std::to_string(viewer.getTriangleCount());
    json += R"(,"clips":)";
    const auto& clips = viewer.getPlayer().getClips();
    addArray(json, int(clips.size()),
             [&](int i)
             {
                 json += R"({"name":)";
                 addText(json, clips[size_t(i)].name);
                 json += R"(,"start":)" + std::to_string(clips[size_t(i)].start);
                 json += R"(,"end":)" + std::to_string(clips[size_t(i)].end) + '}';
             });
    json += R"(,"cameras":)";
    addArray(json, viewer.getStage().getCameraCount(),
             [&](int i) { addText(json, viewer.getStage().getCameraName(i)); });
}

/// Does nothing without an open scene, so that the script need not check.
template <class Operation>
void withScene(const Operation& operation)
{
    if (getViewer().isOpen())
        operation(getViewer());
}

} // namespace

extern "C"
{

    EMSCRIPTEN_KEEPALIVE int orvStart(const char* canvas)
    {
        return getViewer().start(canvas);
    }

    EMSCRIPTEN_KEEPALIVE const char* orvVersion()
    {
        const orv::Version& version = orv::getVersion();
        getAnswer() = std::to_string(version.getMajor()) + "." + std::to_string(version.getMinor()) + "." +
                      std::to_string(version.getPatch());
        return getAnswer().c_str();
    }

    EMSCRIPTEN_KEEPALIVE void orvLoseContext()
    {
        getViewer().dropContext();
    }

    EMSCRIPTEN_KEEPALIVE int orvRestoreContext()
    {
        return getViewer().restoreContext();
    }

    EMSCRIPTEN_KEEPALIVE int orvOpen(const char* path)
    {
        return getViewer().open({path, {}});
    }

    EMSCRIPTEN_KEEPALIVE void orvClose()
    {
        getViewer().close();
    }

    /// The result of the load as JSON: error, remarks and missing files; for a scene also parts, triangles, clips and
    /// cameras.
    EMSCRIPTEN_KEEPALIVE const char* orvDescribe()
    {
        std::string& json = getAnswer();
        json = R"({"error":)";
        addText(json, getViewer().getError());
        json += R"(,"remarks":)";
        addRemarks(json);
        json += R"(,"missing":)";
        const std::vector<std::string> missing = getViewer().listMissing();
        addArray(json, int(missing.size()), [&](int i) { addText(json, missing[size_t(i)]); });
        if (getViewer().isOpen())
            addScene(json);
        json += '}';
        return json.c_str();
    }

    EMSCRIPTEN_KEEPALIVE void orvSetSize(int width, int height)
    {
        getViewer().setCanvasSize(width, height);
    }

    EMSCRIPTEN_KEEPALIVE int orvDraw(float seconds)
    {
        return getViewer().draw(seconds);
    }

    /// @param what  0 draws, 1 triangles, 2 calls of GL, 3 uploads of the last frame.
    EMSCRIPTEN_KEEPALIVE int orvCount(int what)
    {
        const orv::FrameCounters& counters = getViewer().getCounters();
        const uint32_t counts[] = {counters.draws, counters.triangles, counters.getCalls(), counters.uploads};
        return int(counts[std::clamp(what, 0, 3)]);
    }

    EMSCRIPTEN_KEEPALIVE void orvFrameAll()
    {
        withScene([](web::WebViewer& viewer) { viewer.frameAll(); });
    }

    EMSCRIPTEN_KEEPALIVE void orvTurn(float right, float down)
    {
        withScene([=](web::WebViewer& viewer) { viewer.turn(right, down); });
    }

    EMSCRIPTEN_KEEPALIVE void orvPan(float right, float down)
    {
        withScene([=](web::WebViewer& viewer) { viewer.pan(right, down); });
    }

    EMSCRIPTEN_KEEPALIVE void orvZoom(float steps)
    {
        withScene([=](web::WebViewer& viewer) { viewer.zoom(steps); });
    }

    EMSCRIPTEN_KEEPALIVE void orvLookCloser(float x, float y)
    {
        withScene([=](web::WebViewer& viewer) { viewer.lookCloser(x, y); });
    }

    EMSCRIPTEN_KEEPALIVE void orvSetBackground(float r, float g, float b)
    {
        getViewer().setBackground(orv::Colour4f(r, g, b, 1.0f));
    }

    /// @param index  of the file's cameras; any other number selects the free one.
    EMSCRIPTEN_KEEPALIVE void orvUseCamera(int index)
    {
        withScene(
            [=](web::WebViewer& viewer)
            { viewer.useCamera(index >= 0 && index < viewer.getStage().getCameraCount() ? index : -1); });
    }

    EMSCRIPTEN_KEEPALIVE int orvGetCamera()
    {
        return getViewer().isOpen() ? getViewer().getCamera() : -1;
    }

    /// Goes forward by a number of clips, cyclically.
    EMSCRIPTEN_KEEPALIVE void orvStepClip(int count)
    {
        withScene([=](web::WebViewer& viewer) { viewer.getPlayer().stepClip(count); });
    }

    EMSCRIPTEN_KEEPALIVE void orvTogglePaused()
    {
        withScene([](web::WebViewer& viewer) { viewer.getPlayer().togglePaused(); });
    }

    EMSCRIPTEN_KEEPALIVE int orvIsPaused()
    {
        return !getViewer().isOpen() || getViewer().getPlayer().isPaused() ||
               !getViewer().getPlayer().isMoving();
    }

    EMSCRIPTEN_KEEPALIVE void orvSetLooping(int looping)
    {
        withScene([=](web::WebViewer& viewer) { viewer.getPlayer().setLooping(looping != 0); });
    }

    EMSCRIPTEN_KEEPALIVE void orvScaleSpeed(float factor)
    {
        withScene([=](web::WebViewer& viewer) { viewer.getPlayer().scaleSpeed(factor); });
    }

    EMSCRIPTEN_KEEPALIVE float orvGetSpeed()
    {
        return getViewer().isOpen() ? getViewer().getPlayer().getSpeed() : 1.0f;
    }

    EMSCRIPTEN_KEEPALIVE void orvStep(int frames)
    {
        withScene([=](web::WebViewer& viewer) { viewer.getPlayer().step(frames); });
    }

    EMSCRIPTEN_KEEPALIVE void orvSeekShare(float share)
    {
        withScene([=](web::WebViewer& viewer) { viewer.getPlayer().seekShare(share); });
    }

    EMSCRIPTEN_KEEPALIVE float orvGetShare()
    {
        return getViewer().isOpen() ? getViewer().getPlayer().getShare() : 0.0f;
    }

} // extern "C"
