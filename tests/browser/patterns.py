"""Recognises the test patterns of the generated services in a full-screen image."""


def columns(picture):
    """The median colours of some columns of pixels, where no overlay covers them."""
    def middle(values):
        return sorted(values)[len(values) // 2]
    return [tuple(middle([picture.colour(x, y)[part] for y in range(130, 440)]) for part in range(3))
            for x in (30, 680, 950, 1250)]


def is_striped(picture):
    """The pattern of the first channel and of the first clip: fixed stripes of fully saturated colours."""
    stripes = ((255, 0, 0), (0, 0, 255), (255, 0, 255), (0, 255, 255))
    return all(abs(component - expected) < 60 for colour, stripe in zip(columns(picture), stripes)
               for component, expected in zip(colour, stripe))


def has_bars(picture):
    """The moving bars of the second channel, of 75 % saturated colours or grey, and not black alone."""
    colours = columns(picture)
    are_bars = all(all(component < 30 or 160 < component < 230 for component in colour) or
                   all(90 < component < 112 for component in colour) for colour in colours)
    return are_bars and max(map(max, colours)) > 90


def is_dark(picture):
    """The dark clouds of the third channel."""
    return all(20 < max(colour) < 150 for colour in columns(picture))
