// Special members of the host's server records, compiled here so that copies made
// by the host and by the library run the same code on the same side of the boundary.
#include "vexil/host/records.h"

xServerStart::xServerStart() = default;
xServerStart::~xServerStart() = default;
xServerStart::xServerStart(const xServerStart& other) = default;
xServerStart::xServerStart(xServerStart&& other) noexcept = default;
xServerStart& xServerStart::operator=(const xServerStart& other) = default;
xServerStart& xServerStart::operator=(xServerStart&& other) noexcept = default;

xServerInitialise::xServerInitialise() = default;
xServerInitialise::~xServerInitialise() = default;
xServerInitialise::xServerInitialise(const xServerInitialise& other) = default;
xServerInitialise::xServerInitialise(xServerInitialise&& other) noexcept = default;
xServerInitialise& xServerInitialise::operator=(const xServerInitialise& other) = default;
xServerInitialise& xServerInitialise::operator=(xServerInitialise&& other) noexcept = default;
