(function () { "use strict"; })
