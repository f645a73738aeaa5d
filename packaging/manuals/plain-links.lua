-- Replaces links by their text.
function Link(link) return link.content end
